// What an account is told of itself.
#include "socket_client.h"
#include "store/accounts.h"
#include "store/profiles.h"
#include "tree_fixture.h"

using namespace emulator;

namespace {

class Account : public Tree {
protected:
    std::string info() { return element(ask("user/get_info").body, "user_info"); }

    void set(const std::string &name, const std::string &value)
    {
        put_profile_field(store, *find_account(store, ann), name, value);
    }
};

} // namespace

TEST_F(Account, InfoHasEveryElementOnce)
{
    const std::string body = info();

    EXPECT_EQ(element(body, "email"), "ann@example.org");
    EXPECT_EQ(element(body, "display_name"), "ann");
    EXPECT_EQ(element(body, "created"), "2023-11-14");
    EXPECT_EQ(element(body, "premium"), "no");
    EXPECT_EQ(element(body, "storage_limit_exceeded"), "no");
    for (const char *name : {"email",
                             "first_name",
                             "last_name",
                             "display_name",
                             "gender",
                             "birth_date",
                             "location",
                             "website",
                             "premium",
                             "bandwidth",
                             "created",
                             "max_upload_size",
                             "max_instant_upload_size",
                             "validated",
                             "tos_accepted",
                             "used_storage_size",
                             "base_storage",
                             "bonus_storage",
                             "storage_limit",
                             "storage_limit_exceeded",
                             "options"})
        EXPECT_EQ(elements(body, name).size(), 1u) << name;
}

TEST_F(Account, UnlinkedSocialAccountsSayNoMore)
{
    const std::string body = info();

    EXPECT_EQ(element(body, "facebook"), "<linked>no</linked>");
    EXPECT_EQ(element(body, "twitter"), "<linked>no</linked>");
}

TEST_F(Account, LinkedSocialAccountsAreDescribed)
{
    set("facebook/hometown", "Oslo");
    set("twitter/screen_name", "ann_x");

    const std::string facebook = element(info(), "facebook");
    const std::string twitter = element(info(), "twitter");

    EXPECT_EQ(element(facebook, "linked"), "yes");
    EXPECT_EQ(element(facebook, "hometown"), "Oslo");
    for (const char *name : {"facebook_id", "date_created", "email", "facebook_url", "name",
                             "firstname", "lastname", "location", "i18n", "timezone"})
        EXPECT_EQ(elements(facebook, name).size(), 1u) << name;
    EXPECT_EQ(element(twitter, "linked"), "yes");
    EXPECT_EQ(element(twitter, "screen_name"), "ann_x");
    for (const char *name : {"twitter_id", "date_created", "name", "i18n"})
        EXPECT_EQ(elements(twitter, name).size(), 1u) << name;
}

TEST_F(Account, ATokenThatSignsInLinksFacebook)
{
    store.execute("INSERT INTO facebook_links (account, token_digest) VALUES (1, x'00')");

    EXPECT_EQ(element(element(info(), "facebook"), "linked"), "yes");
}

TEST_F(Account, ProfileReplacesWhatIsUnset)
{
    set("display_name", "Ann & Co");
    set("premium", "yes");
    set("premium", "maybe");

    EXPECT_EQ(element(info(), "display_name"), "Ann &amp; Co");
    EXPECT_EQ(element(info(), "premium"), "maybe");
    EXPECT_EQ(folder_says("", "owner_name"), "Ann &amp; Co");
    EXPECT_TRUE(is_profile_field("twitter/i18n"));
    for (const char *name : {"", "email", "twitter/", "twitter/hometown", "facebook", "created"})
        EXPECT_FALSE(is_profile_field(name)) << name;
}

TEST_F(Account, LimitsFollowItsUse)
{
    put_account_limits(store, *find_account(store, ann), {100, 20, 7});
    fill(make_file("a"), std::string(120, 'x'));
    put_account_limits(store, *find_account(store, ann), {{}, 10, {}});

    const std::string body = ask("user/get_limits").body;

    const std::map<std::string, std::string> expected = {
        {"storage_base", "100"},
        {"storage_bonus", "10"},
        {"storage_limit", "110"},
        {"storage_used", "120"},
        {"bandwidth_limit", "7"},
        {"bandwidth_used", "0"},
        {"collaboration_limit", "100"},
        {"collaboration_today", "0"},
        {"one_time_downloads_today", "0"},
        {"one_time_downloads_limit", "50"},
        {"streaming_bandwidth_today", "0"},
        {"streaming_bandwidth_limit", "1073741824"},
        {"upload_size_limit", "4294967296"}};
    for (const auto &[name, value] : expected)
        EXPECT_EQ(elements(body, name), std::vector<std::string>{value}) << name;
    EXPECT_EQ(element(info(), "storage_limit_exceeded"), "yes");
}

TEST_F(Account, NeedsASession)
{
    for (const char *action : {"user/get_info", "user/get_limits", "user/myfiles_revision"})
        EXPECT_EQ(error_of(nobody, action, {}), "105");
}

TEST_F(Account, RevisionAndEpochBeginWithOne)
{
    EXPECT_EQ(done(ann, "user/myfiles_revision", {}, "revision"), "1");
    EXPECT_EQ(done(ann, "user/myfiles_revision", {}, "epoch"), "1");
}
