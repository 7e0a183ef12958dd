#include "process.h"

#include <csignal>
#include <ctime>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include <poll.h>
#include <sys/inotify.h>
#include <sys/stat.h>

#include <gtest/gtest.h>

#include "files.h"
#include "scratch_directory.h"
#include "socket_client.h"
#include "store/database.h"

namespace {

#if defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define EMULATOR_TEST_IS_SANITIZED
#endif
#elif defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define EMULATOR_TEST_IS_SANITIZED
#endif
#ifdef EMULATOR_TEST_IS_SANITIZED
constexpr bool is_sanitized = true;
#else
constexpr bool is_sanitized = false;
#endif

const std::string system_status_path = "/api/system/get_status.php";

class Process : public testing::Test {
protected:
    static std::string device_status(const server_process &server, const std::string &token)
    {
        return get(server.http_port(),
                   "/api/device/get_status.php?device_id=1&session_token=" + token);
    }

    scratch_directory scratch;
    const std::string data = scratch.path() / "data";
};

long resident_kilobytes(pid_t id)
{
    std::ifstream status("/proc/" + std::to_string(id) + "/status");
    long kilobytes = 0;
    for (std::string word; status >> word;)
        if (word == "VmRSS:")
            status >> kilobytes;
    return kilobytes;
}

bool is_private(const std::filesystem::path &file)
{
    struct stat status {};
    return ::stat(file.c_str(), &status) == 0 && (status.st_mode & 077) == 0;
}

// The local addresses on which any socket of the machine listens at this port, as the kernel
// writes them, in hexadecimal.
std::vector<std::string> listening_addresses(std::uint16_t port)
{
    std::vector<std::string> found;
    for (const char *table : {"/proc/net/tcp", "/proc/net/tcp6"}) {
        std::ifstream lines(table);
        for (std::string line; std::getline(lines, line);) {
            std::istringstream words(line);
            std::string slot, local, remote, state;
            words >> slot >> local >> remote >> state;
            const std::size_t colon = local.find(':');
            if (state == "0A" && std::stoul(local.substr(colon + 1), nullptr, 16) == port)
                found.push_back(local.substr(0, colon));
        }
    }
    return found;
}

} // namespace

TEST_F(Process, ServesHttpAndVerifiedHttps)
{
    const server_process server(data);

    EXPECT_EQ(element(get(server.http_port(), system_status_path), "database"), "live");
    for (const char *name : {"localhost", "127.0.0.1"})
        EXPECT_EQ(
            element(get_verified(server.https_port(), system_status_path, server.root(), name),
                    "database"),
            "live");
}

TEST_F(Process, IsRefusedByAClientThatTrustsAnotherRoot)
{
    const server_process server(data);
    const server_process other(scratch.path() / "other");

    EXPECT_THROW(get_verified(server.https_port(), system_status_path, other.root(), "localhost"),
                 std::runtime_error);
    EXPECT_THROW(
        get_verified(server.https_port(), system_status_path, server.root(), "example.org"),
        std::runtime_error);
}

TEST_F(Process, ListensOnTheLoopbackInterfaceAlone)
{
    const server_process server(data);

    for (const std::uint16_t port : {server.http_port(), server.https_port()}) {
        const std::vector<std::string> addresses = listening_addresses(port);
        EXPECT_FALSE(addresses.empty());
        for (const std::string &address : addresses)
            EXPECT_TRUE(address == "0100007F" || address == "00000000000000000000000001000000")
                << address;
    }
}

TEST_F(Process, EndsCleanlyOnEitherSignal)
{
    for (const int signal : {SIGINT, SIGTERM}) {
        server_process server(data);
        socket_client idle(server.http_port());
        socket_client silent_tls(server.https_port());

        EXPECT_EQ(server.stop(signal), 0);
    }
}

TEST_F(Process, KeepsItsSessionsOverARestart)
{
    add_ann(data);
    std::string token;
    {
        server_process server(data);
        token = log_in(server.http_port());
        EXPECT_EQ(server.stop(SIGTERM), 0);
    }

    const server_process server(data);

    EXPECT_EQ(element(device_status(server, token), "result"), "Success");
}

TEST_F(Process, KeepsWhatItAcknowledgedOverAKill)
{
    add_ann(data);
    for (int round = 0; round < 5; ++round) {
        std::string token;
        {
            server_process server(data);
            token = log_in(server.http_port());
            server.stop(SIGKILL);
        }

        const server_process server(data);
        EXPECT_EQ(element(device_status(server, token), "result"), "Success") << round;
    }
}

TEST_F(Process, TakesAnAccountThatIsMadeWhileItServes)
{
    const server_process server(data);

    add_ann(data);

    EXPECT_EQ(log_in(server.http_port()).size(), 64u);
}

TEST_F(Process, TakesAnApplicationThatIsRegisteredWhileItServes)
{
    add_ann(data);
    const server_process server(data);
    ASSERT_EQ(
        run_program({"add-application", "--data", data, "--id", "42", "--key-file", "-"}, "changed")
            .exit_code,
        0);

    EXPECT_EQ(log_in(server.http_port()), "");
}

