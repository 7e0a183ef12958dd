#include "faults.h"

#include <string>
#include <vector>

#include <gtest/gtest.h>

using namespace emulator;

namespace {

constexpr const char *info = "/api/user/get_info.php";

fault on(const std::string &path = {})
{
    fault rule;
    rule.path = path;
    return rule;
}

/** One "x" for each request that is struck, "." for others. */
std::string strikes(fault_list &faults, int requests, const char *path = info)
{
    std::string told;
    for (int number = 0; number < requests; ++number)
        told += faults.strike_request(path) ? 'x' : '.';
    return told;
}

std::string strikes_of(const fault &rule, int requests)
{
    fault_list faults;
    faults.place(rule);
    return strikes(faults, requests);
}

} // namespace

TEST(Faults, AreNoneAtFirst)
{
    fault_list faults;

    EXPECT_EQ(strikes(faults, 1), ".");
    EXPECT_EQ(faults.strike_connection(), nullptr);
}

TEST(Faults, StrikeEveryRequestUnlessItIsSaid) { EXPECT_EQ(strikes_of(on(), 3), "xxx"); }

TEST(Faults, StrikeThePathsThatBeginAsTheirs)
{
    fault_list faults;
    faults.place(on("/api/user/"));

    EXPECT_EQ(strikes(faults, 1, info), "x");
    EXPECT_EQ(strikes(faults, 1, "/api/user/"), "x");
    EXPECT_EQ(strikes(faults, 1, "/api/user"), ".");
    EXPECT_EQ(strikes(faults, 1, "/api/file/get_info.php"), ".");
    EXPECT_EQ(faults.all()[0].seen, 2u);
}

TEST(Faults, StrikeAtMostAsOftenAsTheyMay)
{
    fault rule = on();
    rule.count = 2;

    EXPECT_EQ(strikes_of(rule, 4), "xx..");
}

TEST(Faults, LetTheFirstRequestsPass)
{
    fault rule = on();
    rule.after = 2;
    rule.count = 1;

    EXPECT_EQ(strikes_of(rule, 5), "..x..");
}

TEST(Faults, CountWhatTheySeeAndWhatTheyTake)
{
    fault_list faults;
    fault rule = on();
    rule.after = 1;
    rule.count = 2;
    faults.place(rule);

    strikes(faults, 6);

    EXPECT_EQ(faults.all()[0].seen, 6u);
    EXPECT_EQ(faults.all()[0].fired, 2u);
}

TEST(Faults, OfWhichTheFirstThatFiresTakesTheRequest)
{
    fault_list faults;
    fault first = on();
    first.status = 500;
    first.count = 1;
    faults.place(first);
    faults.place(on());

    EXPECT_EQ(faults.strike_request(info)->status, 500u);
    EXPECT_EQ(faults.all()[1].seen, 0u);
    EXPECT_EQ(faults.strike_request(info)->status, 503u);
    EXPECT_EQ(faults.all()[1].seen, 1u);
}

TEST(Faults, StrikeWithTheirProbability)
{
    fault rule = on();
    rule.seed = 7;
    for (const double probability : {0.0, 0.25, 0.9, 1.0}) {
        rule.probability = probability;
        fault_list faults;
        faults.place(rule);
        strikes(faults, 10000);
        EXPECT_NEAR(static_cast<double>(faults.all()[0].fired), 10000 * probability, 200);
    }
    rule.probability = 0;
    EXPECT_EQ(strikes_of(rule, 5), ".....");
    rule.probability = 1;
    EXPECT_EQ(strikes_of(rule, 5), "xxxxx");
}

TEST(Faults, StrikeTheSameRequestsWithTheSameSeed)
{
    fault rule = on();
    rule.probability = 0.5;
    rule.seed = 7;
    const std::string first = strikes_of(rule, 64);

    EXPECT_EQ(strikes_of(rule, 64), first);
    rule.seed = 8;
    EXPECT_NE(strikes_of(rule, 64), first);
}

TEST(Faults, DrawTheSameOnEveryMachine)
{
    fault rule = on();
    rule.probability = 0.5;
    rule.seed = 1;

    EXPECT_EQ(strikes_of(rule, 16), "xxxxx.xx..x..xxx");
}

TEST(Faults, OfCertificatesStrikeConnectionsAlone)
{
    fault_list faults;
    fault rule = on();
    rule.kind = fault_kind::certificate;
    rule.count = 1;
    faults.place(rule);
    faults.place(on("/nothing"));

    EXPECT_EQ(strikes(faults, 1), ".");
    EXPECT_NE(faults.strike_connection(), nullptr);
    EXPECT_EQ(faults.strike_connection(), nullptr);
    EXPECT_EQ(faults.all()[0].seen, 2u);
    EXPECT_EQ(faults.all()[1].seen, 0u);
}

TEST(Faults, HaveNumbersThatAreNotUsedAgain)
{
    fault_list faults;
    const auto first = faults.place(on());
    const auto second = faults.place(on());

    EXPECT_TRUE(faults.remove(*first));
    EXPECT_FALSE(faults.remove(*first));
    EXPECT_EQ(faults.find(*first), nullptr);
    EXPECT_EQ(faults.find(*second)->id, *second);
    faults.clear();
    EXPECT_TRUE(faults.all().empty());
    EXPECT_EQ(faults.place(on()), *second + 1);
}

TEST(Faults, AreLimitedInNumber)
{
    fault_list faults;
    for (std::size_t number = 0; number < fault_list::most; ++number)
        ASSERT_TRUE(faults.place(on()));

    EXPECT_FALSE(faults.place(on()));
    faults.remove(1);
    EXPECT_TRUE(faults.place(on()));
}
