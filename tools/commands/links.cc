// The links of a file.

#include "commands.h"

#include <CLI/CLI.hpp>

#include "../account.h"
#include "../failure.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

using link_getter = const char *(*)(const file_links *record);

/** A kind of link, and the record's fields that tell of it. */
struct link_type {
    const char *name;
    link_getter link;
    link_getter error;   // the number of a refusal, or null: there is no such field
    link_getter message; // its message, likewise
};

constexpr link_type link_types[] = {
    {"view", file_links_get_view, nullptr, nullptr},
    {"listen", file_links_get_listen, nullptr, nullptr},
    {"watch", file_links_get_watch, nullptr, nullptr},
    {"normal_download", file_links_get_normal_download, nullptr, nullptr},
    {"direct_download", file_links_get_direct_download, file_links_get_direct_download_error,
     file_links_get_direct_download_error_message},
    {"edit", file_links_get_edit, nullptr, file_links_get_edit_error_message},
    {"one_time_download", file_links_get_one_time_download, nullptr,
     file_links_get_one_time_download_error_message},
};

const char *field(const file_links *record, link_getter get)
{
    return get == nullptr ? nullptr : get(record);
}

std::vector<fact> row(const char *type, const char *link, const char *error, const char *message)
{
    return {{"type", nullptr, text_or_null(type)},
            {"link", nullptr, text_or_null(link)},
            {"error", nullptr, number_or_text(error)},
            {"message", nullptr, text_or_null(message)}};
}

void add_rows(const file_links *record, result_table &links)
{
    for (const link_type &type : link_types) {
        const char *const link = type.link(record);
        const char *const error = field(record, type.error);
        const char *const message = field(record, type.message);
        if (link != nullptr || error != nullptr || message != nullptr)
            links.rows.push_back(row(type.name, link, error, message));
    }
    if (const char *const error = file_links_get_error(record))
        links.rows.push_back(row(nullptr, nullptr, error, nullptr));
}

/** The links of some files; people are shown a column of messages where there are any. */
result_table table_of(const file_links_list *records)
{
    result_table links = {"links", {{"type", "Type"}, {"link", "Link"}}, {}};
    for (const file_links *each : in_order_sent(records))
        add_rows(each, links);
    for (const std::vector<fact> &each : links.rows)
        if (!each.back().value.is_null()) {
            links.columns.push_back({"message", "Message"});
            break;
        }
    return links;
}

std::vector<std::string> type_names()
{
    std::vector<std::string> names;
    for (const link_type &each : link_types)
        names.emplace_back(each.name);
    return names;
}

file_links_list_owner read_links(const account &owner, const remote_entry &file,
                                 const std::string &type)
{
    file_links_list *links = nullptr;
    const operation asked = [&](char **error_message) {
        std::int32_t count = 0;
        return get_links(file.key.c_str(), type.c_str(), owner.session(), &links, &count,
                         error_message);
    };
    // Each request makes a one-time link of its own.
    const bool makes_one_time_link = type.empty() || type == "one_time_download";
    const std::string action = "reading the links of " + file.name;
    if (makes_one_time_link)
        owner.remote.once(action, asked);
    else
        owner.remote.read(action, asked);
    return file_links_list_owner(links);
}

struct download {
    std::string url;
    std::int32_t free_bandwidth = 0;
};

/** What came in place of the link. */
failure download_failure(const remote_entry &file, std::int32_t error, const char *message)
{
    std::string why = "there is no download of " + file.name;
    if (error != 0)
        why += ": " + std::to_string(error);
    if (message != nullptr)
        why += ": " + std::string(message);
    failure problem(exit_code::refused, why, "quillmere links tells which links it has");
    if (error != 0)
        problem.status = error;
    return problem;
}

download read_download(const account &owner, const remote_entry &file)
{
    char *url = nullptr;
    char *refusal = nullptr;
    std::int32_t error = 0;
    download read;
    owner.remote.read("reading the link of " + file.name, [&](char **error_message) {
        return get_download_link(owner.session(), file.key.c_str(), &url, &read.free_bandwidth,
                                 error_message, &error, &refusal);
    });
    const heap_text owned_url(url);
    const heap_text owned_refusal(refusal);
    if (url == nullptr)
        throw download_failure(file, error, refusal);
    read.url = url;
    return read;
}

} // namespace

void declare_links(CLI::App &options, arguments &given)
{
    links_arguments &links = given.links;
    options.add_option("PATH", links.path, "File")->required()->option_text(" ");
    auto *const type = options.add_option("--type", links.type, "Only the links of this type")
                           ->option_text("TYPE")
                           ->check(CLI::IsMember(type_names()));
    options
        .add_flag("--download", links.download,
                  "Only the address under which the bytes can be fetched")
        ->excludes(type);
}

void run_links(command_context &context)
{
    const links_arguments &given = context.given.links;
    const account owner = signed_in_account(context);
    const remote_entry file = find_file(tree_of(owner), given.path);
    if (given.download) {
        const download found = read_download(owner, file);
        context.output.sentence(found.url, {{"key", "Key", file.key},
                                            {"url", "Address", found.url},
                                            {"free_bandwidth", "Bandwidth", found.free_bandwidth}});
        return;
    }
    const file_links_list_owner records = read_links(owner, file, given.type);
    context.output.rows({{"key", nullptr, file.key}}, table_of(records.get()));
}

} // namespace quillmere::tools
