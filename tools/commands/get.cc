// Files on their way from the account.

#include "commands.h"

#include <CLI/CLI.hpp>

#include "../failure.h"
#include "../text.h"
#include "../transfers/fetcher.h"
#include "../transfers/local_source.h"

namespace quillmere::tools {

namespace {

/** The last word is the destination, when there are several. */
struct get_words {
    std::vector<std::string> sources;
    std::string destination = ".";
};

get_words split_words(const get_arguments &given)
{
    get_words words = {given.words, "."};
    if (words.sources.size() > 1) {
        words.destination = words.sources.back();
        words.sources.pop_back();
    }
    return words;
}

/** Where the sources go: into a folder under their names, or to a name of its own. */
struct local_destination {
    local_folder folder;
    std::string new_name; ///< empty for the names that the sources have
};

local_destination choose_destination(const get_words &words)
{
    const std::string &path = words.destination;
    if (is_local_folder(path))
        return {local_folder(path), {}};
    if (words.sources.size() > 1)
        throw failure(exit_code::local_file, path + " is no folder",
                      "several sources need a folder that is there to go to");
    const std::size_t end = path.find_last_not_of('/') + 1;
    const std::size_t slash = path.substr(0, end).rfind('/');
    if (slash == std::string::npos)
        return {local_folder("."), path.substr(0, end)};
    return {local_folder(path.substr(0, slash + 1)), path.substr(slash + 1, end - slash - 1)};
}

class get_command {
public:
    get_command(command_context &context, const account &owner, const get_words &words)
        : given_(context.given.get), owner_(owner), tree_(tree_of(owner)),
          report_(given_.recursive || words.sources.size() > 1 ? batch::many : batch::one,
                  "downloaded"),
          fetcher_(owner, context.chosen(),
                   context.given.common.plain_http ? link_security::plain_too
                                                   : link_security::tls_alone,
                   progress_style_for(given_.quiet), report_)
    {
    }

    void get(const std::string &path, const local_destination &to)
    {
        const remote_entry entry = find_entry(tree_, path);
        if (entry.is_folder())
            return get_folder(entry, path, to);
        const remote_file file = remote_file_of(read_file(owner_, entry.key).get());
        fetcher_.get_file(file, path, to.folder, to.new_name.empty() ? file.name : to.new_name);
    }

    void get_all(const get_words &words, const local_destination &to)
    {
        for (const std::string &each : words.sources)
            report_.attempt([&] { get(each, to); });
    }

    void tell(results &output) const
    {
        report_.require_success();
        report_.tell(output);
    }

private:
    // The root has no name of its own: what it holds goes straight into the destination.
    void get_folder(const remote_entry &entry, const std::string &path, const local_destination &to)
    {
        if (!given_.recursive)
            throw failure(exit_code::usage, path + " is a folder",
                          "use --recursive to download it with all that it holds");
        if (entry.is_root() && to.new_name.empty())
            return fetcher_.get_folder(entry, path, to.folder);
        fetcher_.get_folder(entry, path,
                            to.folder.enter(to.new_name.empty() ? entry.name : to.new_name));
    }

    const get_arguments &given_;
    const account &owner_;
    remote_tree tree_;
    transfer_report report_;
    fetcher fetcher_;
};

} // namespace

void declare_get(CLI::App &options, arguments &given)
{
    options
        .add_option("SOURCE... [DESTINATION]", given.get.words,
                    "Files to download, and the folder to put them into or the path to give the "
                    "only one; the working folder unless given")
        ->required()
        ->take_all()
        ->option_text(" ");
    options.add_flag("-r,--recursive", given.get.recursive,
                     "Download folders with all that they hold");
    options.add_flag("-q,--quiet", given.get.quiet, "Show no progress");
}

void run_get(command_context &context)
{
    const get_words words = split_words(context.given.get);
    const local_destination to = choose_destination(words);
    const account owner = signed_in_account(context);
    get_command command(context, owner, words);
    command.get_all(words, to);
    command.tell(context.output);
}

} // namespace quillmere::tools
