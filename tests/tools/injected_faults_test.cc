// What the command line and the library make of a service that fails, where the service itself
// tells how often it did.
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "emulator_account.h"
#include "emulator_admin.h"

namespace quillmere_test {

namespace {

using testing::HasSubstr;
using testing::StartsWith;

class InjectedFaults : public emulator_account {
protected:
    InjectedFaults() { sign_in(); }

    outcome read_device(const std::string &retries) const
    {
        return home.run({"--retries", retries, "device-status"});
    }

    static nlohmann::json on_device(nlohmann::json fault, int count)
    {
        fault["path"] = "/api/device/get_status.php";
        fault["count"] = count;
        return fault;
    }

    nlohmann::json root_folders() const { return dump_of(account_email).at("root").at("folders"); }

    const emulator_admin service{admin_url};
};

} // namespace

TEST_F(InjectedFaults, AReadIsRepeatedUntilTheServiceIsAvailableAgain)
{
    const int busy = service.place(on_device({{"kind", "status"}, {"status", 503}}, 2));

    const outcome ended = read_device("2");

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_THAT(ended.out, StartsWith("Device            0\n"));
    EXPECT_EQ(service.counts_of(busy), "3 seen, 2 fired");
}

TEST_F(InjectedFaults, AReadIsRepeatedNoMoreThanIsAllowed)
{
    const int busy = service.place(on_device({{"kind", "status"}, {"status", 503}}, 9));

    const outcome ended = read_device("1");

    EXPECT_EQ(ended.exit_status, 7);
    EXPECT_THAT(ended.err, HasSubstr("503"));
    EXPECT_EQ(service.counts_of(busy), "2 seen, 2 fired");
}

TEST_F(InjectedFaults, AReadIsRepeatedAfterALostOrBrokenAnswer)
{
    for (const char *kind : {"lost-reply", "reset"}) {
        const int lost = service.place(on_device({{"kind", kind}}, 1));

        const outcome ended = read_device("1");

        EXPECT_EQ(ended.exit_status, 0) << kind << ended.err;
        EXPECT_EQ(service.counts_of(lost), "2 seen, 1 fired") << kind;
    }
}

TEST_F(InjectedFaults, AReadThatStallsEndsInItsTime)
{
    const int stalled = service.place(on_device({{"kind", "stall"}}, 1));

    const outcome ended = home.run({"--retries", "0", "--timeout", "1", "device-status"});

    EXPECT_EQ(ended.exit_status, 5);
    EXPECT_EQ(service.counts_of(stalled), "1 seen, 1 fired");
}

TEST_F(InjectedFaults, AChangeIsNotRepeated)
{
    const int busy = service.place(
        {{"kind", "status"}, {"status", 503}, {"path", "/api/folder/create.php"}, {"count", 1}});

    const outcome ended = home.run({"mkdir", "/photos"});

    EXPECT_EQ(ended.exit_status, 7) << ended.err;
    EXPECT_EQ(service.counts_of(busy), "1 seen, 1 fired");
    EXPECT_TRUE(root_folders().empty());
}

TEST_F(InjectedFaults, AChangeWhoseAnswerIsLostIsReportedAsFailedAndNotDoneTwice)
{
    const int lost =
        service.place({{"kind", "lost-reply"}, {"path", "/api/folder/create.php"}, {"count", 1}});

    const outcome ended = home.run({"mkdir", "/photos"});

    EXPECT_EQ(ended.exit_status, 5) << ended.err;
    EXPECT_EQ(service.counts_of(lost), "1 seen, 1 fired");
    EXPECT_EQ(root_folders().size(), 1U);
}

TEST_F(InjectedFaults, ACertificateThatDoesNotHoldIsRefusedAndNotAskedForAgain)
{
    for (const char *which : {"expired", "wrong-host", "self-signed"}) {
        const int wrong = service.place({{"kind", "certificate"}, {"which", which}, {"count", 1}});

        const outcome ended = read_device("4");

        EXPECT_EQ(ended.exit_status, 5) << which << ended.err;
        EXPECT_THAT(ended.err, HasSubstr("certificate")) << which;
        EXPECT_EQ(service.counts_of(wrong), "1 seen, 1 fired") << which;
    }
}

} // namespace quillmere_test
