// One story through every operation of the library but the uploads, told on the command line and
// checked by what the store then holds.
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "emulator_account.h"

namespace quillmere_test {
namespace {

using json = nlohmann::json;
using testing::HasSubstr;

constexpr const char *friend_email = "friend@example.org";

class Scenario : public emulator_account {
protected:
    Scenario()
    {
        add_account(friend_email);
        theirs.environment["QUILLMERE_EMULATOR"] = ready_file;
        theirs.run({"login", friend_email, "--password-stdin"}, password_line);
    }

    /** Runs a command of this account, its exchanges logged. */
    json done(std::vector<std::string> arguments) const
    {
        arguments.insert(arguments.end(), {"--log-file", log});
        return result_of(std::move(arguments));
    }

    void begin_session() const;
    void look_around() const;
    void build_tree() const;
    void rearrange_tree() const;
    void share() const;
    void follow_changes() const;

    program_home theirs;
    const std::string password_line = std::string(account_password) + "\n";
    const std::string log = home.folder().path_of("log");
};

void Scenario::begin_session() const
{
    const std::string token_file = home.folder().path_of("login-token");
    sign_in({"--log-file", log});
    const std::string first_session = content_of(home.session_path());

    const outcome got = home.run({"login-token", account_email, "--password-stdin", "--token-file",
                                  token_file, "--log-file", log},
                                 password_line);
    done({"renew"});

    EXPECT_EQ(got.exit_status, 0) << got.err;
    EXPECT_GT(content_of(token_file).size(), 1U);
    EXPECT_NE(content_of(home.session_path()), first_session);
}

void Scenario::look_around() const
{
    EXPECT_EQ(done({"status"}).at("database"), "live");
    EXPECT_EQ(done({"limits"}).at("folder_content_chunk_size"), 100);
    EXPECT_EQ(done({"device-status"}).at("device_revision"), 1);
    EXPECT_EQ(done({"whoami"}).at("tree").at("epoch"), 1);
    EXPECT_EQ(done({"changes", "--sample"}).at("changes").size(), 17U);
}

void Scenario::build_tree() const
{
    done({"mkdir", "-p", "/photos/2026/may"});
    done({"create", "/photos/2026/plan.txt", "--time", "2026-03-01 09:30:00"});
    put_content("/photos/2026/may/a.jpg", "not quite a picture");

    EXPECT_EQ(done({"ls", "/photos/2026"}).at("entries").size(), 2U);
    EXPECT_EQ(done({"stat", "/photos"}).at("total_files"), 2);
    EXPECT_EQ(done({"stat", "/photos/2026/may/a.jpg"}).at("size"), 19);
}

void Scenario::rearrange_tree() const
{
    done({"cp", "-r", "/photos/2026", "/backup"});
    done({"cp", "/photos/2026/may/a.jpg", "/photos"});
    done({"mv", "/photos/2026/plan.txt", "/plans.txt"});
    done({"mv", "/photos/2026/may", "/photos/spring"});
    done({"set", "/photos", "--name", "pictures", "--description", "old & new", "--tags", "a,b"});
    done({"set", "/backup", "--privacy", "private", "--recursive"});
    done({"set", "/plans.txt", "--name", "plan.txt", "--description", "soon", "--privacy",
          "private", "--time", "2026-04-01 00:00:00"});
}

void Scenario::share() const
{
    EXPECT_EQ(done({"links", "/pictures/a.jpg", "--type", "view"}).at("links").size(), 1U);
    EXPECT_THAT(std::string(done({"links", "/pictures/a.jpg", "--download"}).at("url")),
                HasSubstr("/download/"));

    const outcome made = theirs.run({"mkdir", "/from a friend", "--json"});
    const std::string key = json::parse(made.out).at("key");
    done({"attach", "key:" + key});
    done({"detach", "/from a friend"});
    done({"attach", "key:" + key});
    EXPECT_EQ(dump_of(account_email).at("attached"), json({key}));
}

void Scenario::follow_changes() const
{
    const std::string revision = done({"changes"}).at("device_revision").dump();
    done({"rm", "-r", "/pictures/2026"});
    done({"rm", "/backup/plan.txt"});
    const json changes = done({"changes", "--since", revision});

    EXPECT_EQ(changes.at("changes").size(), 2U);
    EXPECT_EQ(changes.at("device_revision"), dump_of(account_email).at("revision"));
}

/** What a folder of the store holds, by name, without what differs from run to run. */
json named(const json &folder)
{
    json held = json::object();
    for (const json &each : folder.at("folders"))
        held[each.at("name").get<std::string>()] = {{"description", each.at("description")},
                                                    {"tags", each.at("tags")},
                                                    {"privacy", each.at("privacy")},
                                                    {"holds", named(each)}};
    for (const json &each : folder.at("files"))
        held[each.at("name").get<std::string>()] = {{"description", each.at("description")},
                                                    {"privacy", each.at("privacy")},
                                                    {"size", each.at("size")}};
    return held;
}

const json expected_tree = json::parse(R"({
    "pictures": {
        "description": "old & new", "tags": "a,b", "privacy": "public",
        "holds": {
            "a.jpg": {"description": "", "privacy": "public", "size": 19},
            "spring": {
                "description": "", "tags": "", "privacy": "public",
                "holds": {"a.jpg": {"description": "", "privacy": "public", "size": 19}}
            }
        }
    },
    "backup": {
        "description": "", "tags": "", "privacy": "private",
        "holds": {
            "may": {
                "description": "", "tags": "", "privacy": "private",
                "holds": {"a.jpg": {"description": "", "privacy": "private", "size": 19}}
            }
        }
    },
    "plan.txt": {"description": "soon", "privacy": "private", "size": 0}
})");

// What each operation leaves in the log, but for the two that write nothing to it: renewing the
// session and reading the tree's revision, which are seen by what they give.
constexpr const char *traces[] = {
    "Session token url:",
    "get_login_token url:",
    "get_system_limits url:",
    "get_system_status url:",
    "get_status url:",
    "get user  url:",
    "get user limits url:",
    "get_folder_info url",
    "create_folder: url:",
    "delete_folder url:",
    "update folder url:",
    "copy_folder url:",
    "move_folder url:",
    "get_folder_content",
    "attach_foreign_folder url:",
    "detach_foreign_folder url:",
    "get_file_info url",
    "create_file: url:",
    "delete_file: url:",
    "copy_file: url:",
    "move_file: url:",
    "get_links url:",
    "get_download_link url:",
    "get_changes url:",
    "/api/file/update.php",
};

TEST_F(Scenario, UsesEveryOperationAndLeavesWhatItSays)
{
    begin_session();
    look_around();
    build_tree();
    rearrange_tree();
    share();
    follow_changes();

    const json root = dump_of(account_email).at("root");
    EXPECT_EQ(named(root), expected_tree) << root.dump(2);
    EXPECT_EQ(root.at("files").at(0).at("mtime"), "2026-04-01 00:00:00");
    const std::string logged = content_of(log);
    for (const char *trace : traces)
        EXPECT_THAT(logged, HasSubstr(trace));
    EXPECT_EQ(done({"logout"}).at("signed_out"), true);
    error_of({"whoami"}, 4);
}

} // namespace
} // namespace quillmere_test
