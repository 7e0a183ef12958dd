#include "fault_json.h"

#include <algorithm>
#include <limits>
#include <vector>

#include <nlohmann/json.hpp>

namespace emulator {
namespace {

using json = nlohmann::ordered_json;

constexpr std::uint64_t no_limit = std::numeric_limits<std::uint64_t>::max();
constexpr std::uint64_t longest_delay = 10 * 60 * 1000; // milliseconds

template <class Value> struct name_of {
    const char *name;
    Value value;
};

constexpr name_of<fault_kind> kinds[] = {
    {"status", fault_kind::status},
    {"delay", fault_kind::delay},
    {"cut", fault_kind::cut},
    {"stall", fault_kind::stall},
    {"lost-reply", fault_kind::lost_reply},
    {"reset", fault_kind::reset},
    {"certificate", fault_kind::certificate},
};

constexpr name_of<certificate_variant> variants[] = {
    {"expired", certificate_variant::expired},
    {"wrong-host", certificate_variant::wrong_host},
    {"self-signed", certificate_variant::self_signed},
};

template <class Rows, class Text> std::string listed(const Rows &rows, Text text)
{
    std::string names;
    for (const auto &row : rows)
        names += (names.empty() ? "" : ", ") + std::string(text(row));
    return names;
}

// A member that is asked for, with its value.
struct member {
    const std::string &name;
    const json &value;

    fault_refusal refusal(const std::string &wanted) const
    {
        return fault_refusal("\"" + name + "\" must be " + wanted);
    }

    std::uint64_t number(std::uint64_t least, std::uint64_t most) const
    {
        if (value.is_number_unsigned()) {
            const auto found = value.get<std::uint64_t>();
            if (found >= least && found <= most)
                return found;
        }
        throw refusal("a whole number from " + std::to_string(least) + " to " +
                      std::to_string(most));
    }

    std::string text(const char *wanted) const
    {
        if (!value.is_string())
            throw refusal(wanted);
        return value.get<std::string>();
    }

