// What the operations on a file's links send, and what they read from their replies.
#include <string>

#include "api/account_call_test.h"

namespace quillmere_test {
namespace {

class LinksRequest : public account_call_test, public testing::WithParamInterface<request_case> {};

TEST_P(LinksRequest, IsComposedInOrder)
{
    EXPECT_EQ(target_of(GetParam().call), GetParam().target);
}

const std::string links_path = "/api/file/get_links.php";

const request_case links_requests[] = {
    {"special", [] { return links_call(every_byte(), special, special); },
     links_path + "?quick_key=" + encoded + "&link_type=" + plain + "&session_token=" + plain +
         "&version=2"},
    {"several_files", [] { return links_call("a,b", nullptr, nullptr); },
     links_path + "?quick_key=a%2cb&version=2"},
    {"type", [] { return links_call("q", "view", nullptr); },
     links_path + "?quick_key=q&link_type=view&version=2"},
    {"token", [] { return links_call("q", nullptr, "t"); },
     links_path + "?quick_key=q&session_token=t&version=2"},
    {"empty", [] { return links_call("", "", ""); }, links_path + "?quick_key=&version=2"},
    {"nothing", [] { return links_call(nullptr, nullptr, nullptr); },
     links_path + "?quick_key=&version=2"},

    {"download_special", [] { return download_link_call(special, special); },
     links_path + "?session_token=" + plain + "&quick_key=" + plain +
         "&link_type=direct_download&version=2"},
    {"download_empty", [] { return download_link_call("", ""); },
     links_path + "?session_token=&quick_key=&link_type=direct_download&version=2"},
    {"download_nothing", [] { return download_link_call(nullptr, nullptr); },
     links_path + "?session_token=&quick_key=&link_type=direct_download&version=2"},
};
INSTANTIATE_TEST_SUITE_P(Api, LinksRequest, testing::ValuesIn(links_requests), name_of_case);

class GetLinks : public account_call_test {
protected:
    call_outcome reading(const std::string &elements)
    {
        return with_elements(elements, [] { return links_call("q", nullptr, "t"); });
    }
};

TEST_F(GetLinks, ListsThemInReverse)
{
    EXPECT_EQ(reading("<links><link><quickkey>a</quickkey><view>v</view></link>"
                      "<link><quickkey>b</quickkey><error>7</error></link></links>"),
              accepted("count=2 links{quickkey=b error=7}{quickkey=a view=v}"));
}

TEST_F(GetLinks, HasNoListWithoutLinks)
{
    EXPECT_EQ(reading("<links/>"), accepted("count=0 links=NULL"));

    std::string lines = log.text();
    std::string last = "xml extract: num_file_links 0\nget_links Success\n";
    ASSERT_GE(lines.size(), last.size());
    EXPECT_EQ(lines.substr(lines.size() - last.size()), last);
}

TEST_F(GetLinks, KeepsTheCountOfADamagedReply)
{
    server.answer(xml_reply("<response><result>Success</result><link><view>v</view></link><link>"));

    EXPECT_EQ(links_call("q", nullptr, "t"),
              (call_outcome{QM_MALFORMED_REPLY, std::nullopt, "count=1 links=NULL"}));
}

class GetDownloadLink : public account_call_test {
protected:
    call_outcome reading(const std::string &elements)
    {
        return with_elements(elements, [] { return download_link_call("t", "q"); });
    }
};

TEST_F(GetDownloadLink, GivesLinksASchemeWhereItIsMissing)
{
    auto link = [this](const std::string &text) {
        std::string results = reading("<direct_download>" + text + "</direct_download>").results;
        return results.substr(0, results.find(' '));
    };

    EXPECT_EQ(link("//host/file"), "url=http://host/file");
    EXPECT_EQ(link("https://host/file"), "url=https://host/file");
    EXPECT_EQ(link("http://host/?a=1&amp;b=2"), "url=http://host/?a=1&b=2");
    EXPECT_EQ(link("file"), "url=file");
    EXPECT_EQ(link("//"), "url=//");
}

TEST_F(GetDownloadLink, MayLackTheLink)
{
    EXPECT_EQ(reading(""), accepted("url=NULL bandwidth=0 error=0 text=NULL"));
}

TEST_F(GetDownloadLink, FindsTheLinkAtAnyDepth)
{
    EXPECT_EQ(reading("<links><link><direct_download>http://h/f</direct_download></link></links>"),
              accepted("url=http://h/f bandwidth=0 error=0 text=NULL"));
}

TEST_F(GetDownloadLink, ReadsTheFreeBandwidth)
{
    for (const auto &[text, number] : {std::pair("5", "5"), std::pair("-1", "-1"),
                                       std::pair("12 MB", "12"), std::pair("none", "0")})
        EXPECT_EQ(reading("<direct_download_free_bandwidth>" + std::string(text) +
                          "</direct_download_free_bandwidth>"),
                  accepted("url=NULL bandwidth=" + std::string(number) + " error=0 text=NULL"));
}

TEST_F(GetDownloadLink, ReportsARefusalOfTheDownload)
{
    EXPECT_EQ(
        reading("<direct_download_error>12</direct_download_error>"
                "<direct_download_error_message>No bandwidth</direct_download_error_message>"),
        accepted("url=NULL bandwidth=0 error=12 text=No bandwidth"));
}

TEST_F(GetDownloadLink, ReportsALinkAndARefusalTogether)
{
    EXPECT_EQ(reading("<direct_download>http://h/f</direct_download>"
                      "<direct_download_error>12</direct_download_error>"),
              accepted("url=http://h/f bandwidth=0 error=12 text=NULL"));
}

TEST_F(GetDownloadLink, HasNoMessageWithoutANumber)
{
    EXPECT_EQ(reading("<direct_download_error_message>alone</direct_download_error_message>"),
              accepted("url=NULL bandwidth=0 error=0 text=NULL"));
}

TEST_F(GetDownloadLink, HasAMessageToANumberThatIsNone)
{
    EXPECT_EQ(reading("<direct_download_error>x</direct_download_error>"
                      "<direct_download_error_message>m</direct_download_error_message>"),
              accepted("url=NULL bandwidth=0 error=0 text=m"));
}

} // namespace
} // namespace quillmere_test
