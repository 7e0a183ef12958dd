// The emulator killed again and again while clients write: what it acknowledged is there
// afterwards, whole, and the change feed tells of it.
//
// QUILLMERE_KILLS and QUILLMERE_SEED make a longer or another run.
#include <csignal>
#include <cstdlib>
#include <iostream>

#include <gtest/gtest.h>

#include "digest.h"
#include "durability/feed_follower.h"
#include "durability/stored_state.h"
#include "durability/write_load.h"
#include "emulator/process.h"
#include "emulator/scratch_directory.h"

namespace {

constexpr int number_of_writers = 4;

std::uint32_t number_in(const char *variable, std::uint32_t otherwise)
{
    const char *text = std::getenv(variable);
    return text ? static_cast<std::uint32_t>(std::strtoul(text, nullptr, 10)) : otherwise;
}

std::string email_of(int number) { return "writer" + std::to_string(number) + "@example.org"; }

std::string session_of(const std::string &email, std::uint16_t port)
{
    return element(get(port, "/api/user/get_session_token.php?application_id=42&password=secret"
                             "&email=" +
                                 email + "&signature=" +
                                 emulator::sha1_hex(email + "secret42quillmere-development-key")),
                   "session_token");
}

class Durability : public testing::Test {
protected:
    Durability()
    {
        for (int number = 0; number < number_of_writers; ++number)
            add_account(email_of(number));
        const auto accounts = stored_accounts(data);
        const server_process server(data);
        for (int number = 0; number < number_of_writers; ++number) {
            const std::string email = email_of(number);
            writers.emplace_back(session_of(email, server.http_port()), accounts.at(email).root,
                                 seed + static_cast<std::uint32_t>(number));
            followers.emplace_back(writers.back().session());
        }
    }

    void add_account(const std::string &email) const
    {
        const finished_process done = run_program(
            {"add-account", "--data", data.string(), "--email", email, "--password-file", "-"},
            "secret\n");
        ASSERT_EQ(done.exit_code, 0) << done.errors;
    }

    void kill_under_load()
    {
        server_process server(data);
        expect_followers_to_agree(server.http_port());
        write_load load(writers, server.http_port());
        load.wait_past(1 + random() % 40, std::chrono::microseconds(random() % 5000));
        server.stop(SIGKILL);
    }

    void expect_everything_kept()
    {
        EXPECT_EQ(damage_of_store(data), "");
        EXPECT_EQ(damaged_contents(data), "");
        const auto accounts = stored_accounts(data);
        for (int number = 0; number < number_of_writers; ++number) {
            writer &each = writers[static_cast<std::size_t>(number)];
            const stored_account &account = accounts.at(email_of(number));
            ++ends[each.settle(account.tree)];
            EXPECT_EQ(difference(each.acknowledged(), account.tree), "");
            EXPECT_EQ(each.refused(), "");
            // The newest change is in the feed: had it none, nobody would ever learn of it.
            if (!account.tree.empty()) {
                EXPECT_EQ(account.newest_in_feed, account.revision);
            }
        }
    }

    void expect_followers_to_agree(std::uint16_t port)
    {
        for (std::size_t number = 0; number < followers.size(); ++number) {
            followers[number].follow(port);
            EXPECT_EQ(followers[number].difference_to(writers[number].acknowledged()), "");
        }
    }

    const std::uint32_t kills = number_in("QUILLMERE_KILLS", 50);
    const std::uint32_t seed = number_in("QUILLMERE_SEED", 20261120);
    std::mt19937 random{seed};
    scratch_directory scratch;
    const std::filesystem::path data = scratch.path() / "data";
    std::vector<writer> writers;
    std::vector<feed_follower> followers;
    std::map<writer::end_of_pending, int> ends;
};

} // namespace

TEST_F(Durability, OutlivesBeingKilled)
{
    for (std::uint32_t kill = 1; kill <= kills && !HasFailure(); ++kill) {
        SCOPED_TRACE("kill " + std::to_string(kill) + " of seed " + std::to_string(seed));
        kill_under_load();
        expect_everything_kept();
    }

    const server_process server(data);
    expect_followers_to_agree(server.http_port());
    for (feed_follower &each : followers) // and whoever asks for the first time
        each = feed_follower(writers[static_cast<std::size_t>(&each - followers.data())].session());
    expect_followers_to_agree(server.http_port());
    const int lost = ends[writer::end_of_pending::not_made];
    const int kept = ends[writer::end_of_pending::made];
    std::cout << kills << " kills, seed " << seed << "; of the changes on their way " << kept
              << " were made, " << lost << " were not\n";
    EXPECT_GT(lost, 0) << "no kill met a change on its way";
}
