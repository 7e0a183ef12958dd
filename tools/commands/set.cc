// Changing what the service keeps beside an entry: name, description, tags, privacy, time.

#include "commands.h"

#include <CLI/CLI.hpp>

#include "../account.h"
#include "../failure.h"
#include "../remote_changes.h"

namespace quillmere::tools {

namespace {

// The service takes an empty one for none at all, so that it would change nothing and say so to
// nobody.
void refuse_empty(const std::optional<std::string> &text, const char *option)
{
    if (text && text->empty())
        throw failure(exit_code::usage, std::string(option) + " must not be empty",
                      "leave it out to keep what is there");
}

void check(const set_arguments &given)
{
    if (!given.name && !given.description && !given.tags && !given.privacy && !given.time)
        throw failure(exit_code::usage, "there is nothing to set", "see: quillmere set --help");
    refuse_empty(given.name, "--name");
    refuse_empty(given.time, "--time");
}

} // namespace

void declare_set(CLI::App &options, arguments &given)
{
    set_arguments &set = given.set;
    options.add_option("PATH", set.path, "Folder or file")->required()->option_text(" ");
    options.add_option("--name", set.name, "New name")->option_text("NAME");
    options.add_option("--description", set.description, "New description; '' clears it")
        ->option_text("TEXT");
    options.add_option("--tags", set.tags, "New tags; '' clears them")->option_text("TEXT");
    auto *const privacy = options.add_option("--privacy", set.privacy, "public or private")
                              ->option_text("PRIVACY")
                              ->check(CLI::IsMember({"public", "private"}));
    options
        .add_flag("-r,--recursive", set.recursive,
                  "Give a folder's new privacy to all that it holds")
        ->needs(privacy);
    options
        .add_option("--time", set.time,
                    "Modification time, such as '2026-03-01 09:30:00' (universal time)")
        ->option_text("TIME");
}

void run_set(command_context &context)
{
    const set_arguments &given = context.given.set;
    check(given);
    const account owner = signed_in_account(context);
    const remote_entry entry = find_movable(tree_of(owner), given.path, "changed");
    if (given.recursive && !entry.is_folder())
        throw failure(exit_code::usage, given.path + " is a file, which --recursive is not for",
                      "leave --recursive out");
    update_entry(
        owner, entry,
        {given.name, given.description, given.tags, given.privacy, given.time, given.recursive});
    context.output.sentence("Changed " + given.path, {{"kind", "Kind", word_for(entry.kind)},
                                                      {"key", "Key", entry.key},
                                                      {"path", "Path", given.path}});
}

} // namespace quillmere::tools
