// What the emulator does when it cannot write: it says so, and what it has acknowledged stays.
#include <filesystem>
#include <set>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "quillmere.h"
#include "support/failing_files.h"
#include "support/library_fixture.h"
#include "support/temporary_folder.h"
#include "support/unread_log.h"

namespace quillmere_test {
namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

constexpr const char *disks_not_permitted = "this system does not let us have disks of our own";

class EmulatorFailingFiles : public testing::Test {
protected:
    EmulatorFailingFiles()
    {
        expect_done(run(add_account("ann@example.org")));
        before = dump_of(data);
    }

    static command emulator(const std::vector<std::string> &arguments)
    {
        command what;
        what.program = QUILLMERE_EMULATOR;
        what.arguments = arguments;
        return what;
    }

    command add_account(const std::string &email) const
    {
        command what =
            emulator({"add-account", "--data", data, "--email", email, "--password-file", "-"});
        what.input = "secret\n";
        return what;
    }

    command put(const std::string &bytes) const
    {
        command what = emulator({"put-content", "--data", data, "--account", "ann@example.org",
                                 "--path", "/file", "--from", "-"});
        what.input = bytes;
        return what;
    }

    command serve() const
    {
        return emulator({"--data", data, "--port", "0", "--http-port", "0", "--ready-fd", "3"});
    }

    static std::string dump_of(const std::string &folder)
    {
        const outcome ended = run(emulator({"--data", folder, "--dump"}));
        expect_done(ended);
        return ended.out;
    }

    static void expect_done(const outcome &ended) { EXPECT_EQ(ended.exit_status, 0) << ended.err; }

    static void expect_failed(const outcome &ended, const std::string &reason)
    {
        EXPECT_EQ(ended.exit_status, 1);
        EXPECT_THAT(ended.err, AllOf(StartsWith("quillmere-emulator: "), HasSubstr(reason)));
        EXPECT_THAT(ended.out, IsEmpty());
    }

    // No file that was begun and not finished.
    static void expect_no_remains_in(const std::string &folder)
    {
        for (const auto &each : std::filesystem::recursive_directory_iterator(folder))
            EXPECT_THAT(each.path().filename().string(),
                        AllOf(testing::Not(StartsWith("new-")), testing::Not(HasSubstr(".new"))));
    }

    temporary_folder folder;
    const std::string data = folder.path_of("data");
    std::string before;
};

TEST_F(EmulatorFailingFiles, KeepTheAccountsThatThereAreOnAFullDisk)
{
    if (!may_have_disks())
        GTEST_SKIP() << disks_not_permitted;

    const outcome ended = run(with_full_folder(add_account("bob@example.org"), data));

    expect_failed(ended, "store: ");
    EXPECT_EQ(dump_of(data + ".after"), before);
}

TEST_F(EmulatorFailingFiles, TakeNoContentThatADiskHasNoRoomFor)
{
    if (!may_have_disks())
        GTEST_SKIP() << disks_not_permitted;

    const outcome ended = run(with_full_folder(put(std::string(300'000, 'c')), data, 200));

    expect_failed(ended, "No space left on device");
    EXPECT_EQ(dump_of(data + ".after"), before);
    expect_no_remains_in(data + ".after");
}

TEST_F(EmulatorFailingFiles, TakeNoContentThatIsLongerThanAFileMayBe)
{
    const outcome ended = run(with_longest_file(put(std::string(300'000, 'c')), 200));

    expect_failed(ended, "File too large");
    EXPECT_EQ(dump_of(data), before);
    expect_no_remains_in(data);
}

TEST_F(EmulatorFailingFiles, OfItsCertificatesStopTheStart)
{
    if (!may_have_disks())
        GTEST_SKIP() << disks_not_permitted;

    const outcome ended = run(with_full_folder(serve(), data));

    expect_failed(ended, "No space left on device");
    EXPECT_THAT(ended.report, IsEmpty()); // whoever waits for the start is told by the pipe's end
    expect_no_remains_in(data + ".after");
}

TEST_F(EmulatorFailingFiles, InAReadOnlyFolderChangeNothing)
{
    if (!may_have_disks())
        GTEST_SKIP() << disks_not_permitted;

    for (const command &what : {add_account("bob@example.org"), put("content"), serve()})
        expect_failed(run(with_read_only_folder(what, data)), "");

    EXPECT_EQ(dump_of(data), before);
    expect_no_remains_in(data);
}

TEST_F(EmulatorFailingFiles, NeverMakeACutDumpPassForAWholeOne)
{
    const command dump = emulator({"--data", data, "--dump"});

    expect_failed(run(with_full_output(dump)), "cannot write to standard output: No space left");
    expect_failed(run(with_closed_pipe(dump)), "cannot write to standard output: Broken pipe");
}

TEST_F(EmulatorFailingFiles, OfStandardOutputAreNoReasonToStopServing)
{
    process server(with_closed_pipe(serve()));
    server.wait_for_line(channel::report, "https_url");

    EXPECT_EQ(server.terminate().exit_status, 0);
}

// The library on a server whose disk is nearly full.
class EmulatorOnANarrowDisk : public EmulatorFailingFiles {
protected:
    EmulatorOnANarrowDisk()
    {
        const auto told = nlohmann::json::parse(server.wait_for_line(channel::report, "https_url"));
        base = told.at("http_url");
        urls[1] = base.c_str();
        set_connection_attempts(1);
    }

    std::string session() const
    {
        char *token = nullptr;
        int32_t status = get_session_token("ann@example.org", "secret", nullptr, "42",
                                           "quillmere-development-key", &token);
        EXPECT_EQ(status, QM_OK);
        std::string text = token ? token : "";
        api_free(token);
        return text;
    }

    static int32_t make_folder(const std::string &token, const std::string &name)
    {
        char *key = nullptr;
        char *message = nullptr;
        int32_t status =
            create_folder(token.c_str(), name.c_str(), nullptr, nullptr, &key, &message);
        api_free(key);
        api_free(message);
        return status;
    }

    proxyless_environment environment;
    globals_guard globals;
    unread_log log;
    running_library library{nullptr};
    process server{with_longest_file(serve(), 400)};
    std::string base;
};

TEST_F(EmulatorOnANarrowDisk, KeepsWhatItAcknowledgedAndRefusesTheRest)
{
    const std::string token = session();
    std::set<std::string> acknowledged;
    int32_t status = QM_OK;
    for (int number = 0; status == QM_OK && number < 10'000; ++number) {
        const std::string name = "folder " + std::to_string(number) + std::string(200, 'x');
        status = make_folder(token, name);
        if (status == QM_OK)
            acknowledged.insert(name);
    }

    EXPECT_GT(status, 0); // an error of the service's own
    EXPECT_GT(acknowledged.size(), 0u);
    char *message = nullptr;
    user_info *info = nullptr;
    EXPECT_EQ(get_user_info(token.c_str(), &info, &message), QM_OK) << "it still reads";
    user_info_delete(&info);
    api_free(message);
    EXPECT_EQ(server.terminate().exit_status, 0);
    std::set<std::string> kept;
    const auto dump = nlohmann::json::parse(dump_of(data));
    for (const auto &each : dump.at("accounts").at(0).at("root").at("folders"))
        kept.insert(each.at("name"));
    EXPECT_EQ(kept, acknowledged);
}

} // namespace
} // namespace quillmere_test
