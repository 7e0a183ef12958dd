// Proves what starts programs, catches output and counts resources.
#include <dirent.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <unistd.h>

#include <cstdio>
#include <iostream>
#include <memory>
#include <thread>

#include "support/process.h"
#include "support/resources.h"
#include "support/stdout_capture.h"
#include "support/temporary_folder.h"

namespace quillmere_test {
namespace {

command shell(const std::string &script)
{
    command what;
    what.program = "sh";
    what.arguments = {"-c", script};
    return what;
}

TEST(Process, GivesStatusAndBothOutputs)
{
    outcome done = run(shell("echo out; echo err >&2; exit 7"));

    EXPECT_EQ(done.exit_status, 7);
    EXPECT_EQ(done.signal, std::nullopt);
    EXPECT_FALSE(done.timed_out);
    EXPECT_EQ(done.out, "out\n");
    EXPECT_EQ(done.err, "err\n");
}

TEST(Process, PassesInputEnvironmentAndFolder)
{
    temporary_folder folder;
    command what = shell("cat; echo \"$QM_ADDED\"; echo \"${HOME-none}\"; pwd");
    what.input = "input\n";
    what.environment = {{"QM_ADDED", "added"}, {"HOME", std::nullopt}};
    what.folder = folder.path();

    EXPECT_EQ(run(what).out, "input\nadded\nnone\n" + folder.path() + "\n");
}

TEST(Process, TakesMoreOutputThanAPipeHolds)
{
    outcome done = run(shell("head -c 300000 /dev/zero; head -c 300000 /dev/zero >&2"));

    EXPECT_EQ(done.out.size(), 300000u);
    EXPECT_EQ(done.err.size(), 300000u);
}

TEST(Process, TellsTheSignalThatEndedIt)
{
    outcome done = run(shell("kill -9 $$"));

    EXPECT_EQ(done.exit_status, std::nullopt);
    EXPECT_EQ(done.signal, SIGKILL);
    EXPECT_FALSE(done.timed_out);
}

TEST(Process, IsKilledAtItsDeadline)
{
    outcome done =
        run(shell("echo started; exec tail -f /dev/null"), std::chrono::milliseconds(500));

    EXPECT_TRUE(done.timed_out);
    EXPECT_EQ(done.signal, SIGKILL);
}

// 127 is what a shell says of it, and what is left of the failure under valgrind.
int status_of_missing_program()
{
    command what;
    what.program = "/nonexistent/program";
    try {
        return run(what).exit_status.value_or(-1);
    } catch (const std::system_error &failure) {
        return failure.code() == std::errc::no_such_file_or_directory ? 127 : -1;
    }
}

TEST(Process, FailsToStartWhatDoesNotExist) { EXPECT_EQ(status_of_missing_program(), 127); }

TEST(Process, WaitsForALineAndEndsOnRequest)
{
    process program(shell("trap 'echo ended; exit 3' TERM; echo ready at 42 >/dev/fd/3; "
                          "tail -f /dev/null & wait; kill $!"));

    EXPECT_EQ(program.wait_for_line(channel::report, "ready"), "ready at 42");
    outcome done = program.terminate();

    EXPECT_EQ(done.exit_status, 3);
    EXPECT_EQ(done.out, "ended\n");
    EXPECT_EQ(done.report, "ready at 42\n");
}

TEST(Process, FailsTheWaitForALineThatNeverComes)
{
    process program(shell("echo something else"));

    EXPECT_THROW(program.wait_for_line(channel::out, "wanted"), std::runtime_error);
}

TEST(Process, EndsWithItsObject)
{
    auto program = std::make_unique<process>(shell("echo up; exec tail -f /dev/null"));
    program->wait_for_line(channel::out, "up");
    pid_t pid = program->pid();
    ASSERT_EQ(::kill(pid, 0), 0);

    program.reset();

    EXPECT_NE(::kill(pid, 0), 0);
}

TEST(Process, StartsWithDefaultSignals)
{
    // A shell cannot be killed by a signal that it was started to ignore.
    struct sigaction ignore = {};
    ignore.sa_handler = SIG_IGN;
    struct sigaction before = {};
    sigaction(SIGPIPE, &ignore, &before);

    outcome done = run(shell("kill -PIPE $$; echo survived"));

    sigaction(SIGPIPE, &before, nullptr);
    EXPECT_EQ(done.signal, SIGPIPE);
}

TEST(StdoutCapture, CatchesEveryWayOfWriting)
{
    std::string text;
    {
        stdout_capture capture;
        std::printf("stdio ");
        EXPECT_EQ(capture.text(), "stdio ");
        std::cout << "stream ";
        std::cout.flush();
        EXPECT_EQ(::write(STDOUT_FILENO, "descriptor", 10), 10);
        text = capture.text();
    }

    EXPECT_EQ(text, "stdio stream descriptor");
}

TEST(StdoutCapture, PutsStandardOutputBack)
{
    stdout_capture outer;
    {
        stdout_capture inner;
        std::printf("inner");
    }

    std::printf("outer");

    EXPECT_EQ(outer.text(), "outer");
}

TEST(Resources, CountExactlyTheOpenDescriptors)
{
    DIR *folder = opendir("/proc/self/fd");
    ASSERT_NE(folder, nullptr);
    std::string own = std::to_string(dirfd(folder));
    size_t open = 0;
    while (const dirent *entry = readdir(folder))
        if (entry->d_name[0] != '.' && entry->d_name != own)
            ++open;
    closedir(folder);

    EXPECT_EQ(open_descriptors(), open);
    EXPECT_EQ(open_descriptors(::getpid()), open);
}

TEST(Resources, CountWhatIsOpened)
{
    // The first thread of a process may bring another of a sanitizer's with it.
    std::thread([] {}).join();
    size_t descriptors = open_descriptors();
    size_t threads_before = threads();
    descriptor one(::dup(0));
    process other(shell("echo up; exec tail -f /dev/null"));
    other.wait_for_line(channel::out, "up");

    // Here there is one more that watches over the other program.
    std::thread([&] { EXPECT_EQ(threads(), threads_before + 2); }).join();
    EXPECT_EQ(threads(), threads_before + 1);

    // The process has three pipes and the descriptor that tells its end.
    EXPECT_EQ(open_descriptors(), descriptors + 5);
    EXPECT_GT(resident_bytes(), 500'000u);
    EXPECT_GE(peak_resident_bytes(), resident_bytes());
    EXPECT_GE(open_descriptors(other.pid()), 4u);
    EXPECT_EQ(threads(other.pid()), 1u);
    EXPECT_GT(resident_bytes(other.pid()), 0u);
}

TEST(TemporaryFolder, VanishesWithItsFilesButNotInAChild)
{
    std::string path;
    {
        temporary_folder folder;
        path = folder.write("file", "content");
        EXPECT_EXIT(
            {
                folder.~temporary_folder();
                std::_Exit(0);
            },
            testing::ExitedWithCode(0), "");
        EXPECT_EQ(content_of(path), "content");
    }

    EXPECT_NE(::access(path.c_str(), F_OK), 0);
}

} // namespace
} // namespace quillmere_test
