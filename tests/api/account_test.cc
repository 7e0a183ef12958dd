// What the account's queries read from their replies.
#include <string>

#include "api/account_call_test.h"

namespace quillmere_test {
namespace {

class AccountRequest : public account_call_test,
                       public testing::WithParamInterface<request_case> {};

TEST_P(AccountRequest, IsComposedInOrder)
{
    EXPECT_EQ(target_of(GetParam().call), GetParam().target);
}

const request_case account_requests[] = {
    {"info", [] { return user_info_call(special); },
     "/api/user/get_info.php?session_token=" + std::string(special) + "&version=2"},
    {"info_empty", [] { return user_info_call(""); },
     "/api/user/get_info.php?session_token=&version=2"},
    {"info_none", [] { return user_info_call(nullptr); },
     "/api/user/get_info.php?session_token=&version=2"},
    {"limits", [] { return user_limits_call(special); },
     "/api/user/get_limits.php?session_token=" + std::string(special) + "&version=2"},
    {"limits_empty", [] { return user_limits_call(""); },
     "/api/user/get_limits.php?session_token=&version=2"},
    {"limits_none", [] { return user_limits_call(nullptr); },
     "/api/user/get_limits.php?session_token=&version=2"},
    {"revision", [] { return myfiles_revision_call(special); },
     "/api/user/myfiles_revision.php?session_token=" + std::string(special) + "&version=2"},
    {"revision_empty", [] { return myfiles_revision_call(""); },
     "/api/user/myfiles_revision.php?session_token=&version=2"},
    {"revision_none", [] { return myfiles_revision_call(nullptr); },
     "/api/user/myfiles_revision.php?session_token=&version=2"},
};

INSTANTIATE_TEST_SUITE_P(Api, AccountRequest, testing::ValuesIn(account_requests), name_of_case);

constexpr const char *profile_elements =
    "<email>01</email><first_name>02</first_name><last_name>03</last_name>"
    "<display_name>04</display_name><gender>05</gender><birth_date>06</birth_date>"
    "<location>07</location><website>08</website><premium>09</premium><bandwidth>10</bandwidth>"
    "<created>11</created><max_upload_size>12</max_upload_size>"
    "<max_instant_upload_size>13</max_instant_upload_size><validated>14</validated>"
    "<tos_accepted>15</tos_accepted><used_storage_size>16</used_storage_size>"
    "<base_storage>17</base_storage><bonus_storage>18</bonus_storage>"
    "<storage_limit>19</storage_limit><storage_limit_exceeded>20</storage_limit_exceeded>"
    "<options>21</options>";

constexpr const char *profile_texts =
    "email=01 first_name=02 last_name=03 display_name=04 gender=05 birthdate=06 location=07 "
    "website=08 premium=09 bandwidth=10 created=11 max_upload=12 max_instant_upload=13 "
    "validated=14 tos_accepted=15 used_storage=16 base_storage=17 bonus_storage=18 "
    "storage_limit=19 storage_limit_exceeded=20 options=21";

std::string facebook(const std::string &linked)
{
    return "<facebook>" + linked +
           "<facebook_id>22</facebook_id><date_created>23</date_created><email>24</email>"
           "<facebook_url>25</facebook_url><name>26</name><firstname>27</firstname>"
           "<lastname>28</lastname><hometown>29</hometown><location>30</location>"
           "<i18n>31</i18n><timezone>32</timezone></facebook>";
}

constexpr const char *facebook_texts =
    "fb_facebook_id=22 fb_date_created=23 fb_email=24 fb_facebook_url=25 fb_name=26 "
    "fb_firstname=27 fb_lastname=28 fb_hometown=29 fb_location=30 fb_i18n=31 fb_timezone=32";

std::string twitter(const std::string &linked)
{
    return "<twitter>" + linked +
           "<twitter_id>33</twitter_id><date_created>34</date_created>"
           "<screen_name>35</screen_name><name>36</name><i18n>37</i18n></twitter>";
}

constexpr const char *twitter_texts =
    "tw_twitter_id=33 tw_date_created=34 tw_screen_name=35 tw_name=36 tw_i18n=37";

std::string linked(const std::string &text) { return "<linked>" + text + "</linked>"; }

class GetUserInfo : public account_call_test {
protected:
    std::string info_of(const std::string &elements)
    {
        call_outcome outcome = with_elements("<user_info>" + elements + "</user_info>",
                                             [] { return user_info_call("token"); });
        EXPECT_EQ(outcome.status, QM_OK);
        return outcome.results;
    }
};

TEST_F(GetUserInfo, ReadsThirtyNineElements)
{
    EXPECT_EQ(info_of(profile_elements + facebook(linked("yes")) + twitter(linked("yes"))),
              std::string("record{") + profile_texts + " " + facebook_texts + " fb_linked=yes " +
                  twitter_texts + " tw_linked=yes}");
}

TEST_F(GetUserInfo, HasNoDetailsOfAccountsThatAreNotLinked)
{
    for (const char *text : {"no", "Yes", "YES", "yes ", "1", "true"})
        EXPECT_EQ(info_of(facebook(linked(text)) + twitter(linked(text))),
                  "record{fb_linked=" + std::string(text) + " tw_linked=" + text + "}");
}

TEST_F(GetUserInfo, HasNoDetailsWithoutAWordAboutLinks)
{
    EXPECT_EQ(info_of(facebook("") + twitter("")), "record{}");
}

TEST_F(GetUserInfo, LooksAtEachAccountByItself)
{
    EXPECT_EQ(info_of(facebook(linked("yes")) + twitter(linked("no"))),
              std::string("record{") + facebook_texts + " fb_linked=yes tw_linked=no}");
    EXPECT_EQ(info_of(facebook(linked("no")) + twitter(linked("yes"))),
              std::string("record{fb_linked=no ") + twitter_texts + " tw_linked=yes}");
}

TEST_F(GetUserInfo, HasARecordOfNothingForAnEmptyReply)
{
    EXPECT_EQ(with_elements("", [] { return user_info_call("token"); }), accepted("record{}"));
}

TEST_F(GetUserInfo, FindsElementsInTheirPlaceAlone)
{
    EXPECT_EQ(with_elements(std::string(profile_elements) + "<other>" + profile_elements +
                                "</other>" + facebook(linked("yes")),
                            [] { return user_info_call("token"); }),
              accepted("record{}"));
}

class GetUserLimits : public account_call_test {};

TEST_F(GetUserLimits, ReadsThirteenElements)
{
    EXPECT_EQ(
        with_elements("<storage_base>01</storage_base><storage_bonus>02</storage_bonus>"
                      "<storage_limit>03</storage_limit><storage_used>04</storage_used>"
                      "<bandwidth_limit>05</bandwidth_limit><bandwidth_used>06</bandwidth_used>"
                      "<collaboration_limit>07</collaboration_limit>"
                      "<collaboration_today>08</collaboration_today>"
                      "<one_time_downloads_limit>09</one_time_downloads_limit>"
                      "<one_time_downloads_today>10</one_time_downloads_today>"
                      "<streaming_bandwidth_limit>11</streaming_bandwidth_limit>"
                      "<streaming_bandwidth_today>12</streaming_bandwidth_today>"
                      "<upload_size_limit>13</upload_size_limit>",
                      [] { return user_limits_call("token"); }),
        accepted("record{storage_base=01 storage_bonus=02 storage_limit=03 storage_used=04 "
                 "bandwidth_limit=05 bandwidth_used=06 collaboration_limit=07 "
                 "collaboration_today=08 one_time_downloads_limit=09 one_time_downloads_today=10 "
                 "streaming_bandwidth_limit=11 streaming_bandwidth_today=12 "
                 "upload_size_limit=13}"));
}

TEST_F(GetUserLimits, FindsElementsAtAnyDepth)
{
    EXPECT_EQ(with_elements("<limits><storage_base>1</storage_base></limits>",
                            [] { return user_limits_call("token"); }),
              accepted("record{storage_base=1}"));
}

TEST_F(GetUserLimits, HasARecordOfNothingForAnEmptyReply)
{
    EXPECT_EQ(with_elements("", [] { return user_limits_call("token"); }), accepted("record{}"));
}

class GetMyfilesRevision : public account_call_test {
protected:
    call_outcome reading(const std::string &elements)
    {
        return with_elements(elements, [] { return myfiles_revision_call("token"); });
    }
};

TEST_F(GetMyfilesRevision, NeedsOnlyOneOfItsTwoTexts)
{
    EXPECT_EQ(reading("<revision>12</revision>"), accepted("revision=12 epoch=NULL"));
    EXPECT_EQ(reading("<epoch>34</epoch>"), accepted("revision=NULL epoch=34"));
}

TEST_F(GetMyfilesRevision, IsOfNoUseWithNeither)
{
    hook_recorder hook;

    EXPECT_EQ(reading(""),
              (call_outcome{QM_UNUSABLE_RESPONSE, std::nullopt, "revision=NULL epoch=NULL"}));
    EXPECT_EQ(reading("<revision/><epoch/>").status, QM_UNUSABLE_RESPONSE);
    EXPECT_TRUE(hook.calls().empty());
}

TEST_F(GetMyfilesRevision, HandsTextsOutAsTheyAre)
{
    EXPECT_EQ(reading("<revision> 0x1 </revision><in><epoch>e&amp;f</epoch></in>"),
              accepted("revision= 0x1  epoch=e&f"));
}

TEST_F(GetMyfilesRevision, LogsNothingButUnreadableReplies)
{
    std::string reply = accepted_reply("<revision>12</revision>");
    reply.pop_back();
    server.answer(xml_reply(reply));

    EXPECT_EQ(myfiles_revision_call("token").status, QM_MALFORMED_REPLY);

    auto lookup = [&](const std::string &sought) {
        return "Expat failed parsing a node with error 0\nName of node whose value is sought: " +
               sought + "\nXML we are searching for this node:\n" + reply + "\n";
    };
    EXPECT_EQ(log.text(), lookup("result") + lookup("revision") + lookup("epoch"));
}

} // namespace
} // namespace quillmere_test
