// Accounts changed at random, a mirror that is killed and cut off at random, and a user who works
// in the copy: in the end the copy is what the account is, and nothing of the user's is lost.
#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <random>
#include <set>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "journey/account_client.h"
#include "program.h"
#include "some_content.h"
#include "support/cutting_relay.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;
using testing::Not;

constexpr const char *ann = "ann@example.org";
constexpr const char *bob = "bob@example.org";
constexpr const char *folder_mark = "folder";

std::uint32_t number_in(const char *variable, std::uint32_t otherwise)
{
    const char *const text = std::getenv(variable);
    return text == nullptr ? otherwise : static_cast<std::uint32_t>(std::stoul(text));
}

/** What stands at each path: the SHA-256 of a file, or that it is a folder. */
using tree = std::map<std::string, std::string>;

/** The tree of an account. Of several entries of one name a folder goes ahead of a file, and the
 * smaller key ahead of the larger. */
class shown_tree {
public:
    explicit shown_tree(const listed_account &account) : account_(account)
    {
        add(account.root, "");
    }

    tree shown;
    bool all_shown = true;

private:
    bool is_folder(const std::string &key) const
    {
        return account_.found.at(key).info.at("kind") == "folder";
    }

    void add(const std::string &folder, const std::string &path)
    {
        for (const bool folders : {true, false})
            for (const auto &[key, entry] : account_.found)
                if (entry.parent == folder && is_folder(key) == folders)
                    add_entry(key, path + entry.info.at("name"));
    }

    void add_entry(const std::string &key, const std::string &path)
    {
        const std::string hash =
            is_folder(key) ? folder_mark : account_.found.at(key).info.at("hash");
        if (!shown.emplace(path, hash.empty() ? sha256_of("") : hash).second)
            all_shown = false;
        else if (is_folder(key))
            add(key, path + "/");
    }

    const listed_account &account_;
};

tree tree_on_disk(const std::string &top)
{
    tree found;
    if (!fs::exists(top))
        return found;
    for (auto each = fs::recursive_directory_iterator(top);
         each != fs::recursive_directory_iterator(); ++each) {
        const std::string path = fs::relative(each->path(), top);
        if (path == ".quillmere-mirror") {
            each.disable_recursion_pending();
            continue;
        }
        found[path] = each->is_directory() ? folder_mark : sha256_of_file(each->path());
    }
    return found;
}

class RandomMirror : public testing::Test {
protected:
    RandomMirror()
    {
        for (const char *who : {ann, bob})
            service.add_account(who);
        library = std::make_unique<library_on_service>(service, reached_over::plain);
        for (const char *who : {ann, bob})
            sessions[who] = library->session_of(who);
        by_library = std::make_unique<changes_by_library>(sessions);
        client = std::make_unique<random_changes>(seed, std::ref(*by_library));
        relay = std::make_unique<cutting_relay>(port_of(service.https_url()));
        lead_to_relay();
    }

    void change_accounts(unsigned times)
    {
        for (unsigned i = 0; i < times; ++i)
            client->change(i % 4 == 3 ? bob : ann, i % 4 == 3 ? ann : bob);
        put_contents();
        for (const char *who : {ann, bob})
            client->learn(who, listed_account(sessions[who]).found);
    }

