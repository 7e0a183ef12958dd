#include "mirroring.h"

#include "inspection.h"

namespace quillmere::tools {

namespace {

constexpr int rounds_after_failures = 5;

std::set<std::string> unlisted_folders(const known_account &account)
{
    std::set<std::string> keys;
    for (const auto &[key, entry] : account.entries)
        if (entry.is_folder() && !entry.listed)
            keys.insert(key);
    return keys;
}

} // namespace

mirroring::mirroring(const account &owner, const std::string &root, const local_copy &copy,
                     linked_content &contents, mirror_report &report)
    : copy_(copy), contents_(contents), report_(report), state_(loaded_state(copy, root)),
      reader_(owner, [this] { keep(); })
{
    // What the last run was about to do, and may have done, shows only beside what it knew then.
    inspect(copy_, lay_out(state_.account), state_.here);
    keep();
}

mirror_state mirroring::loaded_state(const local_copy &copy, const std::string &root)
{
    mirror_state state;
    if (copy.is_begun())
        state = load_state(copy.own().number()).value_or(mirror_state());
    if (!state.account.root.empty() && state.account.root != root)
        throw failure(exit_code::usage,
                      copy.top().path() +
                          " is a mirror of another folder, key:" + state.account.root,
                      "give a folder of its own to each mirror");
    state.account.root = root;
    return state;
}

bool mirroring::run()
{
    learn();
    agree();
    for (int round = 1; report_.failures() > 0 && round < rounds_after_failures; ++round) {
        if (!learn())
            break;
        agree();
    }
    return true;
}

bool mirroring::run_if_new()
{
    if (!learn() && !behind_)
        return false;
    agree();
    return true;
}

void mirroring::foresee()
{
    learn();
    agree();
}

bool mirroring::learn()
{
    try {
        const bool any = reader_.update(state_.account);
        behind_ = behind_ || any;
        return any;
    } catch (const failure &) {
        behind_ = true;
        // What was learned until then needs not be learned again.
        if (state_.account.entries.count(state_.account.root) != 0)
            keep();
        throw;
    }
}

void mirroring::agree()
{
    report_.begin_round();
    const layout wanted = lay_out(state_.account);
    inspect(copy_, wanted, state_.here);
    keep(); // ahead of the first change: only so can the next run tell what this one did
    report_.leave_out(wanted.left_out);
    for (const auto &[key, refusal] : reader_.refusals())
        report_.count_failure(refusal);
    const plan steps = make_plan(wanted, state_.here, unlisted_folders(state_.account));
    applier(*disk_to_change(), state_.here, report_, [this] { keep(); }).apply(steps, wanted);
    behind_ = report_.failures() > 0;
    if (!behind_ && copy_.may_be_changed())
        copy_.clear_downloads();
}

std::unique_ptr<disk> mirroring::disk_to_change() const
{
    const std::string &root = state_.account.root;
    if (copy_.may_be_changed())
        return std::make_unique<real_disk>(copy_, root, state_.here, contents_);
    return std::make_unique<imagined_disk>(copy_, root, state_.here);
}

void mirroring::keep()
{
    if (copy_.may_be_changed())
        save_state(copy_.own().number(), state_);
}

} // namespace quillmere::tools
