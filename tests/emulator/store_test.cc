#include <optional>
#include <string>

#include <gtest/gtest.h>

#include "digest.h"
#include "files.h"
#include "scratch_directory.h"
#include "store/accounts.h"
#include "store/applications.h"
#include "store/database.h"
#include "store/folders.h"
#include "store/sessions.h"

using namespace emulator;

namespace {

class Store : public testing::Test {
protected:
    std::int64_t account(std::string_view email = "ann@example.org")
    {
        return add_account(store, {email, "password", {}}, 1000).value();
    }

    std::int64_t count(const std::string &table)
    {
        statement query = store.prepare("SELECT count(*) FROM " + table);
        query.step();
        return query.number(0);
    }

    scratch_directory scratch;
    const std::filesystem::path file = scratch.path() / "store.sqlite";
    database store{file};
};

std::string pragma(database &store, const std::string &name)
{
    statement query = store.prepare("PRAGMA " + name);
    query.step();
    return query.text(0);
}

} // namespace

TEST_F(Store, WritesToALogAndWaitsForTheDisk)
{
    EXPECT_EQ(pragma(store, "journal_mode"), "wal");
    EXPECT_EQ(pragma(store, "synchronous"), "2");
    EXPECT_EQ(pragma(store, "foreign_keys"), "1");
}

TEST_F(Store, IsFoundAgainWithWhatItHeld)
{
    account();

    database again(file);

    EXPECT_TRUE(authenticate(again, "ann@example.org", "password"));
}

TEST_F(Store, OfALaterVersionIsLeftAlone)
{
    store.execute("PRAGMA user_version = 1000000");

    EXPECT_THROW(database{file}, store_error);
}

TEST_F(Store, OfTheFirstVersionIsBroughtUpToDate)
{
    account();
    for (const char *table :
         {"one_time_links", "feed", "attachments", "files", "folders", "profile_fields"})
        store.execute(std::string("DROP TABLE ") + table);
    for (const char *column : {"epoch", "base_storage", "bonus_storage", "bandwidth_limit",
                               "bandwidth_used", "use_day", "streamed_today", "one_time_today"})
        store.execute(std::string("ALTER TABLE accounts DROP COLUMN ") + column);
    store.execute("PRAGMA user_version = 1");

    database again(file);

    const auto ann = authenticate(again, "ann@example.org", "password");
    ASSERT_TRUE(ann);
    EXPECT_EQ(root_of(again, *ann).key.size(), 13u);
    EXPECT_EQ(account_epoch(again, *ann), 1u);
}

TEST_F(Store, RefusesAFileThatIsNoDatabase)
{
    write_file(scratch.path() / "other", std::string(8192, 'x'), 0600);

    EXPECT_THROW(database{scratch.path() / "other"}, store_error);
}

TEST_F(Store, UndoesATransactionThatWasNotCommitted)
{
    {
        transaction change(store);
        put_application(store, {"7", "key"});
    }

    EXPECT_FALSE(find_application_key(store, "7"));
}

TEST_F(Store, KnowsTheDevelopmentApplication)
{
    EXPECT_EQ(find_application_key(store, "42"), "quillmere-development-key");
}

TEST_F(Store, KeepsAChangedDevelopmentKey)
{
    put_application(store, {"42", "other"});

    database again(file);

    EXPECT_EQ(find_application_key(again, "42"), "other");
}

TEST_F(Store, KnowsAnAccountByAddressAndPassword)
{
    const std::int64_t ann = account();

    EXPECT_EQ(authenticate(store, "ann@example.org", "password"), ann);
    EXPECT_EQ(authenticate(store, "ANN@Example.org", "password"), ann);
    EXPECT_FALSE(authenticate(store, "ann@example.org", "Password"));
    EXPECT_FALSE(authenticate(store, "ann@example.org", ""));
    EXPECT_FALSE(authenticate(store, "bob@example.org", "password"));
}

TEST_F(Store, TakesAnAddressOnce)
{
    account();

    EXPECT_FALSE(add_account(store, {"Ann@Example.ORG", "other", {}}, 1000));
    EXPECT_TRUE(authenticate(store, "ann@example.org", "password"));
}

TEST_F(Store, KnowsALinkedAccountByItsFacebookToken)
{
    const auto ann = add_account(store, {"ann@example.org", "password", "token"}, 1000);

    EXPECT_EQ(authenticate_facebook(store, "token"), ann);
    EXPECT_FALSE(authenticate_facebook(store, "Token"));
}