    /** Runs the mirror with something in its way, or nothing. */
    void run_hindered()
    {
        relay->cut_nothing();
        switch (below(5)) {
        case 0:
        case 1:
            return note_end(run_killed_at(1 + scaled(160)));
        case 2:
            relay->cut_after(way::to_client, scaled(60'000));
            note_end(run(mirror_command(QUILLMERE_PROGRAM)));
            relay->cut_nothing();
            return;
        case 3:
            return run_while_accounts_change();
        default:
            return note_end(run(mirror_command(QUILLMERE_PROGRAM)));
        }
    }

    // What the mirror has just read of a file may be wrong when it fetches it.
    void run_while_accounts_change()
    {
        process running(mirror_command(QUILLMERE_PROGRAM));
        change_accounts(6);
        note_end(running.wait());
    }

    /** Does what a dry run ahead of it has told. */
    void run_unhindered(bool all_shown)
    {
        const tree before = tree_on_disk(local());
        const outcome foreseen = run(mirror_command(QUILLMERE_PROGRAM, {"--json", "--dry-run"}));
        EXPECT_EQ(tree_on_disk(local()), before);

        const outcome ended = run(mirror_command(QUILLMERE_PROGRAM, {"--json"}));
        EXPECT_EQ(ended.exit_status, all_shown ? 0 : 8) << ended.err;
        EXPECT_EQ(foreseen.exit_status, ended.exit_status);
        if (all_shown) {
            EXPECT_EQ(foreseen.out, ended.out);
        }
        note_end(ended);
    }

    void note_end(const outcome &ended)
    {
        kills += ended.signal == SIGKILL ? 1 : 0;
        const std::set<int> possible = {0, 3, 5, 7, 8};
        EXPECT_TRUE(ended.signal == SIGKILL || possible.count(ended.exit_status.value_or(-1)) != 0)
            << ended.exit_status.value_or(-1) << ended.err;
        told += ended.err;
    }

    /** The user's own bytes go into a file of the copy, or beside one, or a file goes away. */
    void work_in_copy()
    {
        const std::string own = "mine " + std::to_string(++works);
        tree now = tree_on_disk(local());
        auto chosen = now.begin();
        std::advance(chosen, below(static_cast<std::uint32_t>(now.size())));
        const std::string path = local() + "/" + chosen->first;
        if (chosen->second == folder_mark) {
            home.folder().write("copy/" + chosen->first + "/own" + std::to_string(works), own);
        } else {
            users.erase(chosen->second);
            fs::remove(path);
            if (below(3) == 0)
                return;
            home.folder().write("copy/" + chosen->first, own);
        }
        users.insert(sha256_of(own));
    }

    std::uint32_t below(std::uint32_t end) { return static_cast<std::uint32_t>(chance() % end); }

    /** Small ones are as likely as large ones. */
    std::uint32_t scaled(std::uint32_t end)
    {
        std::uint32_t size = 1;
        while (size < end && below(8) != 0)
            size *= 2;
        return below(std::min(size, end));
    }

    std::string local() const { return home.folder().path_of("copy"); }

    const std::uint32_t seed = number_in("QUILLMERE_SEED", 20261121);
    std::mt19937 chance{seed};
    emulated_service service;
    std::unique_ptr<library_on_service> library;
    std::map<std::string, std::string> sessions;
    std::unique_ptr<changes_by_library> by_library;
    std::unique_ptr<random_changes> client;
    std::unique_ptr<cutting_relay> relay;
    program_home home;
    std::set<std::string> users; // SHA-256 of what the user wrote
    std::string told;            // on standard error, by all runs
    unsigned works = 0;
    unsigned kills = 0;

private:
    static std::uint16_t port_of(const std::string &url)
    {
        return static_cast<std::uint16_t>(std::stoi(url.substr(url.rfind(':') + 1)));
    }

    void lead_to_relay()
    {
        const std::string url = "https://127.0.0.1:" + std::to_string(relay->port());
        const nlohmann::json ready = {
            {"https_url", url}, {"http_url", service.http_url()}, {"ca_file", service.root_path()}};
        home.environment["QUILLMERE_EMULATOR"] = home.folder().write("ready.json", ready.dump());
        home.sign_in(url, sessions[ann]);
    }

    command mirror_command(const char *program, const std::vector<std::string> &more = {}) const
    {
        command what = home.with({"mirror", "/", local(), "--retries", "0", "--quiet"});
        what.arguments.insert(what.arguments.end(), more.begin(), more.end());
        what.program = program;
        return what;
    }

    outcome run_killed_at(std::uint32_t point) const
    {
        command what = mirror_command(QUILLMERE_KILLED_PROGRAM);
        what.environment["QUILLMERE_TEST_KILL_AT"] = std::to_string(point);
        return quillmere_test::run(what);
    }

    void put_contents()
    {
        const std::string source = home.folder().path_of("contents");
        fs::remove_all(source);
        fs::create_directories(source);
        for (unsigned i = below(4); i < 6; ++i)
            home.folder().write("contents/f" + std::to_string(below(12)),
                                some_bytes(scaled(200'000), below(UINT32_MAX)));
        service.command_output({"put-content", "--account", ann, "--path",
                                "/c" + std::to_string(below(3)), "--from", source});
    }
};

} // namespace

TEST_F(RandomMirror, EndsAsTheAccountIsWhateverStoppedIt)
{
    for (std::uint32_t round = 0; round < number_in("QUILLMERE_ROUNDS", 2); ++round) {
        for (int part = 0; part < 3; ++part) {
            change_accounts(8);
            run_hindered();
            run_hindered();
        }
        const shown_tree account{listed_account(sessions[ann])};

        run_unhindered(account.all_shown);

        ASSERT_EQ(tree_on_disk(local()), account.shown) << "round " << round << told;
    }
    RecordProperty("kills", static_cast<int>(kills));
    EXPECT_GT(kills, 0u);
    EXPECT_GT(relay->cuts(), 0u);
    EXPECT_THAT(told, Not(HasSubstr("kept as"))) << "nobody but the mirror wrote here";
    EXPECT_THAT(told, Not(HasSubstr("stays")));
}

TEST_F(RandomMirror, LosesNothingThatTheUserWrote)
{
    change_accounts(40);
    run_unhindered(shown_tree(listed_account(sessions[ann])).all_shown);
    for (std::uint32_t round = 0; round < number_in("QUILLMERE_ROUNDS", 2); ++round) {
        for (int part = 0; part < 2; ++part) {
            change_accounts(8);
            for (int work = 0; work < 3; ++work)
                work_in_copy();
            run_hindered();
        }
        const shown_tree account{listed_account(sessions[ann])};

        run_unhindered(account.all_shown);

        std::set<std::string> lost = users;
        for (const auto &[path, content] : tree_on_disk(local())) {
            lost.erase(content);
            const auto shown = account.shown.find(path);
            if (shown != account.shown.end())
                EXPECT_EQ(content, shown->second) << path;
            else
                EXPECT_TRUE(content == folder_mark || users.count(content) != 0) << path;
        }
        for (const auto &[path, content] : account.shown)
            EXPECT_TRUE(fs::exists(local() + "/" + path)) << path;
        ASSERT_EQ(lost.size(), 0u) << "round " << round << told;
        ASSERT_FALSE(HasFailure()) << "round " << round << told;
    }
    EXPECT_THAT(told, HasSubstr("kept as"));
}

} // namespace quillmere_test
