// The filter between the library's log and its reader: secrets of every kind among any other text,
// in pieces of any size.
#include <algorithm>
#include <vector>

#include "masking_filter.h"
#include "support/choices.h"
#include "support/target.h"

namespace quillmere_fuzz {
namespace {

using quillmere::tools::is_secret_name;
using quillmere::tools::masking_filter;

constexpr const char *secret_names[] = {"session_token",   "password", "signature",
                                        "fb_access_token", "pkey",     "login_token",
                                        "application_key", "PassWord"};

// How a secret stands in the log: as a parameter, as an element's text, as an attribute's value.
struct setting {
    const char *before_name;
    const char *before_secret;
    const char *before_closing_name; // null: the name does not come again
    const char *after;
};

constexpr setting settings[] = {
    {"?", "=", nullptr, "&"},
    {"&", "=", nullptr, "\n"},
    {"<", ">", "</", ">"},
    {"<", " a=\"b\">", "</", ">"},
    {" ", "=\"", nullptr, "\""},
    {" ", "='", nullptr, "'"},
    {"<a href=\"/p?", "=", nullptr, "&amp;x=1\">"},
};

// Two logs that differ in their secrets alone must look the same behind the filter.
struct twin_logs {
    std::string one;
    std::string other;

    void add(std::string_view text)
    {
        one += text;
        other += text;
    }

    void add_secret(choices &chosen)
    {
        const setting &around = settings[chosen.below(std::size(settings))];
        const char *name = secret_names[chosen.below(std::size(secret_names))];
        add(around.before_name);
        add(name);
        add(around.before_secret);
        add_canaries(chosen.text());
        if (around.before_closing_name) {
            add(around.before_closing_name);
            add(name);
        }
        add(around.after);
    }

private:
    // What can stand in a parameter, an element and a quoted value alike. Without "=", since a
    // value that ends like the name of another secret hides what follows it, and that may show.
    static constexpr std::string_view letters =
        "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789%!()*^+/._-";

    void add_canaries(const std::string &seed)
    {
        // None at all would show, and rightly so: there is nothing to hide then.
        one += letters[seed.size() % letters.size()];
        other += letters[(seed.size() + 1) % letters.size()];
        for (char each : seed) {
            auto at = static_cast<unsigned char>(each);
            one += letters[at % letters.size()];
            other += letters[(at + 7u) % letters.size()];
        }
    }
};

twin_logs compose(choices &chosen)
{
    twin_logs logs;
    for (int parts = 0; chosen.left() && parts < 32; ++parts) {
        logs.add(chosen.bytes(chosen.byte()));
        logs.add_secret(chosen);
    }
    return logs;
}

std::string masked(const std::string &log)
{
    masking_filter filter;
    std::string passed;
    filter.feed(log, passed);
    return passed;
}

std::string masked_in_pieces(const std::string &log, std::string_view cuts)
{
    masking_filter filter;
    std::string passed;
    std::string_view left = log;
    for (size_t cut = 0; !left.empty(); ++cut) {
        size_t wanted = cuts.empty() ? 1 : static_cast<unsigned char>(cuts[cut % cuts.size()]) + 1u;
        size_t count = std::min(left.size(), wanted);
        filter.feed(left.substr(0, count), passed);
        left.remove_prefix(count);
    }
    return passed;
}

void try_filter(std::string_view input)
{
    choices chosen(input);
    std::string cuts = chosen.text();
    twin_logs logs = compose(chosen);
    std::string passed;
    within_budget(linear, logs.one.size(), [&] { passed = masked(logs.one); });

    expect(passed == masked(logs.other), "no letter of a secret passes");
    expect(passed == masked_in_pieces(logs.one, cuts), "it does not matter where the log is cut");
}

const known_target filter("masking_filter", try_filter);

} // namespace
} // namespace quillmere_fuzz
