// Completion of what is typed in a shell: the script for it, and the answers that the script asks
// for while a person types.

#include "commands.h"

#include <CLI/CLI.hpp>
#include <fcntl.h>

#include "../account.h"
#include "../completion/scripts.h"
#include "../failure.h"
#include "../private_file.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

struct shell {
    const char *name;
    std::string (*script)(const program_shape &program);
};
constexpr shell shells[] = {
    {"bash", bash_completion}, {"zsh", zsh_completion}, {"fish", fish_completion}};

std::vector<std::string> shell_names()
{
    std::vector<std::string> names;
    for (const shell &each : shells)
        names.emplace_back(each.name);
    return names;
}

/** A word as far as it is typed: the folder that is complete, and the beginning of a name in it. */
struct typed_path {
    std::string folder; ///< with its slash at the end, or empty
    std::string name;
};

typed_path split_typed(const std::string &word)
{
    const std::size_t slash = word.rfind('/');
    if (slash == std::string::npos)
        return {{}, word};
    return {word.substr(0, slash + 1), word.substr(slash + 1)};
}

// A word that would be taken for several, for an option or for a key is better not offered.
bool may_be_offered(const std::string &word)
{
    const bool keys = starts_with(word, "key:") && word.find('/') == std::string::npos;
    return escape_controls(word) == word && !starts_with(word, "-") && !keys;
}

std::vector<std::string> remote_words(command_context &context)
{
    const typed_path typed = split_typed(context.given.complete.prefix);
    const account owner = signed_in_account(context);
    const remote_tree tree = tree_of(owner);
    const remote_entry folder = find_folder(tree, typed.folder.empty() ? "/" : typed.folder);
    std::vector<std::string> words;
    for (const entry_kind kind : {entry_kind::folder, entry_kind::file})
        for (const remote_entry &each : tree.list(folder, kind)) {
            const std::string word = typed.folder + each.name;
            if (starts_with(each.name, typed.name) && may_be_offered(word))
                words.push_back(word + (each.is_folder() ? "/" : ""));
        }
    return words;
}

std::vector<std::string> profile_words(command_context &context)
{
    const std::string path = configuration_path(context.surroundings);
    std::vector<std::string> words;
    for (const std::string &each : profile_names(read_small_file(path, "the configuration file")))
        if (starts_with(each, context.given.complete.prefix) && may_be_offered(each))
            words.push_back(each);
    return words;
}

// Whoever types is not to be disturbed: what is said on the way must not appear in their line.
void become_silent()
{
    const descriptor nowhere(::open("/dev/null", O_WRONLY | O_CLOEXEC));
    if (nowhere)
        ::dup2(nowhere.number(), STDERR_FILENO);
}

} // namespace

void declare_completion(CLI::App &options, arguments &given)
{
    options.add_option("SHELL", given.completion.shell, "bash, zsh or fish")
        ->required()
        ->option_text(" ")
        ->check(CLI::IsMember(shell_names()));
}

void declare_complete(CLI::App &options, arguments &given)
{
    options.add_option("WHAT", given.complete.what, "remote or profile")
        ->required()
        ->check(CLI::IsMember({"remote", "profile"}));
    options.add_option("PREFIX", given.complete.prefix, "The word so far");
}

void run_completion(command_context &context)
{
    for (const shell &each : shells)
        if (context.given.completion.shell == each.name)
            context.output.write(each.script(shape_of_program()));
}

void run_complete(command_context &context)
{
    become_silent();
    try {
        const bool remote = context.given.complete.what == "remote";
        for (const std::string &each : remote ? remote_words(context) : profile_words(context))
            context.output.write(each + "\n");
    } catch (const failure &problem) {
        throw told_failure{problem.code};
    }
}

} // namespace quillmere::tools
