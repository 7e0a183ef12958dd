// New folders and files, and the removal of old ones.

#include "commands.h"

#include <CLI/CLI.hpp>

#include "../account.h"
#include "../failure.h"
#include "../remote_changes.h"

namespace quillmere::tools {

namespace {

void declare_path(CLI::App &options, arguments &given, const char *what)
{
    options.add_option("PATH", given.entry.path, what)->required()->option_text(" ");
}

void declare_time(CLI::App &options, arguments &given)
{
    options
        .add_option("--time", given.entry.time,
                    "Modification time, such as '2026-03-01 09:30:00' (universal time)")
        ->option_text("TIME");
}

std::vector<fact> facts_of_created(const remote_entry &entry, const std::string &path, bool created)
{
    return {{"kind", "Kind", word_for(entry.kind)},
            {"key", "Key", entry.key},
            {"path", "Path", path},
            {"created", "Created", created}};
}

/** The folder for something new, which must be all that is missing. */
const remote_entry &folder_for_new(const remote_place &place, const std::string &path)
{
    if (place.exists())
        throw failure(exit_code::refused, "there is " + path + " already",
                      "choose another name, or remove it first");
    if (place.missing.size() > 1)
        throw failure(exit_code::refused,
                      "there is no folder " + place.missing.front() + " on the way to " + path,
                      "create it with: quillmere mkdir -p");
    return place.reached;
}

/** Creates the folders that are missing, one in the other; the last of them. */
remote_entry create_all(const account &owner, const remote_place &place,
                        const std::optional<std::string> &time)
{
    remote_entry last = place.reached;
    std::string done;
    for (const std::string &name : place.missing) {
        after(done, [&] { last = create_folder_in(owner, last, name, time); });
        done = "created " + name;
    }
    return last;
}

} // namespace

void declare_mkdir(CLI::App &options, arguments &given)
{
    declare_path(options, given, "Folder to create");
    options.add_flag("-p,--parents", given.entry.parents,
                     "Create the folders on the way, too; one that is there is fine");
    declare_time(options, given);
}

void declare_create(CLI::App &options, arguments &given)
{
    declare_path(options, given, "File to create");
    declare_time(options, given);
}

void declare_rm(CLI::App &options, arguments &given)
{
    declare_path(options, given, "Folder or file to remove");
    options.add_flag("-r,--recursive", given.entry.recursive,
                     "Remove a folder with all that it holds");
}

void run_mkdir(command_context &context)
{
    const entry_arguments &given = context.given.entry;
    const account owner = signed_in_account(context);
    const remote_place place = follow_path(tree_of(owner), given.path);
    if (given.parents && place.exists() && place.reached.is_folder()) {
        context.output.sentence("There is " + given.path + " already",
                                facts_of_created(place.reached, given.path, false));
        return;
    }
    if (!given.parents || place.exists())
        folder_for_new(place, given.path);
    const remote_entry made = create_all(owner, place, given.time);
    context.output.sentence("Created " + given.path, facts_of_created(made, given.path, true));
}

void run_create(command_context &context)
{
    const entry_arguments &given = context.given.entry;
    const account owner = signed_in_account(context);
    const remote_place place = follow_path(tree_of(owner), given.path);
    const remote_entry &folder = folder_for_new(place, given.path);
    if (place.folder_meant)
        throw failure(exit_code::usage, given.path + " ends in a slash, which no file does",
                      "leave the slash out, or use mkdir for a folder");
    const remote_entry made = create_file_in(owner, folder, place.missing.front(), given.time);
    context.output.sentence("Created " + given.path, facts_of_created(made, given.path, true));
}

void run_rm(command_context &context)
{
    const entry_arguments &given = context.given.entry;
    const account owner = signed_in_account(context);
    const remote_entry entry = find_movable(tree_of(owner), given.path, "removed");
    if (entry.is_folder() && !given.recursive)
        throw failure(exit_code::usage, given.path + " is a folder",
                      "use --recursive to remove it with all that it holds");
    remove_entry(owner, entry);
    context.output.sentence("Removed " + given.path, {{"kind", "Kind", word_for(entry.kind)},
                                                      {"key", "Key", entry.key},
                                                      {"path", "Path", given.path}});
}

} // namespace quillmere::tools