    template <class Value, std::size_t Count>
    Value choice(const name_of<Value> (&rows)[Count]) const
    {
        for (const auto &row : rows)
            if (value == row.name)
                return row.value;
        throw refusal("one of: " + listed(rows, [](const auto &row) { return row.name; }));
    }
};

template <class Value, std::size_t Count>
const char *name_among(const name_of<Value> (&rows)[Count], Value value)
{
    for (const auto &row : rows)
        if (row.value == value)
            return row.name;
    return "";
}

std::string path_in(const member &given)
{
    constexpr const char *wanted = "a text that begins with \"/\", without a query";
    std::string path = given.text(wanted);
    if (path.empty() || path[0] != '/' || path.find('?') != path.npos)
        throw given.refusal(wanted);
    return path;
}

// It goes into a header, which a line end would break open.
std::string content_type_in(const member &given)
{
    constexpr const char *wanted = "a text of printable ASCII, such as \"text/plain\"";
    std::string type = given.text(wanted);
    const auto is_plain = [](char byte) { return byte >= ' ' && byte <= '~'; };
    if (type.empty() || !std::all_of(type.begin(), type.end(), is_plain))
        throw given.refusal(wanted);
    return type;
}

double probability_in(const member &given)
{
    if (given.value.is_number()) {
        const auto found = given.value.get<double>();
        if (found >= 0 && found <= 1)
            return found;
    }
    throw given.refusal("a number from 0 to 1");
}

enum class need { optional, required };

/** One member of a fault: for which kind it is meant, how it is read, and how it is told. */
struct field {
    const char *name;
    std::optional<fault_kind> of; // nothing for all kinds
    need needed;
    void (*read)(const member &, fault &);
    json (*tell)(const fault &);
};

const field fields[] = {
    {"path",
     {},
     need::optional,
     [](const member &given, fault &into) { into.path = path_in(given); },
     [](const fault &rule) { return rule.path.empty() ? json() : json(rule.path); }},
    {"after",
     {},
     need::optional,
     [](const member &given, fault &into) { into.after = given.number(0, no_limit); },
     [](const fault &rule) { return json(rule.after); }},
    {"count",
     {},
     need::optional,
     [](const member &given, fault &into) { into.count = given.number(1, no_limit); },
     [](const fault &rule) { return rule.count ? json(*rule.count) : json(); }},
    {"probability",
     {},
     need::optional,
     [](const member &given, fault &into) { into.probability = probability_in(given); },
     [](const fault &rule) { return json(rule.probability); }},
    {"seed",
     {},
     need::optional,
     [](const member &given, fault &into) { into.seed = given.number(0, no_limit); },
     [](const fault &rule) { return rule.probability < 1 ? json(rule.seed) : json(); }},
    {"status", fault_kind::status, need::required,
     [](const member &given, fault &into) {
         into.status = static_cast<unsigned>(given.number(200, 599));
     },
     [](const fault &rule) { return json(rule.status); }},
    {"content_type", fault_kind::status, need::optional,
     [](const member &given, fault &into) { into.content_type = content_type_in(given); },
     [](const fault &rule) { return json(rule.content_type); }},
    {"body", fault_kind::status, need::optional,
     [](const member &given, fault &into) { into.body = given.text("a text"); },
     [](const fault &rule) { return rule.body ? json(*rule.body) : json(); }},
    {"milliseconds", fault_kind::delay, need::required,
     [](const member &given, fault &into) {
         into.delay = std::chrono::milliseconds(given.number(1, longest_delay));
     },
     [](const fault &rule) { return json(rule.delay.count()); }},
    {"after_bytes", fault_kind::cut, need::required,
     [](const member &given, fault &into) { into.after_bytes = given.number(0, no_limit); },
     [](const fault &rule) { return json(rule.after_bytes); }},
    {"which", fault_kind::certificate, need::required,
     [](const member &given, fault &into) { into.which = given.choice(variants); },
     [](const fault &rule) { return json(name_among(variants, rule.which)); }},
};

// A TLS connection is made before anybody knows what will be asked over it.
bool is_of(const field &row, fault_kind kind)
{
    if (kind == fault_kind::certificate && std::string_view(row.name) == "path")
        return false;
    return !row.of || row.of == kind;
}

std::vector<field> fields_of(fault_kind kind)
{
    std::vector<field> own;
    std::copy_if(std::begin(fields), std::end(fields), std::back_inserter(own),
                 [kind](const field &row) { return is_of(row, kind); });
    return own;
}

fault_kind kind_in(const json &given)
{
    const auto found = given.find("kind");
    static const std::string name = "kind";
    return member{name, found == given.end() ? json() : *found}.choice(kinds);
}

void read_member(const member &given, const std::vector<field> &known, fault &into)
{
    if (given.name == "kind")
        return;
    for (const field &row : known)
        if (given.name == row.name)
            return row.read(given, into);
    const std::string kind = name_among(kinds, into.kind);
    throw fault_refusal("\"" + given.name + "\" is no field of the kind \"" + kind +
                        "\", which has: kind, " +
                        listed(known, [](const field &row) { return row.name; }));
}

// Some replies have no body by their nature: their client would take it for the next reply.
void check_body(const fault &read)
{
    if (read.body && !read.body->empty() && (read.status == 204 || read.status == 304))
        throw fault_refusal("\"body\" cannot go with the status " + std::to_string(read.status));
}

} // namespace

fault read_fault(const std::string &text, std::uint64_t any_seed)
{
    const json given = json::parse(text, nullptr, false);
    if (!given.is_object())
        throw fault_refusal("the body must be a JSON object");
    fault read;
    read.kind = kind_in(given);
    read.seed = any_seed;
    const std::vector<field> known = fields_of(read.kind);
    for (const auto &[name, value] : given.items())
        read_member({name, value}, known, read);
    for (const field &row : known)
        if (row.needed == need::required && !given.contains(row.name))
            throw fault_refusal("\"" + std::string(row.name) + "\" is missing");
    check_body(read);
    return read;
}

json tell_fault(const placed_fault &placed)
{
    json told = {{"id", placed.id}, {"kind", name_among(kinds, placed.rule.kind)}};
    for (const field &row : fields_of(placed.rule.kind))
        if (json value = row.tell(placed.rule); !value.is_null())
            told[row.name] = std::move(value);
    told["seen"] = placed.seen;
    told["fired"] = placed.fired;
    return told;
}

} // namespace emulator