TEST_F(Process, SessionLifetimeIsAnOption)
{
    add_ann(data);
    const std::int64_t before = std::time(nullptr);
    const server_process server(data, {"--session-lifetime", "7000"});
    log_in(server.http_port());

    emulator::database store(std::filesystem::path(data) / "store.sqlite");
    emulator::statement query = store.prepare("SELECT expires FROM sessions");
    ASSERT_TRUE(query.step());
    EXPECT_GE(query.number(0), before + 7000);
    EXPECT_LE(query.number(0), std::time(nullptr) + 7000);
}

TEST_F(Process, LetsNobodyElseReadItsSecrets)
{
    const server_process server(data);

    for (const char *name : {".", "ca-key.pem", "server-key.pem", "store.sqlite"})
        EXPECT_TRUE(is_private(std::filesystem::path(data) / name)) << name;
}

TEST_F(Process, WritesTheReadyFileAtOnceAndRemovesItAtTheEnd)
{
    const std::filesystem::path file = scratch.path() / "ready.json";
    const emulator::descriptor watch(::inotify_init1(IN_CLOEXEC | IN_NONBLOCK));
    ::inotify_add_watch(watch.number(), scratch.path().c_str(), IN_MOVED_TO);
    {
        server_process server(data, {"--ready-file", file});
        EXPECT_EQ(emulator::read_file(file, 65536), server.ready_line());
        EXPECT_EQ(server.stop(SIGTERM), 0);
    }
    EXPECT_FALSE(std::filesystem::exists(file));

    pollfd moved{watch.number(), POLLIN, 0};
    EXPECT_EQ(::poll(&moved, 1, 0), 1) << "the file was not put in place by a rename";
}

TEST_F(Process, LeavesAFolderThatAnotherServerUses)
{
    const server_process server(data);

    const finished_process second = run_program({"--data", data});

    EXPECT_EQ(second.exit_code, 1);
    EXPECT_NE(second.errors.find("another quillmere-emulator is using"), std::string::npos);
    EXPECT_EQ(element(get(server.http_port(), system_status_path), "database"), "live");
}

TEST_F(Process, SaysThatAPortIsTaken)
{
    const server_process server(data);

    const finished_process second = run_program(
        {"--data", scratch.path() / "other", "--http-port", std::to_string(server.http_port())});

    EXPECT_EQ(second.exit_code, 1);
    EXPECT_NE(second.errors.find("cannot listen on port"), std::string::npos);
}

TEST_F(Process, StaysSmall)
{
    if (is_sanitized)
        GTEST_SKIP() << "a sanitizer's own memory is not small";
    const server_process server(data);
    get_verified(server.https_port(), system_status_path, server.root(), "localhost");

    const long kilobytes = resident_kilobytes(server.id());

    EXPECT_GT(kilobytes, 0);
    EXPECT_LT(kilobytes, 20 * 1000);
}

TEST_F(Process, RefusesAWrongCommandLine)
{
    for (const std::vector<std::string> &arguments : {std::vector<std::string>{"--port", "65536"},
                                                      {"--port", "-1"},
                                                      {"--session-lifetime", "0"},
                                                      {"--unknown"},
                                                      {"unknown"},
                                                      {"add-account", "--email", "a"},
                                                      {"add-application", "--id", "1"}})
        EXPECT_EQ(run_program(arguments).exit_code, 2);
}

TEST_F(Process, RefusesAnAccountThatCannotBe)
{
    const std::vector<std::string> command{"add-account",     "--data",          data, "--email",
                                           "ann@example.org", "--password-file", "-"};

    EXPECT_EQ(run_program(command, "").exit_code, 1);
    EXPECT_EQ(run_program(command, "\n").exit_code, 1);
    EXPECT_EQ(run_program(command, "\x01").exit_code, 1);
    EXPECT_EQ(run_program(command, std::string(5000, 'x')).exit_code, 1);
    EXPECT_EQ(run_program(command, "good").exit_code, 0);
    const finished_process again = run_program(command, "good");
    EXPECT_EQ(again.exit_code, 1);
    EXPECT_NE(again.errors.find("taken"), std::string::npos);
}

TEST_F(Process, NeverPrintsASecret)
{
    const finished_process done = run_program(
        {"add-account", "--data", data, "--email", "ann@example.org", "--password-file", "-"},
        "very-secret");

    EXPECT_EQ((done.output + done.errors).find("very-secret"), std::string::npos);
}

TEST_F(Process, TellsItsVersionAndItsOptions)
{
    const finished_process version = run_program({"--version"});
    const finished_process help = run_program({"--help"});

    EXPECT_EQ(version.exit_code, 0);
    EXPECT_EQ(version.output.rfind("quillmere-emulator ", 0), 0u);
    EXPECT_EQ(help.exit_code, 0);
    for (const char *option : {"--data", "--port", "--http-port", "--ready-file", "--ready-fd",
                               "--session-lifetime", "add-account", "add-application"})
        EXPECT_NE(help.output.find(option), std::string::npos) << option;
}