TEST_F(Store, MakesNoAccountForAFacebookTokenThatIsTaken)
{
    add_account(store, {"ann@example.org", "password", "token"}, 1000);

    EXPECT_FALSE(add_account(store, {"bob@example.org", "password", "token"}, 1000));
    EXPECT_FALSE(authenticate(store, "bob@example.org", "password"));
}

TEST_F(Store, HoldsNoPasswordNorTokenInClear)
{
    const auto ann = add_account(store, {"ann@example.org", "a-password", "a-token"}, 1000);
    const std::string session = open_session(store, *ann, {1000, 600});
    store.execute("PRAGMA wal_checkpoint(TRUNCATE)");

    const std::string bytes = read_file(file, 1 << 24);
    EXPECT_NE(bytes.find("ann@example.org"), std::string::npos);
    for (const std::string &secret : {std::string("a-password"), std::string("a-token"), session})
        EXPECT_EQ(bytes.find(secret), std::string::npos) << secret;
}

TEST_F(Store, EqualPasswordsAreStoredDifferently)
{
    EXPECT_NE(stretch_password("same").digest, stretch_password("same").digest);
}

TEST_F(Store, GivesEachAccountAPkeyThatStays)
{
    const std::int64_t ann = account();
    const std::int64_t bob = account("bob@example.org");

    EXPECT_EQ(account_pkey(store, ann), account_pkey(store, ann));
    EXPECT_NE(account_pkey(store, ann), account_pkey(store, bob));
}

TEST_F(Store, SessionLivesUntilItsLifetimeIsOver)
{
    const std::int64_t ann = account();
    const std::string token = open_session(store, ann, {1000, 600});

    EXPECT_FALSE(use_session(store, token, {1600, 600}));
    EXPECT_EQ(use_session(store, token, {1599, 600}), ann);
}

TEST_F(Store, SessionInUseLivesOn)
{
    const std::int64_t ann = account();
    const std::string token = open_session(store, ann, {1000, 600});

    for (std::int64_t now = 1500; now < 10000; now += 500)
        EXPECT_EQ(use_session(store, token, {now, 600}), ann) << now;
}

TEST_F(Store, SessionUseIsRecordedOnlyAfterATenthOfTheLifetime)
{
    const std::string token = open_session(store, account(), {1000, 600});
    const auto recorded_expiry = [this] {
        statement query = store.prepare("SELECT expires FROM sessions");
        query.step();
        return query.number(0);
    };

    use_session(store, token, {1059, 600});
    EXPECT_EQ(recorded_expiry(), 1600);
    use_session(store, token, {1060, 600});
    EXPECT_EQ(recorded_expiry(), 1660);
}

TEST_F(Store, SessionTokensAreDistinctAndUnknownOnesAreWorthNothing)
{
    const std::int64_t ann = account();
    const std::string one = open_session(store, ann, {1000, 600});
    const std::string other = open_session(store, ann, {1000, 600});

    EXPECT_NE(one, other);
    EXPECT_TRUE(use_session(store, one, {1000, 600}));
    EXPECT_TRUE(use_session(store, other, {1000, 600}));
    EXPECT_FALSE(use_session(store, "", {1000, 600}));
    EXPECT_FALSE(use_session(store, one + "0", {1000, 600}));
}

TEST_F(Store, RenewedSessionReplacesTheOldOne)
{
    const std::int64_t ann = account();
    const std::string old = open_session(store, ann, {1000, 600});

    const std::optional<std::string> renewed = renew_session(store, old, {1500, 600});

    ASSERT_TRUE(renewed);
    EXPECT_FALSE(use_session(store, old, {1500, 600}));
    EXPECT_EQ(use_session(store, *renewed, {2099, 600}), ann);
    EXPECT_FALSE(renew_session(store, old, {1500, 600}));
}

TEST_F(Store, ExpiredSessionCannotBeRenewed)
{
    const std::string token = open_session(store, account(), {1000, 600});

    EXPECT_FALSE(renew_session(store, token, {1600, 600}));
}

TEST_F(Store, ForgetsExpiredSessionsAndLoginTokens)
{
    const std::int64_t ann = account();
    open_session(store, ann, {1000, 600});
    make_login_token(store, ann, {1000, 600});

    open_session(store, ann, {1600, 600});
    make_login_token(store, ann, {1600, 600});

    EXPECT_EQ(count("sessions"), 1);
    EXPECT_EQ(count("login_tokens"), 1);
}

TEST_F(Store, SessionsGoWithTheirAccount)
{
    const std::string token = open_session(store, account(), {1000, 600});

    store.execute("DELETE FROM accounts");

    EXPECT_FALSE(use_session(store, token, {1000, 600}));
}
