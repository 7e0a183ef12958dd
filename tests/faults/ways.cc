#include "faults/ways.h"

#include "interpose/heap.h"
#include "support/taken_text.h"
#include "support/thread_log.h"

namespace quillmere_test {
namespace {

using std::chrono::steady_clock;

constexpr const char *path = "/a/path/of/some/length";
char rubbish[] = "rubbish";

template <class Call> outcome_of_call observed(Call call)
{
    outcome_of_call outcome;
    thread_log::take();
    int64_t before = blocks_held();
    auto start = steady_clock::now();
    call(outcome);
    outcome.time = steady_clock::now() - start;
    outcome.blocks_kept = blocks_held() - before;
    outcome.log = thread_log::take();
    return outcome;
}

outcome_of_call get(const std::string &base)
{
    return observed([&](outcome_of_call &outcome) { outcome.exchanged = fetch(base + path); });
}

outcome_of_call post(const std::string &base)
{
    return observed([&](outcome_of_call &outcome) {
        outcome.exchanged = fetch(base + path, post_of("the body"));
    });
}

void check_exchange(const outcome_of_call &outcome, const expectation &expected, bool succeeded)
{
    EXPECT_EQ(outcome.exchanged.code, succeeded ? expected.code : -1);
    EXPECT_EQ(outcome.exchanged.body, succeeded ? expected.body : std::nullopt);
    EXPECT_EQ(outcome.exchanged.length, succeeded ? expected.body.value_or("").size() : 0);
}

std::string nothing_before(const std::string &) { return ""; }
std::string nothing_after(const expectation &, bool) { return ""; }

// An operation that creates something, whose reply may be lost when the work is done.
outcome_of_call operation(const std::string &)
{
    return observed([](outcome_of_call &outcome) {
        char *key = rubbish;
        char *message = rubbish;
        outcome.status = create_folder("session+token", "name", nullptr, nullptr, &key, &message);
        outcome.handed_out = taken(key).has_value();
        outcome.message = taken(message);
    });
}

void check_operation(const outcome_of_call &outcome, const expectation &expected, bool succeeded)
{
    const expectation &found = succeeded ? expected : fails({});
    EXPECT_EQ(outcome.status, found.status);
    EXPECT_EQ(outcome.message, found.message);
    EXPECT_EQ(outcome.handed_out, found.status == QM_OK);
}

std::string url_line(const std::string &base)
{
    return "create_folder: url: " + base +
           "/api/folder/create.php?session_token=session+token&foldername=name"
           "&allow_duplicate_name=no&version=2\n";
}

std::string reply_lines(const expectation &expected, bool succeeded)
{
    if (!succeeded || !expected.body)
        return "Got response:\n(null)\n";
    // As a text, which ends at its first NUL.
    std::string body = expected.body->c_str();
    std::string lines = "Got response:\n" + body + "\n";
    if (expected.status == QM_MALFORMED_REPLY)
        lines += "Expat failed parsing a node with error 0\n"
                 "Name of node whose value is sought: result\n"
                 "XML we are searching for this node:\n" +
                 body + "\n";
    return lines;
}

} // namespace

const way ways[3] = {
    {"GET", get, check_exchange, nothing_before, nothing_after},
    {"POST", post, check_exchange, nothing_before, nothing_after},
    {"operation", operation, check_operation, url_line, reply_lines},
};

} // namespace quillmere_test
