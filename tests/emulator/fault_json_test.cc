#include "fault_json.h"

#include <chrono>
#include <string>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

using namespace emulator;

namespace {

constexpr std::uint64_t any_seed = 99;

fault read(const std::string &text) { return read_fault(text, any_seed); }

std::string refusal_of(const std::string &text)
{
    try {
        read(text);
    } catch (const fault_refusal &why) {
        return why.what();
    }
    return "";
}

std::string told(const std::string &text) { return tell_fault({4, read(text), {}, 3, 2}).dump(); }

} // namespace

TEST(FaultJson, ReadsTheKinds)
{
    struct {
        const char *text;
        fault_kind kind;
    } const cases[] = {
        {R"({"kind": "status", "status": 503})", fault_kind::status},
        {R"({"kind": "delay", "milliseconds": 5})", fault_kind::delay},
        {R"({"kind": "cut", "after_bytes": 5})", fault_kind::cut},
        {R"({"kind": "stall"})", fault_kind::stall},
        {R"({"kind": "lost-reply"})", fault_kind::lost_reply},
        {R"({"kind": "reset"})", fault_kind::reset},
        {R"({"kind": "certificate", "which": "expired"})", fault_kind::certificate},
    };
    for (const auto &each : cases)
        EXPECT_EQ(read(each.text).kind, each.kind) << each.text;
}

TEST(FaultJson, ReadsWhenItFires)
{
    const fault found = read(R"({"path": "/api/user/", "after": 3, "count": 2, "seed": 8,
                                 "probability": 0.5, "kind": "stall"})");

    EXPECT_EQ(found.path, "/api/user/");
    EXPECT_EQ(found.after, 3u);
    EXPECT_EQ(found.count, 2u);
    EXPECT_EQ(found.seed, 8u);
    EXPECT_EQ(found.probability, 0.5);
}

TEST(FaultJson, FiresAlwaysUnlessItIsSaid)
{
    const fault found = read(R"({"kind": "stall"})");

    EXPECT_EQ(found.path, "");
    EXPECT_EQ(found.after, 0u);
    EXPECT_FALSE(found.count);
    EXPECT_EQ(found.seed, any_seed);
    EXPECT_EQ(found.probability, 1.0);
}

TEST(FaultJson, ReadsWhatItDoes)
{
    const fault status = read(R"({"kind": "status", "status": 404, "body": "gone",
                                  "content_type": "text/plain"})");
    EXPECT_EQ(status.status, 404u);
    EXPECT_EQ(status.body, "gone");
    EXPECT_EQ(status.content_type, "text/plain");
    EXPECT_FALSE(read(R"({"kind": "status", "status": 404})").body);
    EXPECT_EQ(read(R"({"kind": "delay", "milliseconds": 600000})").delay, std::chrono::minutes(10));
    EXPECT_EQ(read(R"({"kind": "cut", "after_bytes": 0})").after_bytes, 0u);
    EXPECT_EQ(read(R"({"kind": "certificate", "which": "wrong-host"})").which,
              certificate_variant::wrong_host);
    EXPECT_EQ(read(R"({"kind": "certificate", "which": "self-signed"})").which,
              certificate_variant::self_signed);
}

