#include "links.h"

#include "byte_range.h"
#include "envelope.h"
#include "errors.h"
#include "media_types.h"
#include "store/content.h"
#include "store/database.h"
#include "store/one_time_links.h"
#include "store/usage.h"

namespace emulator {
namespace {

/** A request for bytes, on its way to its reply. */
struct fetch {
    const request &asked;
    const link_kind &kind;
    std::string link_key;
    file target;
    byte_range range{range_kind::whole};

    bool is_head() const { return asked.method == "HEAD"; }
    bool is_one_time() const { return kind.use == link_use::one_time; }
};

bool is_plain(char byte)
{
    return (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z') ||
           (byte >= '0' && byte <= '9') || byte == '-' || byte == '.' || byte == '_' || byte == '~';
}

std::string percent_encoded(std::string_view text)
{
    static constexpr char digits[] = "0123456789ABCDEF";
    std::string encoded;
    for (const char byte : text) {
        const auto value = static_cast<unsigned char>(byte);
        if (is_plain(byte))
            encoded += byte;
        else
            encoded.append("%").append(1, digits[value >> 4]).append(1, digits[value & 0xF]);
    }
    return encoded;
}

// The name behind the key is for people and for the names of saved files; only the key counts.
std::string link_key_of(std::string_view target, const link_kind &kind)
{
    target.remove_prefix(std::string_view(kind.folder).size());
    return std::string(target.substr(0, target.find_first_of("/?")));
}

file target_of(const fetch &made, service &state)
{
    if (!made.is_one_time()) {
        if (const auto found = find_file_by_link(state.store, made.link_key))
            return *found;
    } else if (const auto id = find_one_time_link(state.store, made.link_key, state.now())) {
        return file_of_id(state.store, *id);
    }
    throw refusal(error::link_unknown);
}

std::string tag_of(const content_id &content) { return '"' + content.hash + '"'; }

// A range counts only for the bytes that the client has begun with. A link that works once serves
// all of them, since nobody could come back for the rest.
byte_range range_asked(const fetch &made)
{
    const std::uint64_t size = made.target.content.size;
    const bool is_other_content =
        !made.asked.if_range.empty() && made.asked.if_range != tag_of(made.target.content);
    if (made.asked.range.empty() || made.is_head() || made.is_one_time() || is_other_content)
        return {range_kind::whole, 0, size};
    return range_of(made.asked.range, size);
}

void check_limits(const fetch &made, service &state)
{
    if (made.target.content.is_missing())
        throw refusal(error::content_missing);
    const account_usage usage = usage_of(state.store, made.target.account, state.now());
    if (usage.bandwidth_left() == 0)
        throw refusal(error::bandwidth_spent);
    if (made.kind.use == link_use::stream && usage.streamed_today >= streaming_limit)
        throw refusal(error::daily_limit_reached);
    if (made.is_one_time() && usage.one_time_today >= one_time_download_limit)
        throw refusal(error::daily_limit_reached);
}

void count(const fetch &made, service &state)
{
    count_fetch(state.store, made.target.account,
                {made.range.length, made.kind.use == link_use::stream, made.is_one_time()},
                state.now());
    if (made.range.first == 0) // what follows later is the rest of the same download
        count_download(state.store, made.target);
    if (made.is_one_time())
        spend_one_time_link(state.store, made.link_key);
}

std::vector<header_field> fields_of(const fetch &made)
{
    const std::string name = percent_encoded(made.target.name);
    const bool inline_view = made.kind.use == link_use::view || made.kind.use == link_use::stream;
    std::vector<header_field> fields{
        {"Content-Type", media_type_of(made.target.name).mime_type},
        {"Content-Disposition",
         std::string(inline_view ? "inline" : "attachment") + "; filename*=UTF-8''" + name},
        {"ETag", tag_of(made.target.content)},
        {"Accept-Ranges", made.is_one_time() ? "none" : "bytes"},
        {"X-Content-Type-Options", "nosniff"}};
    if (made.range.kind == range_kind::part)
        fields.push_back(
            {"Content-Range", "bytes " + std::to_string(made.range.first) + "-" +
                                  std::to_string(made.range.first + made.range.length - 1) + "/" +
                                  std::to_string(made.target.content.size)});
    return fields;
}

reply unsatisfiable(const fetch &made)
{
    reply refused = refuse(refusal(error::range_unsatisfiable));
    refused.fields = {{"Content-Range", "bytes */" + std::to_string(made.target.content.size)},
                      {"Accept-Ranges", "bytes"}};
    return refused;
}

reply bytes_of(const fetch &made, service &state)
{
    auto opened = std::make_shared<descriptor>(state.content.open(made.target.content));
    const unsigned status = made.range.kind == range_kind::part ? 206 : 200;
    return {status, {}, file_part{opened, made.range.first, made.range.length}, fields_of(made)};
}

} // namespace

const link_kind *link_kind_of(std::string_view path)
{
    for (const link_kind &kind : link_kinds)
        if (path.substr(0, std::string_view(kind.folder).size()) == kind.folder)
            return &kind;
    return nullptr;
}

std::string link_text(std::string_view origin, const link_kind &kind, std::string_view link_key,
                      std::string_view file_name)
{
    return std::string(origin)
        .append(kind.folder)
        .append(link_key)
        .append("/")
        .append(percent_encoded(file_name));
}

reply serve_link(const request &asked, const link_kind &kind, service &state)
{
    if (asked.method != "GET" && asked.method != "HEAD")
        throw refusal(error::method_not_allowed);
    fetch made{asked, kind, link_key_of(asked.target, kind), {}};
    transaction whole(state.store);
    made.target = target_of(made, state);
    check_limits(made, state);
    made.range = range_asked(made);
    if (made.range.kind == range_kind::unsatisfiable)
        return unsatisfiable(made);
    reply found = bytes_of(made, state);
    if (!made.is_head()) {
        count(made, state);
        whole.commit(); // before the first byte goes out, or a link could be spent twice
    }
    return found;
}

} // namespace emulator
