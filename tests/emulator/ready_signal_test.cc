#include "ready_signal.h"

#include <string>

#include <fcntl.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include "files.h"
#include "scratch_directory.h"

using namespace emulator;

namespace {

const listening_at where{8443, 8080, "/data/\"odd\\\n/ca.pem"};

std::string expected_line()
{
    return "{\"https_port\": 8443, \"http_port\": 8080, \"https_url\": "
           "\"https://127.0.0.1:8443\", \"http_url\": \"http://127.0.0.1:8080\", \"ca_file\": "
           "\"/data/\\\"odd\\\\\\u000a/ca.pem\", \"pid\": " +
           std::to_string(::getpid()) + "}\n";
}

} // namespace

TEST(ReadySignal, IsOneLineOfJson) { EXPECT_EQ(ready_line(where), expected_line()); }

TEST(ReadySignal, TellsTheAdminAddressBehindTheRest)
{
    listening_at with_admin = where;
    with_admin.admin = loopback_address{"::1", 4711};

    std::string expected = expected_line();
    expected.insert(expected.rfind('}'),
                    ", \"admin_port\": 4711, \"admin_url\": \"http://[::1]:4711\"");
    EXPECT_EQ(ready_line(with_admin), expected);
}

TEST(ReadySignal, RemovesWhatAnEarlierRunLeftAndWhatItWroteItself)
{
    const scratch_directory scratch;
    const std::filesystem::path file = scratch.path() / "ready";
    write_file(file, "old", 0644);
    {
        ready_signal ready(file, -1);
        EXPECT_FALSE(std::filesystem::exists(file));
        ready.give(where);
        EXPECT_EQ(read_file(file, 4096), expected_line());
    }
    EXPECT_FALSE(std::filesystem::exists(file));
}

TEST(ReadySignal, ClosesTheDescriptorBehindTheLine)
{
    int ends[2];
    ASSERT_EQ(::pipe2(ends, O_CLOEXEC), 0);
    const descriptor reading(ends[0]);
    ready_signal ready({}, ends[1]);

    ready.give(where);

    EXPECT_EQ(read_descriptor(reading.number(), 4096), expected_line());
}
