// Moving and copying within the account.

#include "commands.h"

#include <CLI/CLI.hpp>

#include "../account.h"
#include "../failure.h"
#include "../remote_changes.h"

namespace quillmere::tools {

namespace {

/** Where an entry goes. */
struct new_place {
    remote_entry folder;
    std::string name;
    std::string path;
};

// As everywhere: into what is a folder already, otherwise to a new name.
new_place choose_destination(const remote_tree &tree, const remote_entry &source,
                             const std::string &path)
{
    const remote_place place = follow_path(tree, path);
    if (place.exists()) {
        if (!place.reached.is_folder())
            throw failure(exit_code::refused, "there is " + path + " already",
                          "choose another name, or remove it first");
        return {place.reached, source.name, path_below(path, source.name)};
    }
    if (place.missing.size() > 1 || (place.folder_meant && !source.is_folder()))
        throw failure(exit_code::refused, "there is no folder " + place.missing.front(),
                      "create it with: quillmere mkdir -p");
    return {place.reached, place.missing.front(), path};
}

void declare_source_and_destination(CLI::App &options, transfer_arguments &transfer)
{
    options.add_option("SOURCE", transfer.source, "Folder or file")->required()->option_text(" ");
    options
        .add_option("DESTINATION", transfer.destination, "Folder to put it into, or its new path")
        ->required()
        ->option_text(" ");
}

void tell(command_context &context, const std::string &verb, const remote_entry &entry,
          const std::string &path)
{
    const std::string &source = context.given.transfer.source;
    context.output.sentence(verb + " " + source + " to " + path,
                            {{"kind", "Kind", word_for(entry.kind)},
                             {"key", "Key", entry.key},
                             {"source", "From", source},
                             {"path", "To", path}});
}

} // namespace

void declare_mv(CLI::App &options, arguments &given)
{
    declare_source_and_destination(options, given.transfer);
}

void declare_cp(CLI::App &options, arguments &given)
{
    declare_source_and_destination(options, given.transfer);
    options.add_flag("-r,--recursive", given.transfer.recursive,
                     "Copy a folder with all that it holds");
}

void run_mv(command_context &context)
{
    const transfer_arguments &given = context.given.transfer;
    const account owner = signed_in_account(context);
    const remote_tree tree = tree_of(owner);
    const remote_entry source = find_movable(tree, given.source, "moved");
    const new_place to = choose_destination(tree, source, given.destination);
    const bool same_folder = to.folder.key == source.parent_key;
    if (same_folder && to.name == source.name)
        throw failure(exit_code::refused, "there is " + to.path + " already",
                      "choose another name or another folder");
    std::string done;
    if (!same_folder) {
        move_into(owner, source, to.folder);
        done = "moved " + given.source + " under its old name";
    }
    if (to.name != source.name)
        after(done, [&] { rename_entry(owner, source, to.name); });
    tell(context, "Moved", source, to.path);
}

void run_cp(command_context &context)
{
    const transfer_arguments &given = context.given.transfer;
    const account owner = signed_in_account(context);
    const remote_tree tree = tree_of(owner);
    const remote_entry source = find_movable(tree, given.source, "copied");
    if (source.is_folder() && !given.recursive)
        throw failure(exit_code::usage, given.source + " is a folder",
                      "use --recursive to copy it with all that it holds");
    const new_place to = choose_destination(tree, source, given.destination);
    const remote_entry copy = copy_into(owner, source, to.folder);
    if (to.name != source.name)
        after("copied " + given.source + " under its old name",
              [&] { rename_entry(owner, copy, to.name); });
    tell(context, "Copied", copy, to.path);
}

} // namespace quillmere::tools
