// The links of files.
#include <algorithm>
#include <limits>

#include "endpoints/endpoints.h"
#include "endpoints/entries.h"
#include "errors.h"
#include "links.h"
#include "media_types.h"
#include "store/attachments.h"
#include "store/database.h"
#include "store/one_time_links.h"
#include "store/usage.h"
#include "system_limits.h"

namespace emulator {
namespace {

std::vector<std::string> keys_given(const call &asked)
{
    const std::string &text = asked.required("quick_key");
    std::vector<std::string> keys;
    for (std::size_t begin = 0; begin <= text.size();) {
        const std::size_t end = std::min(text.find(',', begin), text.size());
        keys.push_back(text.substr(begin, end - begin));
        begin = end + 1;
    }
    if (keys.size() > system_limits::max_keys)
        throw refusal(error::parameter_invalid, "quick_key");
    return keys;
}

void check_link_type(const std::string &type)
{
    const auto is_this = [&type](const link_kind &kind) { return type == kind.element; };
    if (!type.empty() && std::none_of(std::begin(link_kinds), std::end(link_kinds), is_this))
        throw refusal(error::parameter_invalid, "link_type");
}

std::string number_text(error number) { return std::to_string(static_cast<int>(number)); }

// Links of the kinds without an error of their own are left out where they lead nowhere.
void write_error(const link_kind &kind, error number, xml_writer &xml)
{
    const std::string element = kind.element;
    if (element == "direct_download")
        xml.element("direct_download_error", number_text(number));
    if (element == "direct_download" || element == "edit" || element == "one_time_download")
        xml.element((element + "_error_message").c_str(), row_of(number).message);
}

bool is_for(const link_kind &kind, const file &shown)
{
    return *kind.file_type == '\0' || media_type_of(shown.name).is(kind.file_type);
}

std::optional<error> obstacle(const call &asked, const link_kind &kind, const file &shown)
{
    const account_usage usage = usage_of(asked.state.store, shown.account, asked.state.now());
    if (kind.needs_session && asked.account != shown.account)
        return error::access_denied;
    if (kind.use == link_use::view && !is_for(kind, shown))
        return error::edit_impossible;
    if (shown.content.is_missing())
        return error::content_missing;
    if (usage.bandwidth_left() == 0)
        return error::bandwidth_spent;
    if (kind.use == link_use::one_time && usage.one_time_today >= one_time_download_limit)
        return error::daily_limit_reached;
    return std::nullopt;
}

void write_link(const call &asked, const link_kind &kind, const file &shown, xml_writer &xml)
{
    if (kind.use == link_use::stream && !is_for(kind, shown))
        return;
    if (const auto problem = obstacle(asked, kind, shown))
        return write_error(kind, *problem, xml);
    const std::string key = kind.use == link_use::one_time
                                ? make_one_time_link(asked.state.store, shown.id, asked.state.now())
                                : shown.link_key;
    xml.element(kind.element, link_text(asked.origin, kind, key, shown.name));
}

void write_links(const call &asked, const file &shown, const std::string &type, xml_writer &xml)
{
    for (const link_kind &kind : link_kinds)
        if (type.empty() || type == kind.element)
            write_link(asked, kind, shown, xml);
}

// Clients read it as a number of 32 bits with a sign.
std::uint64_t free_bandwidth(const call &asked, const file &shown)
{
    constexpr auto most = static_cast<std::uint64_t>(std::numeric_limits<std::int32_t>::max());
    const account_usage usage = usage_of(asked.state.store, shown.account, asked.state.now());
    return std::min(usage.bandwidth_left(), most);
}

file linkable_file(const call &asked, const std::string &key)
{
    file found = readable_file(asked, key);
    if (found.deleted != 0)
        throw refusal(error::file_unknown);
    return found;
}

/** Writes the link element of one key among several; a failure is told inside it. */
void write_one_of(const call &asked, const std::string &key, const std::string &type,
                  xml_writer &xml)
{
    xml.open("link");
    xml.element("quickkey", key);
    try {
        write_links(asked, linkable_file(asked, key), type, xml);
    } catch (const refusal &why) {
        xml.element("error", number_text(why.number()));
    }
    xml.close();
}

} // namespace

void get_file_links(const call &asked, xml_writer &xml)
{
    const std::vector<std::string> keys = keys_given(asked);
    const std::string &type = asked.optional("link_type");
    check_link_type(type);
    if (keys.size() > 1) {
        for (const std::string &key : keys)
            write_one_of(asked, key, type, xml);
        return;
    }
    // With one key alone, what is wrong with it is wrong with the request.
    const file shown = linkable_file(asked, keys.front());
    write_one_of(asked, shown.key, type, xml);
    if (type.empty() || type == "direct_download")
        xml.element("direct_download_free_bandwidth", free_bandwidth(asked, shown));
}

} // namespace emulator
