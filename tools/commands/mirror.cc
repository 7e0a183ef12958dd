// A local copy of a folder of the account, which follows its changes.

#include "commands.h"

#include <algorithm>
#include <thread>

#include <CLI/CLI.hpp>

#include "../console.h"
#include "../failure.h"
#include "../mirror/mirroring.h"

namespace quillmere::tools {

namespace {

// A listing does not say whose root it is, while the feed calls it by its key.
std::string key_of(const account &owner, const remote_entry &folder)
{
    if (!folder.is_root())
        return folder.key;
    const folder_info_owner root = read_folder(owner, nullptr);
    const char *const key = folder_info_get_folderkey(root.get());
    if (key == nullptr || !is_key(key))
        throw failure(exit_code::unreadable_answer, "the service does not tell the root's key");
    return key;
}

bool may_pass(const failure &problem)
{
    return problem.code == exit_code::network || problem.code == exit_code::bad_http_answer ||
           problem.code == exit_code::unreadable_answer || problem.code == exit_code::partly_done;
}

/** Waits from one look at the account to the next: longer after failures, so that a service in
 * trouble is left alone. */
class follower {
public:
    explicit follower(std::chrono::seconds interval) : interval_(interval), world_(real_world()) {}

    void wait() const { world_.sleep(std::max<pause_length>(interval_, pause_)); }
    void succeeded()
    {
        failures_ = 0;
        pause_ = pause_length(0);
    }
    void failed(const failure &problem)
    {
        pause_ = pause_before(failures_++, world_.chance());
        note(problem.why + (problem.advice.empty() ? "" : " (" + problem.advice + ")"));
    }

private:
    std::chrono::seconds interval_;
    retry_world world_;
    int failures_ = 0;
    pause_length pause_{0};
};

[[noreturn]] void follow(mirroring &mirror, mirror_report &report, const mirror_arguments &given,
                         results &output)
{
    follower pace{std::chrono::seconds(given.interval)};
    for (bool first = true;; first = false) {
        if (!first)
            pace.wait();
        bool done = false;
        try {
            done = first ? mirror.run() : mirror.run_if_new();
            pace.succeeded();
        } catch (const failure &problem) {
            if (!may_pass(problem))
                throw;
            pace.failed(problem);
        }
        if (done)
            report.note_incomplete();
        if ((done && first) || !report.is_empty())
            report.tell(output, mirror.known());
    }
}

} // namespace

void declare_mirror(CLI::App &options, arguments &given)
{
    mirror_arguments &mirror = given.mirror;
    options.add_option("REMOTE", mirror.remote, "Folder of the account")
        ->required()
        ->option_text(" ");
    options.add_option("LOCAL", mirror.local, "Folder to keep the copy in; made if it is missing")
        ->required()
        ->option_text(" ");
    auto *const follow =
        options.add_flag("--follow", mirror.follow, "Go on, and do what changes in the account");
    options.add_flag("-n,--dry-run", mirror.dry_run, "Tell what would be done, and do nothing")
        ->excludes(follow);
    options
        .add_option("--interval", mirror.interval,
                    "Time from one look for changes to the next; 30 unless given")
        ->option_text("SECONDS")
        ->check(CLI::Range(1, 86400))
        ->needs(follow);
    options.add_flag("-q,--quiet", mirror.quiet, "Show no progress");
}

void run_mirror(command_context &context)
{
    const mirror_arguments &given = context.given.mirror;
    const account owner = signed_in_account(context);
    const std::string root = key_of(owner, find_folder(tree_of(owner), given.remote));
    const local_copy copy =
        given.dry_run ? local_copy::to_look_at(given.local) : local_copy(given.local);
    linked_content contents(owner, context.chosen(),
                            context.given.common.plain_http ? link_security::plain_too
                                                            : link_security::tls_alone,
                            progress_style_for(given.quiet));
    mirror_report report(given.remote, given.local,
                         given.dry_run ? mirror_tense::foreseen : mirror_tense::done);
    mirroring mirror(owner, root, copy, contents, report);
    if (given.follow)
        follow(mirror, report, given, context.output);
    if (given.dry_run)
        mirror.foresee();
    else
        mirror.run();
    report.require_success();
    report.tell(context.output, mirror.known());
}

} // namespace quillmere::tools