TEST(FaultJson, SaysWhatIsWrong)
{
    const std::string kinds = "\"kind\" must be one of: status, delay, cut, stall, lost-reply, "
                              "reset, certificate";
    const std::string no_object = "the body must be a JSON object";
    const std::string page = "\"path\" must be a text that begins with \"/\", without a query";
    const std::string type =
        "\"content_type\" must be a text of printable ASCII, such as \"text/plain\"";
    struct {
        const char *text;
        std::string why;
    } const cases[] = {
        {"", no_object},
        {"nonsense", no_object},
        {"[]", no_object},
        {R"({"kind": "stall"} more)", no_object},
        {"{\"kind\": \"\xff\"}", no_object},
        {R"({"kind": 1e999})", no_object},
        {"{}", kinds},
        {R"({"kind": "fire"})", kinds},
        {R"({"kind": null})", kinds},
        {R"({"kind": "stall", "pat": "/"})",
         "\"pat\" is no field of the kind \"stall\", which has: kind, path, after, count, "
         "probability, seed"},
        {R"({"kind": "delay", "status": 500, "milliseconds": 1})",
         "\"status\" is no field of the kind \"delay\", which has: kind, path, after, count, "
         "probability, seed, milliseconds"},
        {R"({"kind": "certificate", "which": "expired", "path": "/"})",
         "\"path\" is no field of the kind \"certificate\", which has: kind, after, count, "
         "probability, seed, which"},
        {R"({"kind": "delay"})", "\"milliseconds\" is missing"},
        {R"({"kind": "cut"})", "\"after_bytes\" is missing"},
        {R"({"kind": "status"})", "\"status\" is missing"},
        {R"({"kind": "certificate"})", "\"which\" is missing"},
        {R"({"kind": "certificate", "which": "old"})",
         "\"which\" must be one of: expired, wrong-host, self-signed"},
        {R"({"kind": "stall", "path": "api"})", page},
        {R"({"kind": "stall", "path": ""})", page},
        {R"({"kind": "stall", "path": "/a?b"})", page},
        {R"({"kind": "stall", "path": 1})", page},
        {R"({"kind": "stall", "count": 0})",
         "\"count\" must be a whole number from 1 to 18446744073709551615"},
        {R"({"kind": "stall", "after": -1})",
         "\"after\" must be a whole number from 0 to 18446744073709551615"},
        {R"({"kind": "stall", "after": 1.5})",
         "\"after\" must be a whole number from 0 to 18446744073709551615"},
        {R"({"kind": "stall", "seed": "x"})",
         "\"seed\" must be a whole number from 0 to 18446744073709551615"},
        {R"({"kind": "stall", "probability": 1.1})",
         "\"probability\" must be a number from 0 to 1"},
        {R"({"kind": "stall", "probability": -0.1})",
         "\"probability\" must be a number from 0 to 1"},
        {R"({"kind": "stall", "probability": "x"})",
         "\"probability\" must be a number from 0 to 1"},
        {R"({"kind": "status", "status": 199})",
         "\"status\" must be a whole number from 200 to 599"},
        {R"({"kind": "status", "status": 600})",
         "\"status\" must be a whole number from 200 to 599"},
        {R"({"kind": "status", "status": 500, "body": 1})", "\"body\" must be a text"},
        {R"({"kind": "status", "status": 204, "body": "x"})",
         "\"body\" cannot go with the status 204"},
        {R"({"kind": "status", "status": 500, "content_type": "a\r\nb: c"})", type},
        {R"({"kind": "status", "status": 500, "content_type": ""})", type},
        {R"({"kind": "delay", "milliseconds": 600001})",
         "\"milliseconds\" must be a whole number from 1 to 600000"},
        {R"({"kind": "delay", "milliseconds": 0})",
         "\"milliseconds\" must be a whole number from 1 to 600000"},
    };
    for (const auto &each : cases)
        EXPECT_EQ(refusal_of(each.text), each.why) << each.text;
}

TEST(FaultJson, SurvivesDeepNesting)
{
    EXPECT_NE(refusal_of(std::string(65536, '[')), "");
    EXPECT_NE(refusal_of(std::string(30000, '[') + std::string(30000, ']')), "");
}

TEST(FaultJson, TellsWhatWasAskedForAndTheCounts)
{
    EXPECT_EQ(told(R"({"kind": "status", "status": 503, "body": "b", "path": "/a", "count": 1})"),
              R"({"id":4,"kind":"status","path":"/a","after":0,"count":1,"probability":1.0,)"
              R"("status":503,"content_type":"text/html; charset=utf-8","body":"b",)"
              R"("seen":3,"fired":2})");
    EXPECT_EQ(told(R"({"kind": "delay", "milliseconds": 7, "probability": 0.5})"),
              R"({"id":4,"kind":"delay","after":0,"probability":0.5,"seed":99,)"
              R"("milliseconds":7,"seen":3,"fired":2})");
    EXPECT_EQ(told(R"({"kind": "certificate", "which": "self-signed"})"),
              R"({"id":4,"kind":"certificate","after":0,"probability":1.0,)"
              R"("which":"self-signed","seen":3,"fired":2})");
}
