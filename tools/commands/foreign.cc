// Folders of other accounts in this one.

#include "commands.h"

#include <CLI/CLI.hpp>

#include "../account.h"
#include "../failure.h"

namespace quillmere::tools {

namespace {

void tell(command_context &context, const std::string &verb, const std::string &key)
{
    const std::string &path = context.given.entry.path;
    context.output.sentence(verb + " " + path, {{"key", "Key", key}, {"path", "Path", path}});
}

} // namespace

void declare_attach(CLI::App &options, arguments &given)
{
    options.add_option("FOLDER", given.entry.path, "The other account's folder, as key:KEY")
        ->required()
        ->option_text(" ");
}

void declare_detach(CLI::App &options, arguments &given)
{
    options.add_option("FOLDER", given.entry.path, "The folder, by its path or as key:KEY")
        ->required()
        ->option_text(" ");
}

void run_attach(command_context &context)
{
    const auto key = key_in(context.given.entry.path);
    if (!key)
        throw failure(exit_code::usage, "a folder of another account has no path here",
                      "name it as key:KEY");
    const account owner = signed_in_account(context);
    owner.remote.once("attaching the folder", [&](char **error_message) {
        return attach_foreign_folder(owner.session(), key->c_str(), error_message);
    });
    tell(context, "Attached", *key);
}

void run_detach(command_context &context)
{
    const std::string &path = context.given.entry.path;
    const auto given_key = key_in(path);
    const account owner = signed_in_account(context);
    const std::string key = given_key ? *given_key : find_folder(tree_of(owner), path).key;
    owner.remote.once("detaching the folder", [&](char **error_message) {
        return detach_foreign_folder(owner.session(), key.c_str(), error_message);
    });
    tell(context, "Detached", key);
}

} // namespace quillmere::tools
