// The session between two runs: who may read it, and that it is never half written.
#include "session_file.h"

#include <csignal>
#include <filesystem>

#include <sys/resource.h>
#include <sys/stat.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "failure.h"
#include "support/temporary_folder.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using testing::HasSubstr;

mode_t mode_of(const std::string &path)
{
    struct stat facts = {};
    return ::lstat(path.c_str(), &facts) == 0 ? facts.st_mode & 07777 : 0;
}

class SessionFile : public testing::Test {
protected:
    std::string reason_of_failed_load() const
    {
        try {
            file.load();
        } catch (const failure &problem) {
            EXPECT_EQ(problem.code, exit_code::local_file);
            return problem.why;
        }
        ADD_FAILURE() << "the session was loaded";
        return {};
    }

    const session someone = {"https://h", "a@b.example", "token-\\1/+%2f"};
    temporary_folder folder;
    const std::string directory = folder.path_of("state/quillmere");
    const session_file file{directory + "/session.json"};
};

TEST_F(SessionFile, GivesBackWhatWasSaved)
{
    file.save(someone);

    const auto loaded = file.load();

    ASSERT_TRUE(loaded.has_value());
    EXPECT_EQ(loaded->service, someone.service);
    EXPECT_EQ(loaded->email, someone.email);
    EXPECT_EQ(loaded->token, someone.token);
}

TEST_F(SessionFile, IsAbsentUntilSaved)
{
    EXPECT_FALSE(file.load().has_value());
    EXPECT_FALSE(file.remove());
}

TEST_F(SessionFile, IsForItsOwnerAloneWhateverTheMask)
{
    const mode_t former = ::umask(0);
    file.save(someone);
    ::umask(former);

    EXPECT_EQ(mode_of(file.path()), 0600U);
    EXPECT_EQ(mode_of(directory), 0700U);
}

TEST_F(SessionFile, ClosesADirectoryThatStoodOpen)
{
    std::filesystem::create_directories(directory);
    ::chmod(directory.c_str(), 0755);

    file.save(someone);

    EXPECT_EQ(mode_of(directory), 0700U);
}

TEST_F(SessionFile, IsClosedToOthersWhenItStoodOpen)
{
    file.save(someone);
    ::chmod(file.path().c_str(), 0644);

    testing::internal::CaptureStderr();
    const auto loaded = file.load();
    const std::string warning = testing::internal::GetCapturedStderr();

    EXPECT_TRUE(loaded.has_value());
    EXPECT_EQ(mode_of(file.path()), 0600U);
    EXPECT_THAT(warning, HasSubstr("other users could read the session file"));
}

TEST_F(SessionFile, IsRefusedWhenOthersMayHaveWrittenIt)
{
    file.save(someone);
    ::chmod(file.path().c_str(), 0620);

    EXPECT_THAT(reason_of_failed_load(), HasSubstr("can be written by other users"));
}

TEST_F(SessionFile, IsRefusedWhenItIsALinkOrNoFile)
{
    file.save(someone);
    const std::string elsewhere = folder.path_of("elsewhere");
    std::filesystem::rename(file.path(), elsewhere);
    std::filesystem::create_symlink(elsewhere, file.path());
    reason_of_failed_load();

    std::filesystem::remove(file.path());
    ASSERT_EQ(::mkfifo(file.path().c_str(), 0600), 0);
    EXPECT_THAT(reason_of_failed_load(), HasSubstr("is not a regular file"));
}

TEST_F(SessionFile, IsRefusedWhenDamagedAndSaysSo)
{
    file.save(someone);
    for (const char *content :
         {"", "{", "[]", "{}", "{\"service\": \"https://h\"}", "null",
          "{\"service\": 1, \"session_token\": \"t\"}",
          "{\"service\": \"https://h\", \"session_token\": \"a&b\"}", "\xff\xfe"}) {
        folder.write("state/quillmere/session.json", content);
        EXPECT_THAT(reason_of_failed_load(), HasSubstr("is damaged")) << content;
    }
}

TEST_F(SessionFile, ReplacesADamagedOne)
{
    file.save(someone);
    folder.write("state/quillmere/session.json", "{");

    file.save(someone);

    EXPECT_TRUE(file.load().has_value());
}

TEST_F(SessionFile, IsReplacedAsAWhole)
{
    file.save(someone);
    struct stat before = {};
    ASSERT_EQ(::stat(file.path().c_str(), &before), 0);

    file.save(someone);

    struct stat after = {};
    ASSERT_EQ(::stat(file.path().c_str(), &after), 0);
    EXPECT_NE(before.st_ino, after.st_ino); // another file took the name
}

// A limit on the size of files stands in for a full disk: SIGXFSZ ignored, writes fail with EFBIG.
TEST_F(SessionFile, KeepsTheFormerSessionWhenTheNewOneCannotBeWritten)
{
    file.save(someone);
    session longer = someone;
    longer.token = std::string(100'000, 't');
    struct rlimit former = {};
    ASSERT_EQ(::getrlimit(RLIMIT_FSIZE, &former), 0);
    const auto former_handler = ::signal(SIGXFSZ, SIG_IGN);
    const struct rlimit small = {4096, former.rlim_max};
    ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &small), 0);

    EXPECT_THROW(file.save(longer), failure);

    ::setrlimit(RLIMIT_FSIZE, &former);
    ::signal(SIGXFSZ, former_handler);
    const auto loaded = file.load();
    ASSERT_TRUE(loaded.has_value());
    EXPECT_EQ(loaded->token, someone.token);
    const std::filesystem::directory_iterator entries(directory);
    EXPECT_EQ(std::distance(begin(entries), end(entries)), 1); // and leaves nothing behind
}

TEST_F(SessionFile, CannotHoldATokenThatIsNoText)
{
    session strange = someone;
    strange.token = "\xff";

    EXPECT_THROW(file.save(strange), failure);
    EXPECT_FALSE(std::filesystem::exists(file.path()));
}

TEST_F(SessionFile, CannotHoldATokenThatEndsEarlyInAnAddress)
{
    session strange = someone;
    for (const char letter : {' ', '\n', '\x7f', '&', '#', '"', '\'', '<', '>'}) {
        strange.token = std::string("to") + letter + "ken";
        EXPECT_THROW(file.save(strange), failure) << letter;
    }
    EXPECT_FALSE(std::filesystem::exists(file.path()));
}

TEST_F(SessionFile, IsForgottenWhateverItHolds)
{
    file.save(someone);
    folder.write("state/quillmere/session.json", "{");
    ::chmod(file.path().c_str(), 0666);

    EXPECT_TRUE(file.remove());
    EXPECT_FALSE(file.load().has_value());
}

std::string session_path_with(const char *state, const char *home)
{
    return session_path(environment([=](const char *name) {
        if (std::string(name) == "XDG_STATE_HOME")
            return state;
        return std::string(name) == "HOME" ? home : nullptr;
    }));
}

TEST(SessionPath, FollowsTheStateFolder)
{
    EXPECT_EQ(session_path_with("/s", "/h"), "/s/quillmere/session.json");
    EXPECT_EQ(session_path_with(nullptr, "/h"), "/h/.local/state/quillmere/session.json");
    EXPECT_EQ(session_path_with("", "/h"), "/h/.local/state/quillmere/session.json");
    EXPECT_EQ(session_path_with("relative", "/h"), "/h/.local/state/quillmere/session.json");
    EXPECT_THROW(session_path_with(nullptr, nullptr), failure);
}

} // namespace
} // namespace quillmere_test
