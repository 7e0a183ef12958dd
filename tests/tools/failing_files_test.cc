// What the command line does when it cannot write: it says so, and loses nothing that was there.
#include <filesystem>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "program.h"
#include "support/certificates.h"
#include "support/failing_files.h"
#include "support/scripted_server.h"

namespace quillmere_test {
namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::IsEmpty;

constexpr const char *disks_not_permitted = "this system does not let us have disks of our own";

class FailingFiles : public testing::Test {
protected:
    FailingFiles()
    {
        server.answer(xml_reply("<response><result>Success</result>"
                                "<session_token>new</session_token></response>"));
        home.environment["QUILLMERE_APP_ID"] = "42";
        home.environment["QUILLMERE_APP_KEY"] = "key";
    }

    // Signs in where somebody is signed in already.
    command login() const
    {
        home.sign_in("https://former.example", "former");
        return home.with({"login", "new@example.org", "--password-stdin", "--service",
                          server.base_url(), "--ca-file", test_root_path()},
                         "password\n");
    }

    static std::string token_in(const std::string &session)
    {
        return nlohmann::json::parse(content_of(session)).at("session_token");
    }

    static size_t entries_in(const std::string &folder)
    {
        const std::filesystem::directory_iterator entries(folder);
        return static_cast<size_t>(std::distance(begin(entries), end(entries)));
    }

    // Nobody was signed out, and no half file lies about.
    static void expect_former_session_in(const std::string &folder)
    {
        EXPECT_EQ(token_in(folder + "/session.json"), "former");
        EXPECT_EQ(entries_in(folder), 1U);
    }

    program_home home;
    const std::string session_folder = home.folder().path_of("state/quillmere");
    scripted_server server{tls_with(loopback_certificate())};
};

TEST_F(FailingFiles, KeepTheFormerSessionWhenNoFileMayGrow)
{
    const outcome ended = run(with_longest_file(login(), 0));

    EXPECT_EQ(ended.exit_status, 9);
    EXPECT_THAT(ended.err, AllOf(HasSubstr("quillmere: cannot write the session file"),
                                 HasSubstr("File too large")));
    EXPECT_THAT(ended.out, IsEmpty());
    expect_former_session_in(session_folder);
}

TEST_F(FailingFiles, KeepTheFormerSessionOnAFullDisk)
{
    if (!may_have_disks())
        GTEST_SKIP() << disks_not_permitted;

    const outcome ended = run(with_full_folder(login(), session_folder));

    EXPECT_EQ(ended.exit_status, 9);
    EXPECT_THAT(ended.err, AllOf(HasSubstr("quillmere: cannot write the session file"),
                                 HasSubstr("No space left on device")));
    EXPECT_THAT(ended.out, IsEmpty());
    expect_former_session_in(session_folder + ".after");
}

TEST_F(FailingFiles, KeepTheFormerSessionInAReadOnlyFolder)
{
    if (!may_have_disks())
        GTEST_SKIP() << disks_not_permitted;

    const outcome ended = run(with_read_only_folder(login(), session_folder));

    EXPECT_EQ(ended.exit_status, 9);
    EXPECT_THAT(ended.err, AllOf(HasSubstr("quillmere: cannot write the session file"),
                                 HasSubstr("Read-only file system")));
    expect_former_session_in(session_folder);
}

TEST_F(FailingFiles, KeepTheSessionThatCannotBeRemoved)
{
    if (!may_have_disks())
        GTEST_SKIP() << disks_not_permitted;
    home.sign_in("https://former.example", "former");

    const outcome ended = run(with_read_only_folder(home.with({"logout"}), session_folder));

    EXPECT_EQ(ended.exit_status, 9);
    EXPECT_THAT(ended.err, HasSubstr("quillmere: cannot remove the session file"));
    expect_former_session_in(session_folder);
}

TEST_F(FailingFiles, KeepTheNewSessionWhenItCannotBeTold)
{
    for (const auto &surroundings : {with_closed_pipe, with_full_output}) {
        const outcome ended = run(surroundings(login()));

        EXPECT_EQ(ended.exit_status, 9);
        EXPECT_THAT(ended.err, HasSubstr("quillmere: cannot write to standard output: "));
        EXPECT_EQ(token_in(home.session_path()), "new");
    }
}

TEST_F(FailingFiles, AreToldOfOnStandardErrorWhenJsonCannotBeWritten)
{
    const outcome ended = run(with_closed_pipe(home.with({"device-status", "--json"})));

    EXPECT_EQ(ended.exit_status, 4);
    EXPECT_EQ(ended.err, "quillmere: cannot write to standard output: Broken pipe\n");
}

} // namespace
} // namespace quillmere_test
