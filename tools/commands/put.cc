// Files on their way to the account.

#include "commands.h"

#include <CLI/CLI.hpp>

#include "../failure.h"
#include "../transfers/uploader.h"

namespace quillmere::tools {

namespace {

constexpr const char *standard_input = "-";

/** The last word is the destination, when there are several. */
struct put_words {
    std::vector<std::string> sources;
    std::string destination = "/";
};

put_words split_sources(const put_arguments &given)
{
    put_words words = {given.words, "/"};
    if (words.sources.size() > 1) {
        words.destination = words.sources.back();
        words.sources.pop_back();
    }
    return words;
}

void check(const put_words &words, bool recursive)
{
    for (const std::string &source : words.sources) {
        if (source == standard_input && words.sources.size() > 1)
            throw failure(exit_code::usage, "standard input cannot be uploaded beside others",
                          "upload it by itself");
        if (is_local_folder(source) && !recursive)
            throw failure(exit_code::usage, source + " is a folder",
                          "use --recursive to upload it with all that it holds");
    }
}

/** Where the sources go: into a folder under their names, or to a name of their own. */
struct put_destination {
    remote_place place;
    std::string path;

    bool is_folder() const { return place.exists() && place.reached.is_folder(); }
};

put_destination choose_destination(const account &owner, const put_words &words)
{
    const std::string &path = words.destination;
    put_destination chosen = {follow_path(tree_of(owner), path), path};
    if (chosen.is_folder())
        return chosen;
    const bool folder_alone = words.sources.size() == 1 && is_local_folder(words.sources.front());
    if (words.sources.size() > 1 || (folder_alone && chosen.place.exists()))
        throw failure(exit_code::refused, path + " is no folder",
                      "name a folder, or create it with: quillmere mkdir -p");
    if (chosen.place.missing.size() > 1 || (chosen.place.folder_meant && !folder_alone))
        throw failure(exit_code::refused,
                      "there is no folder " + chosen.place.missing.front() + " on the way to " +
                          path,
                      "create it with: quillmere mkdir -p");
    return chosen;
}

std::string folder_part_of(const std::string &path)
{
    std::size_t end = path.find_last_not_of('/');
    end = end == std::string::npos ? end : path.find_last_of('/', end);
    return end == std::string::npos ? "" : path.substr(0, end);
}

/** A command that is under way. */
class put_command {
public:
    put_command(command_context &context, const account &owner, batch kind)
        : owner_(owner), uploader_(owner, context.chosen(), context.given.put.quiet),
          report_(kind, "uploaded")
    {
    }

    void put(const std::string &source, const put_destination &to)
    {
        if (to.place.exists() && !to.is_folder()) {
            const remote_file target =
                remote_file_of(read_file(owner_, to.place.reached.key).get());
            report_.add(uploader_.revise(opened(source), target, to.path));
            return;
        }
        const std::string name = to.is_folder() ? name_for(source) : to.place.missing.front();
        remote_folder into(owner_, to.place.reached,
                           to.is_folder() ? to.path : folder_part_of(to.path));
        report_.attempt([&] { put_entry(source, into, name); });
    }

    void tell(results &output) const
    {
        report_.require_success();
        report_.tell(output);
    }

private:
    static local_source opened(const std::string &source)
    {
        return source == standard_input ? take_standard_input() : open_source(source);
    }

    static std::string name_for(const std::string &source)
    {
        if (source == standard_input)
            throw failure(exit_code::usage, "standard input has no name",
                          "name the file as the destination");
        return name_of_source(source);
    }

    void put_entry(const std::string &source, remote_folder &into, const std::string &name)
    {
        if (is_local_folder(source))
            return put_folder(source, into.enter(name));
        report_.add(uploader_.put(opened(source), into, name));
    }

    void put_folder(const std::string &source, remote_folder into)
    {
        for (const std::string &name : names_in_folder(source)) {
            const std::string inner = path_below(source, name);
            report_.attempt([&] {
                if (is_link(inner))
                    throw failure(exit_code::local_file, inner + " is a link, which is left out",
                                  "name what it leads to as a source of its own");
                put_entry(inner, into, name);
            });
        }
    }

    const account &owner_;
    uploader uploader_;
    transfer_report report_;
};

} // namespace

void declare_put(CLI::App &options, arguments &given)
{
    options
        .add_option("SOURCE... [DESTINATION]", given.put.words,
                    "Files to upload (- for standard input), and the folder to put them into or "
                    "the path to give the only one; the root unless given")
        ->required()
        ->take_all()
        ->option_text(" ");
    options.add_flag("-r,--recursive", given.put.recursive,
                     "Upload folders with all that they hold");
    options.add_flag("-q,--quiet", given.put.quiet, "Show no progress");
}

void declare_update(CLI::App &options, arguments &given)
{
    options.add_option("SOURCE", given.update.source, "File to upload; - for standard input")
        ->required()
        ->option_text(" ");
    options.add_option("PATH", given.update.path, "File that gets a new revision")
        ->required()
        ->option_text(" ");
    options.add_flag("-q,--quiet", given.update.quiet, "Show no progress");
}

void run_put(command_context &context)
{
    const put_arguments &given = context.given.put;
    const put_words words = split_sources(given);
    check(words, given.recursive);
    const account owner = signed_in_account(context);
    put_command command(context, owner,
                        given.recursive || words.sources.size() > 1 ? batch::many : batch::one);
    const put_destination to = choose_destination(owner, words);
    for (const std::string &source : words.sources)
        command.put(source, to);
    command.tell(context.output);
}

void run_update(command_context &context)
{
    const update_arguments &given = context.given.update;
    const account owner = signed_in_account(context);
    uploader uploads(owner, context.chosen(), given.quiet);
    const remote_entry target = find_file(tree_of(owner), given.path);
    const local_source source =
        given.source == standard_input ? take_standard_input() : open_source(given.source);
    transfer_report report(batch::one, "uploaded");
    report.add(
        uploads.revise(source, remote_file_of(read_file(owner, target.key).get()), given.path));
    report.tell(context.output);
}

} // namespace quillmere::tools
