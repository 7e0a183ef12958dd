// What a person sees of a transfer at a terminal, and what Ctrl-C leaves of it.
#include <filesystem>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "fake_download.h"
#include "terminal.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;
using testing::MatchesRegex;
using testing::Not;

class ProgressBar : public fake_download {
protected:
    terminal_program get(std::vector<std::string> more = {})
    {
        more.insert(more.begin(), {"get", "key:k", into, "--retries", "0"});
        return terminal_program(home.with(more));
    }
};

TEST_F(ProgressBar, EndsInASummary)
{
    terminal_program program = get();

    EXPECT_EQ(program.wait(), 0);
    EXPECT_THAT(program.shown(), HasSubstr("key:k    0%  ["));
    EXPECT_THAT(program.shown(), HasSubstr("\r\x1b[Kquillmere: key:k  9.8 KiB  in 0:00  "));
}

TEST_F(ProgressBar, IsNotShownWhenQuiet)
{
    terminal_program program = get({"--quiet"});

    EXPECT_EQ(program.wait(), 0);
    EXPECT_EQ(program.shown(), "Downloaded key:k to " + into + "/name\r\n");
}

TEST_F(ProgressBar, IsClearedAwayForAFailure)
{
    bytes_reply = [](const request &) { return http_reply(503, "later"); };
    terminal_program program = get();

    EXPECT_EQ(program.wait(), 6);
    EXPECT_THAT(program.shown(), HasSubstr("\r\x1b[Kquillmere: downloading key:k failed"));
}

TEST_F(ProgressBar, GivesWayToCtrlC)
{
    // Half of the bytes, and then nothing more.
    on_bytes = [this](connection &client) {
        const std::string whole = http_reply(200, bytes);
        client.send(std::string_view(whole).substr(0, whole.size() - bytes.size() / 2));
        client.stall();
    };
    terminal_program program = get();
    program.wait_for("0%");

    program.type("\x03");

    EXPECT_EQ(program.wait(), 130);
    EXPECT_THAT(program.shown(), MatchesRegex("(.|\r|\n|\x1b)*\n")) << "the line is ended";
    EXPECT_FALSE(fs::exists(into + "/name"));
    on_bytes = nullptr;
    EXPECT_EQ(get().wait(), 0);
    EXPECT_EQ(content_of(into + "/name"), bytes);
}

} // namespace
} // namespace quillmere_test
