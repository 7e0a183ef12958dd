// What is there: listings, and all that is known of one entry.

#include "commands.h"

#include <CLI/CLI.hpp>

#include "../account.h"
#include "../entry_fields.h"
#include "../folder_content.h"

namespace quillmere::tools {

namespace {

std::string name_in(const std::vector<fact> &facts)
{
    for (const fact &each : facts)
        if (std::string_view(each.key) == "name" && each.value.is_string())
            return each.value.get<std::string>();
    return "-";
}

result_table empty_listing()
{
    return {"entries",
            {{"kind", "Kind"},
             {"size", "Size"},
             {"created", "Created"},
             {"privacy", "Privacy"},
             {"key", "Key"},
             {"name", "Name"}},
            {}};
}

result_table listing_of(const account &owner, const remote_entry &entry)
{
    result_table listing = empty_listing();
    if (!entry.is_folder()) {
        listing.rows.push_back(facts_of(read_file(owner, entry.key).get()));
        return listing;
    }
    const folder_content content =
        read_content(owner, entry, {entry_kind::folder, entry_kind::file});
    for (const folder_info *each : content.folders)
        listing.rows.push_back(facts_of(each));
    for (const file_info *each : content.files)
        listing.rows.push_back(facts_of(each));
    return listing;
}

std::vector<std::string> names_in(const result_table &listing)
{
    std::vector<std::string> names;
    for (const std::vector<fact> &row : listing.rows) {
        const bool folder = row.front().value == word_for(entry_kind::folder);
        names.push_back(name_in(row) + (folder ? "/" : ""));
    }
    return names;
}

std::vector<fact> facts_about(const account &owner, const remote_entry &entry)
{
    if (entry.is_folder())
        return facts_of(read_folder(owner, entry.key_or_null()).get());
    return facts_of(read_file(owner, entry.key).get());
}

} // namespace

void declare_ls(CLI::App &options, arguments &given)
{
    options.add_option("PATH", given.entry.path, "Folder or file; / unless given")
        ->option_text(" ");
    options.add_flag("-l,--long", given.entry.long_form, "Show size, date, privacy and key, too");
}

void declare_stat(CLI::App &options, arguments &given)
{
    options.add_option("PATH", given.entry.path, "Folder or file")->required()->option_text(" ");
}

void run_ls(command_context &context)
{
    const account owner = signed_in_account(context);
    const remote_entry entry = find_entry(tree_of(owner), context.given.entry.path);
    const result_table listing = listing_of(owner, entry);
    if (context.given.entry.long_form)
        context.output.rows({}, listing);
    else
        context.output.lines(names_in(listing), listing);
}

void run_stat(command_context &context)
{
    const account owner = signed_in_account(context);
    const remote_entry entry = find_entry(tree_of(owner), context.given.entry.path);
    context.output.facts(facts_about(owner, entry));
}

} // namespace quillmere::tools
