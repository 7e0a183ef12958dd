// Documents that were made to do harm, and very large ones.
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <limits>

#include "support/log_capture.h"
#include "support/resources.h"
#include "support/temporary_folder.h"
#include "xml/lookup.h"

namespace quillmere_test {
namespace {

using clock = std::chrono::steady_clock;

class HostileDocument : public testing::Test {
protected:
    log_capture log; // keeps the lines of malformed documents off the screen
};

std::string repeated(const std::string &text, size_t times)
{
    std::string result;
    result.reserve(text.size() * times);
    for (size_t i = 0; i < times; ++i)
        result += text;
    return result;
}

// An entity that stands for ten of the one before it, and so on.
std::string billion_laughs(int levels)
{
    std::string xml = "<!DOCTYPE r [<!ENTITY l0 \"ha\">";
    for (int level = 1; level <= levels; ++level) {
        std::string below = "&l" + std::to_string(level - 1) + ";";
        xml += "<!ENTITY l" + std::to_string(level) + " \"" + repeated(below, 10) + "\">";
    }
    return xml + "]><r><result>&l" + std::to_string(levels) + ";</result></r>";
}

// One long entity, named very often.
std::string quadratic_blow_up(size_t length, size_t times)
{
    return "<!DOCTYPE r [<!ENTITY e \"" + std::string(length, 'x') + "\">]><r><result>" +
           repeated("&e;", times) + "</result></r>";
}

// Memory that unfolding would take and refusing does not.
constexpr size_t unfolded = 100 * 1000 * 1000;

TEST_F(HostileDocument, MayNotUnfoldABillionTimes)
{
    size_t before = peak_resident_bytes();

    looked_up found = look_up(billion_laughs(9), "result");

    EXPECT_EQ(found.parse_failed, 1);
    EXPECT_LT(found.value.value_or("").size(), 10u * 1000 * 1000);
    EXPECT_LT(peak_resident_bytes() - before, unfolded);
}

TEST_F(HostileDocument, MayNotUnfoldABillionTimesWhereNobodyLooks)
{
    EXPECT_EQ(look_up(billion_laughs(9), "absent").parse_failed, 1);
}

TEST_F(HostileDocument, MayNotUnfoldQuadratically)
{
    size_t before = peak_resident_bytes();

    looked_up found = look_up(quadratic_blow_up(50000, 20000), "result");

    EXPECT_EQ(found.parse_failed, 1);
    EXPECT_LT(peak_resident_bytes() - before, unfolded);
}

// Unfolds more than a hundredfold, to the given number of thousands of bytes.
std::string unfolding_to(size_t thousands)
{
    return "<!DOCTYPE r [<!ENTITY a \"" + std::string(100, 'x') + "\"><!ENTITY b \"" +
           repeated("&a;", 10) + "\">]><r><result>" + repeated("&b;", thousands) + "</result></r>";
}

TEST_F(HostileDocument, IsGuardedAgainstFrom64KibibytesOn)
{
    looked_up below = look_up(unfolding_to(60), "result");
    looked_up beyond = look_up(unfolding_to(67), "result");

    EXPECT_EQ(below.parse_failed, 0);
    EXPECT_EQ(below.value, std::string(60 * 1000, 'x'));
    EXPECT_EQ(beyond.parse_failed, 1);
}

TEST_F(HostileDocument, MayNotDefineAnEntityByItself)
{
    EXPECT_EQ(look_up("<!DOCTYPE r [<!ENTITY e \"&e;\">]><r><result>&e;</result></r>", "result")
                  .parse_failed,
              1);
}

TEST_F(HostileDocument, MayNotReadFiles)
{
    temporary_folder folder;
    std::string path = folder.write("secret", "secret");

    looked_up found = look_up("<!DOCTYPE r [<!ENTITY e SYSTEM \"file://" + path +
                                  "\">]><r><result>&e;</result></r>",
                              "result");

    EXPECT_EQ(found.value, std::nullopt);
}

TEST_F(HostileDocument, MayNestDeeply)
{
    constexpr size_t depth = 20000;

    looked_up found =
        look_up(repeated("<a>", depth) + "<b>deep</b>" + repeated("</a>", depth), "b");

    EXPECT_EQ(found.parse_failed, 0);
    EXPECT_EQ(found.value, "deep");
}

TEST_F(HostileDocument, MayHaveAVeryLongName)
{
    const std::string name(1000 * 1000, 'n');

    EXPECT_EQ(value_of("<r><" + name + ">1</" + name + "></r>", name.c_str()), "1");
    EXPECT_EQ(value_of("<r><" + name + ">1</" + name + "></r>", ("/" + name).c_str()), "1");
}

TEST_F(HostileDocument, MayHoldAValueOf50Megabytes)
{
    const std::string value(50 * 1000 * 1000, 'v');

    EXPECT_TRUE(value_of("<r><a>" + value + "</a></r>", "a") == value);
}

TEST_F(HostileDocument, MayHoldTheSameElementVeryOften)
{
    EXPECT_EQ(value_of("<r>" + repeated("<k>A</k>", 200 * 1000) + "</r>", "k"),
              repeated("A", 200 * 1000));
}

// The best of three, which leaves out what other programs on the machine do.
double seconds_of_lookup(const std::string &xml, const char *sought)
{
    double best = std::numeric_limits<double>::max();
    for (int i = 0; i < 3; ++i) {
        clock::time_point start = clock::now();
        looked_up found = look_up(xml, sought);
        best = std::min(best, std::chrono::duration<double>(clock::now() - start).count());
        EXPECT_EQ(found.parse_failed, 0);
    }
    return best;
}

TEST_F(HostileDocument, CostsNoMoreForALineBreakAtEveryByte)
{
    // The parser hands out every line break as a piece of its own, to both lookups, but only one
    // joins them. Joining in quadratic time would make it slower by a factor of thousands.
    const std::string xml = "<r><a>" + std::string(1000 * 1000, '\n') + "</a></r>";
    double parsing = seconds_of_lookup(xml, "absent");

    double joining = seconds_of_lookup(xml, "a");

    EXPECT_LT(joining / parsing, 20);
}

TEST_F(HostileDocument, KeepsEveryLineBreak)
{
    const std::string breaks(1000 * 1000, '\n');

    EXPECT_TRUE(value_of("<r><a>" + breaks + "</a></r>", "a") == breaks);
}

} // namespace
} // namespace quillmere_test
