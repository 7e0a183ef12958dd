#include "support/failing_files.h"

namespace quillmere_test {
namespace {

// The script finds the program and its arguments in "$@", behind as many values as it shifts away.
command in_script(const command &what, const std::string &script,
                  const std::vector<std::string> &values = {})
{
    command wrapped = what;
    wrapped.program = "sh";
    wrapped.arguments = {"-c", script, "sh"};
    for (const auto &more : {values, {what.program}, what.arguments})
        wrapped.arguments.insert(wrapped.arguments.end(), more.begin(), more.end());
    return wrapped;
}

// With mounts that nobody else sees, and that end with it.
command with_own_mounts(const command &what)
{
    command wrapped = what;
    wrapped.program = "unshare";
    wrapped.arguments = {"--user", "--map-root-user", "--mount", what.program};
    wrapped.arguments.insert(wrapped.arguments.end(), what.arguments.begin(), what.arguments.end());
    return wrapped;
}

} // namespace

command with_longest_file(const command &what, size_t kibibytes)
{
    // The shell counts in blocks of 512 bytes. The signal that comes with the limit would kill.
    return in_script(what, "trap '' XFSZ; ulimit -f \"$1\"; shift; exec \"$@\"",
                     {std::to_string(2 * kibibytes)});
}

command with_full_folder(const command &what, const std::string &folder, size_t free_kibibytes)
{
    return with_own_mounts(in_script(what,
                                     "set -e; folder=$1 room=$2; shift 2\n"
                                     "mkdir \"$folder.after\"\n"
                                     "cp -a \"$folder/.\" \"$folder.after\"\n"
                                     "mount -t tmpfs -o size=2m,mode=700 none \"$folder\"\n"
                                     "cp -a \"$folder.after/.\" \"$folder\"\n"
                                     "cat /dev/zero >\"$folder/filler\" 2>&- || true\n"
                                     "truncate -s \"-$room\" \"$folder/filler\"\n"
                                     "set +e; \"$@\"; status=$?; set -e\n"
                                     "rm -r \"$folder/filler\" \"$folder.after\"\n"
                                     "cp -a \"$folder\" \"$folder.after\"\n"
                                     "exit $status",
                                     {folder, std::to_string(free_kibibytes) + "K"}));
}

command with_read_only_folder(const command &what, const std::string &folder)
{
    return with_own_mounts(in_script(what,
                                     "set -e; mount --bind \"$1\" \"$1\"\n"
                                     "mount -o remount,bind,ro \"$1\"; shift; exec \"$@\"",
                                     {folder}));
}

command with_closed_pipe(const command &what)
{
    // A pipe with a name, since that can be opened for reading, for writing, and closed for
    // reading.
    return in_script(what, "pipe=$(mktemp -u); mkfifo \"$pipe\"; exec 4<>\"$pipe\" 5>\"$pipe\"\n"
                           "rm \"$pipe\"; exec 4<&-; exec \"$@\" >&5 5>&-");
}

command with_full_output(const command &what) { return in_script(what, "exec \"$@\" >/dev/full"); }

bool may_have_disks()
{
    command nothing;
    nothing.program = "true";
    return run(with_own_mounts(nothing)).exit_status == 0;
}

} // namespace quillmere_test
