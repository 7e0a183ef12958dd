// The one log function: where it writes, what it adds (nothing) and when it flushes (always).
#include <gtest/gtest.h>

#include <stdio.h>
#include <stdio_ext.h>
#include <unistd.h>

#include <memory>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "quillmere.h"
#include "support/globals_guard.h"
#include "support/log_capture.h"
#include "support/stdout_capture.h"
#include "support/temporary_folder.h"

namespace quillmere_test {
namespace {

struct file_closer {
    void operator()(std::FILE *file) const { std::fclose(file); }
};
using open_file = std::unique_ptr<std::FILE, file_closer>;

open_file opened(const std::string &path, const char *mode)
{
    return open_file(std::fopen(path.c_str(), mode));
}

class Log : public testing::Test {
protected:
    globals_guard globals;
};

TEST_F(Log, IsFormattedByTheRulesOfPrintf)
{
    log_capture log;

    qm_printf("%s|%5d|%-4x|%lu|%%|%c|%.3s", "text", -12, 255u, 18446744073709551615ul, 'c',
              "shortened");

    EXPECT_EQ(log.text(), "text|  -12|ff  |18446744073709551615|%|c|sho");
}

TEST_F(Log, GetsNothingThatIsNotInTheMessage)
{
    log_capture log;

    qm_printf("one");
    qm_printf("two\n");
    qm_printf("three");

    EXPECT_EQ(log.text(), "onetwo\nthree");
}

TEST_F(Log, TakesAnEmptyMessage)
{
    log_capture log;

    int32_t result = qm_printf("%s", "");

    EXPECT_EQ(result, 0);
    EXPECT_EQ(log.text(), "");
}

TEST_F(Log, TakesALongMessageWhole)
{
    log_capture log;
    std::string text(1 << 20, 'x');

    qm_printf("<%s>", text.c_str());

    EXPECT_EQ(log.text(), "<" + text + ">");
}

TEST_F(Log, GoesToTheStreamThatWasSet)
{
    temporary_folder folder;
    open_file first = opened(folder.path_of("first"), "w");
    open_file second = opened(folder.path_of("second"), "w");

    set_quillmere_output_file(first.get());
    qm_printf("to the first");
    set_output_file(second.get());
    qm_printf("to the second");

    EXPECT_EQ(output_file, second.get());
    EXPECT_EQ(content_of(folder.path_of("first")), "to the first");
    EXPECT_EQ(content_of(folder.path_of("second")), "to the second");
}

TEST_F(Log, GoesToTheStreamThatWasWrittenToTheVariable)
{
    temporary_folder folder;
    open_file file = opened(folder.path_of("log"), "w");

    output_file = file.get();
    qm_printf("message");

    EXPECT_EQ(content_of(folder.path_of("log")), "message");
}

TEST_F(Log, IsFlushedAfterEveryMessage)
{
    temporary_folder folder;
    open_file file = opened(folder.path_of("log"), "w");
    set_quillmere_output_file(file.get());

    int32_t result = qm_printf("without a line end");

    EXPECT_EQ(result, 0);
    EXPECT_EQ(__fpending(file.get()), 0u);
    EXPECT_EQ(content_of(folder.path_of("log")), "without a line end");
}

TEST_F(Log, LeavesTheStreamOpen)
{
    temporary_folder folder;
    open_file file = opened(folder.path_of("log"), "w");
    set_quillmere_output_file(file.get());
    qm_printf("message, ");

    set_quillmere_output_file(nullptr);
    std::fputs("and more", file.get());
    std::fflush(file.get());

    EXPECT_EQ(content_of(folder.path_of("log")), "message, and more");
}

TEST_F(Log, GoesToStandardOutputAtOnceIfNoStreamIsSet)
{
    output_file = nullptr;
    stdout_capture out;

    int32_t result = qm_printf("without a line end");
    size_t pending = __fpending(stdout);

    EXPECT_EQ(result, 0);
    EXPECT_EQ(pending, 0u);
    EXPECT_EQ(out.text(), "without a line end");
}

TEST_F(Log, GoesToStandardOutputAtOnceAfterTheStreamIsTakenAway)
{
    set_quillmere_output_file(stderr);
    stdout_capture out;

    set_quillmere_output_file(nullptr);
    qm_printf("without a line end");
    size_t pending = __fpending(stdout);

    EXPECT_EQ(pending, 0u);
    EXPECT_EQ(out.text(), "without a line end");
}

TEST_F(Log, StaysOffStandardOutputIfAStreamIsSet)
{
    log_capture log;
    stdout_capture out;

    qm_printf("message");

    EXPECT_EQ(out.text(), "");
}

TEST_F(Log, SaysWhenTheStreamIsFull)
{
    open_file full = opened("/dev/full", "w");
    ASSERT_TRUE(full);
    set_quillmere_output_file(full.get());

    int32_t result = qm_printf("message\n");

    EXPECT_EQ(result, EOF);
}

TEST_F(Log, SaysWhenTheStreamsDescriptorIsClosed)
{
    temporary_folder folder;
    open_file file = opened(folder.path_of("log"), "w");
    ASSERT_TRUE(file);
    set_quillmere_output_file(file.get());
    ASSERT_EQ(::close(fileno(file.get())), 0);

    int32_t result = qm_printf("message\n");

    EXPECT_EQ(result, EOF);
}

TEST_F(Log, RecoversWhenAStreamThatWorksIsSet)
{
    open_file full = opened("/dev/full", "w");
    set_quillmere_output_file(full.get());
    qm_printf("lost");
    log_capture log;

    int32_t result = qm_printf("kept");

    EXPECT_EQ(result, 0);
    EXPECT_EQ(log.text(), "kept");
}

TEST_F(Log, KeepsMessagesOfSeveralThreadsWhole)
{
    constexpr int thread_count = 8;
    constexpr int messages = 500;
    // A file rather than memory: where a memory stream grows, the thread sanitizer does not see the
    // lock that the C library holds.
    temporary_folder folder;
    open_file file = opened(folder.path_of("log"), "w");
    set_quillmere_output_file(file.get());
    const std::string text(200, 'x');

    std::vector<std::thread> threads;
    for (int number = 0; number < thread_count; ++number)
        threads.emplace_back([&text, number] {
            for (int message = 0; message < messages; ++message)
                qm_printf("%d %s %d\n", number, text.c_str(), message);
        });
    for (std::thread &thread : threads)
        thread.join();

    std::vector<int> next(thread_count, 0);
    std::istringstream lines(content_of(folder.path_of("log")));
    for (std::string line; std::getline(lines, line);) {
        int number = line.at(0) - '0';
        ASSERT_EQ(line, std::to_string(number) + " " + text + " " +
                            std::to_string(next.at(static_cast<size_t>(number))++));
    }
    EXPECT_EQ(next, std::vector<int>(thread_count, messages));
}

} // namespace
} // namespace quillmere_test
