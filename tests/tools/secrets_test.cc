// Where the command line leaves the secrets it is trusted with: through every command and all that
// can go wrong, with its log on. Nowhere but in the session's file and the login token's.
#include <algorithm>
#include <atomic>
#include <filesystem>
#include <functional>
#include <future>
#include <iterator>
#include <string>

#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "canaries.h"
#include "command.h"
#include "program.h"
#include "some_content.h"
#include "support/certificates.h"
#include "support/failing_files.h"
#include "support/scripted_server.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;
using testing::IsEmpty;
using testing::IsSubsetOf;
using words = std::vector<std::string>;

const std::string email = "someone@example.org";
// Nothing else on this machine holds these by chance.
const std::string canary = "Canary" + std::to_string(::getpid());
const std::string password = canary + "Pw & more";
const std::string application_key = canary + "Ak/key+of";
const std::string facebook_token = canary + "Fb-token";
const std::string session_token = canary + "St0000feed";
const std::string new_session_token = canary + "Nt0000feed";
const std::string login_token = canary + "Lt0000feed";
const std::string private_key = canary + "Pk0000feed";

/** A command, and the request whose answer decides what becomes of it. */
struct tried_command {
    std::string name;
    std::string request; ///< its path, upload, or nothing where none is made
    words arguments;
    bool is_silent = false; ///< about what goes wrong: a shell asks
};

const std::string upload = "upload";

const tried_command tried_commands[] = {
    {"login",
     "/api/user/get_session_token.php",
     {email, "--password-stdin", "--app-id", "7", "--app-key-file", "key"}},
    {"login",
     "/api/user/get_session_token.php",
     {"--facebook-token-file", "facebook-token", "--app-id", "7", "--app-key-file", "key"}},
    {"logout", "", {}},
    {"renew", "/api/user/renew_session_token.php", {}},
    {"login-token",
     "/api/user/get_login_token.php",
     {email, "--password-stdin", "--app-id", "7", "--app-key-file", "key", "--token-file",
      "login-token"}},
    {"whoami", "/api/user/myfiles_revision.php", {}},
    {"status", "/api/system/get_status.php", {}},
    {"limits", "/api/system/get_limits.php", {}},
    {"device-status", "/api/device/get_status.php", {}},
    {"ls", "/api/1.0/folder/get_content.php", {}},
    {"stat", "/api/file/get_info.php", {"key:k"}},
    {"mkdir", "/api/folder/create.php", {"/new"}},
    {"create", "/api/file/create.php", {"/new"}},
    {"rm", "/api/file/delete.php", {"key:k"}},
    {"rm", "/api/folder/delete.php", {"-r", "key:f"}},
    {"mv", "/api/file/move.php", {"key:k", "key:f"}},
    {"mv", "/api/file/update.php", {"/name", "/new"}},
    {"cp", "/api/file/copy.php", {"key:k", "key:f"}},
    {"set", "/api/file/update.php", {"key:k", "--tags", "a"}},
    {"set", "/api/folder/update.php", {"key:f", "--tags", "a"}},
    {"put", upload, {"source", "/"}},
    {"get", "/bytes", {"key:k", "into"}},
    {"mirror", "/api/1.0/folder/get_content.php", {"key:f", "copy"}},
    {"update", upload, {"source", "key:k"}},
    {"links", "/api/file/get_links.php", {"key:k"}},
    {"changes", "/api/device/get_changes.php", {}},
    {"attach", "/api/folder/attach_foreign.php", {"key:f"}},
    {"detach", "/api/folder/detach_foreign.php", {"key:f"}},
    {"doctor", "/api/system/get_status.php", {}},
    {"quickstart", "", {}},
    {"completion", "", {"bash"}},
    {"__complete", "/api/1.0/folder/get_content.php", {"remote", "/"}, true},
};

/** In every reply, whatever was asked for. */
const std::string credentials = "<session_token>" + new_session_token +
                                "</session_token><login_token>" + login_token +
                                "</login_token><pkey>" + private_key + "</pkey>";

std::string success(const std::string &elements)
{
    return xml_reply("<response><result>Success</result>" + credentials + elements + "</response>");
}

std::string refusal(int number)
{
    return http_reply(403, "<response><result>Error</result>" + credentials + "<error>" +
                               std::to_string(number) + "</error><message>No</message></response>");
}

const std::string content = "the bytes of a file";

std::string good_reply(const request &asked, const std::string &base)
{
    const std::string file = "<quickkey>k</quickkey><filename>name</filename><revision>1</revision>"
                             "<hash>" +
                             sha256_of(content) + "</hash><size>" + std::to_string(content.size()) +
                             "</size>";
    const std::string path = asked.path();
    if (asked.method == "POST")
        return xml_reply("<response>" + credentials +
                         "<key>file</key><result>0</result></response>");
    if (path == "/bytes")
        return http_reply(200, content);
    if (path == "/api/folder/get_info.php" && asked.parameter("folder_key") != "f")
        return refusal(112);
    if (path == "/api/folder/get_info.php")
        return success("<folder_info><folderkey>f</folderkey><name>f</name></folder_info>");
    if (path == "/api/file/get_info.php")
        return success("<file_info>" + file + "</file_info>");
    if (path == "/api/1.0/folder/get_content.php" && asked.parameter("content_type") == "files")
        return success("<files><file>" + file + "</file></files>");
    if (path == "/api/file/get_links.php")
        return success("<links><link><quickkey>k</quickkey><direct_download>" + base +
                       "/bytes</direct_download></link></links>");
    return success("<folder_key>new</folder_key><quickkey>new</quickkey>"
                   "<new_quickkey>new</new_quickkey><device_revision>1</device_revision>"
                   "<revision>1</revision><epoch>1</epoch>");
}

enum class expected { success, failure, either };

/** Something that happens to a command. */
struct trouble {
    std::string name;
    expected end = expected::failure;
    std::function<void(connection &, const request &)> answer = {}; ///< to its own request
    std::function<command(const command &)> surroundings = {};
    words options = {};

    /** A command that asks nobody does not hear of the rest. */
    expected end_without_request() const { return surroundings ? end : expected::success; }
};

/** A page that repeats what it was asked for, as many do. */
std::string page_with(const request &asked)
{
    return "<!DOCTYPE html>\n<html><body>No " + asked.target + "<br><a href=\"https://h" +
           asked.target + "\">here</a><pre>" + asked.head + "</pre></body></html>";
}

/** So much of a good reply that it ends within the secret. */
std::string cut_off_reply()
{
    const std::string whole = success("");
    return whole.substr(0, whole.find(private_key) + private_key.size());
}

std::vector<trouble> troubles()
{
    const auto sends = [](const std::string &bytes) {
        return [bytes](connection &client, const request &) { client.send(bytes); };
    };
    return {
        {"None", expected::success},
        {"NoneInJson", expected::success, {}, {}, {"--json"}},
        {"Refusal", expected::failure, sends(refusal(107))},
        {"RefusalInJson", expected::failure, sends(refusal(107)), {}, {"--json"}},
        {"ExpiredSession", expected::failure, sends(refusal(105))},
        {"RepliesWithoutAResult", expected::failure,
         sends(xml_reply("<response>" + credentials + "</response>"))},
        {"DamagedReplies", expected::failure,
         sends(xml_reply("<response><result>Success</result>" + credentials + "<damaged>"))},
        {"RepliesThatEndEarly", expected::failure, sends(cut_off_reply())},
        {"RepliesCutShort", expected::failure,
         sends(xml_reply("<response>" + credentials.substr(0, credentials.size() - 20)))},
        {"ResetConnections", expected::failure,
         [](connection &client, const request &) { client.reset(); }},
        {"EmptyReplies", expected::failure, sends(http_reply(500, ""))},
        {"NotHttp", expected::failure, sends(credentials + "\r\n\r\n")},
        {"PagesThatRepeatTheRequest", expected::failure,
         [](connection &client, const request &asked) {
             client.send(http_reply(404, page_with(asked)));
         }},
        {"Redirects", expected::failure,
         [](connection &client, const request &asked) {
             client.send(http_reply(302, page_with(asked), {"Location: ftp://h" + asked.target}));
         }},
        {"FilesThatCannotGrow",
         expected::either,
         {},
         [](const command &what) { return with_longest_file(what, 0); }},
        {"AFullStandardOutput", expected::either, {}, with_full_output},
        {"AClosedPipe", expected::either, {}, with_closed_pipe},
    };
}

class Secrets : public testing::Test {
protected:
    Secrets()
    {
        secrets.add("password", password);
        secrets.add("application key", application_key);
        secrets.add("Facebook token", facebook_token);
        secrets.add("session token", session_token);
        secrets.add("new session token", new_session_token);
        secrets.add("login token", login_token);
        secrets.add("private key", private_key);
        secrets.add("signature", login_signature(email + password, "7", application_key));
        secrets.add("signature", login_signature(facebook_token, "7", application_key));
    }

    /** A home with the files that the commands read, signed in to the server. */
    void furnish(program_home &home) const
    {
        const temporary_folder &folder = home.folder();
        folder.write("key", application_key + "\n");
        folder.write("facebook-token", facebook_token + "\n");
        folder.write("source", "other bytes");
        folder.write("ready.json", R"({"https_url": ")" + secure.base_url() +
                                       R"(", "http_url": ")" + plain.base_url() +
                                       R"(", "ca_file": ")" + test_root_path() + R"("})");
        fs::create_directory(folder.path_of("into"));
        fs::create_directory(folder.path_of("tmp"));
        home.environment["TMPDIR"] = folder.path_of("tmp");
        home.environment["QUILLMERE_EMULATOR"] = folder.path_of("ready.json");
        home.sign_in(secure.base_url(), session_token);
    }

    static command command_in(const program_home &home, const tried_command &tried,
                              const words &options)
    {
        command what = home.with({tried.name}, password + "\n");
        for (const words &more :
             {tried.arguments, {"--retries", "0", "--verbose", "--log-file", "log"}, options})
            what.arguments.insert(what.arguments.end(), more.begin(), more.end());
        what.folder = home.folder().path();
        return what;
    }

    /** Both servers answer well, but for the request that decides. */
    void serve(const tried_command &tried,
               const std::function<void(connection &, const request &)> &answer)
    {
        reached_ = 0;
        for (scripted_server *server : {&secure, &plain})
            server->script([this, tried, answer](connection &client) {
                const request asked = client.read_request();
                const bool decides =
                    tried.request == (asked.method == "POST" ? upload : asked.path());
                if (decides)
                    ++reached_;
                if (decides && answer)
                    answer(client, asked);
                else
                    client.send(good_reply(asked, secure.base_url()));
            });
    }

    size_t reached() const { return reached_; }

    void expect_hidden(const program_home &home, const outcome &ended) const
    {
        EXPECT_THAT(secrets.in(ended.out), IsEmpty()) << ended.out;
        EXPECT_THAT(secrets.in(ended.err + ended.report), IsEmpty()) << ended.err;
        const std::map<std::string, canaries::names> places = {
            {"key", {"application key"}},
            {"facebook-token", {"Facebook token"}},
            {"login-token", {"login token"}},
            {"state/quillmere/session.json", {"session token", "new session token"}},
        };
        for (const auto &[file, names] : secrets.in_files_of(home.folder().path())) {
            const auto place = places.find(file);
            EXPECT_THAT(names,
                        IsSubsetOf(place == places.end() ? canaries::names{} : place->second))
                << file;
            EXPECT_EQ(fs::status(home.folder().path_of(file)).permissions(),
                      fs::perms::owner_read | fs::perms::owner_write)
                << file;
        }
    }

    static canaries::names in_file(const canaries &sought, const program_home &home,
                                   const std::string &file)
    {
        return sought.in_files_of(home.folder().path())[file];
    }

    canaries secrets;
    scripted_server secure{tls_with(loopback_certificate())};
    scripted_server plain;

private:
    std::atomic<size_t> reached_{0};
};

void expect_end(const outcome &ended, expected end)
{
    ASSERT_TRUE(ended.exit_status) << "it did not end by itself";
    if (end == expected::success) {
        EXPECT_EQ(*ended.exit_status, 0) << ended.err;
    } else if (end == expected::failure) {
        EXPECT_NE(*ended.exit_status, 0) << ended.out;
    }
}

TEST_F(Secrets, AreTriedWithEveryCommand)
{
    for (const auto &each : quillmere::tools::commands())
        EXPECT_TRUE(
            std::any_of(std::begin(tried_commands), std::end(tried_commands),
                        [&](const tried_command &tried) { return tried.name == each.name; }))
            << each.name;
}

/** The parameter is the trouble's place. */
class SecretsInTrouble : public Secrets, public testing::WithParamInterface<size_t> {};

INSTANTIATE_TEST_SUITE_P(All, SecretsInTrouble, testing::Range(size_t{0}, troubles().size()),
                         [](const auto &tested) { return troubles()[tested.param].name; });

// Where every program takes long to start, each trouble meets some of the commands.
TEST_P(SecretsInTrouble, AreSeenNowhere)
{
    const trouble tested = troubles()[GetParam()];
    for (size_t place = GetParam() % QUILLMERE_SECRETS_STEP; place < std::size(tried_commands);
         place += QUILLMERE_SECRETS_STEP) {
        const tried_command &tried = tried_commands[place];
        SCOPED_TRACE(tried.name + " " + testing::PrintToString(tried.arguments));
        program_home home;
        furnish(home);
        serve(tried, tested.answer);
        command what = command_in(home, tried, tested.options);
        if (tested.surroundings)
            what = tested.surroundings(what);

        const outcome ended = run(what);

        expect_hidden(home, ended);
        if (!tried.is_silent)
            expect_end(ended, tried.request.empty() ? tested.end_without_request() : tested.end);
        if (!tested.surroundings) { // in some a command gives up before
            EXPECT_EQ(reached() > 0, !tried.request.empty());
        }
    }
}

TEST_F(Secrets, AreSeenNowhereWhenTheServiceCannotBeReached)
{
    const refused_port nobody;
    for (const tried_command &tried : tried_commands) {
        SCOPED_TRACE(tried.name);
        program_home home;
        furnish(home);
        home.environment["QUILLMERE_EMULATOR"] = std::nullopt;
        home.sign_in(nobody.base_url("https"), session_token);
        const words to_nobody = {"--service", nobody.base_url("https"), "--ca-file",
                                 test_root_path()};

        const outcome ended = run(command_in(home, tried, to_nobody));

        expect_hidden(home, ended);
        if (!tried.is_silent)
            expect_end(ended, tried.request.empty() ? expected::success : expected::failure);
    }
}

TEST_F(Secrets, AreNotSentToAServiceWithoutTrust)
{
    const temporary_folder folder;
    const std::string other_root =
        folder.write("other.pem", certificate_authority("Another root").root().certificate_pem());
    for (const tried_command &tried : tried_commands) {
        SCOPED_TRACE(tried.name);
        program_home home;
        furnish(home);
        serve(tried, {});

        const outcome ended = run(command_in(home, tried, {"--ca-file", other_root}));

        expect_hidden(home, ended);
        if (!tried.is_silent)
            expect_end(ended, tried.request.empty() ? expected::success : expected::failure);
        EXPECT_EQ(reached(), 0U);
    }
}

// A token goes into addresses as it is. Of one that ends early there the log would show the rest.
TEST_F(Secrets, AreRefusedWhenTheyCannotBeSent)
{
    for (const char *end : {" ", "'", "\"", "&lt;", "&gt;", "&amp;", "#", "\t"}) {
        const std::string reply =
            xml_reply("<response><result>Success</result><session_token>0" + std::string(end) +
                      new_session_token + "</session_token></response>");
        for (const tried_command &tried : tried_commands) {
            if (tried.name != "login" && tried.name != "renew")
                continue;
            program_home home;
            furnish(home);
            serve(tried, [reply](connection &client, const request &) { client.send(reply); });

            const outcome ended = run(command_in(home, tried, {}));

            EXPECT_EQ(ended.exit_status, 7) << end << ended.err;
            EXPECT_EQ(in_file(secrets, home, "state/quillmere/session.json"),
                      canaries::names{"session token"});
            expect_hidden(home, ended);
        }
    }
}

// While it waits for its answer a command can be looked at from outside.
TEST_F(Secrets, AreInNoArgumentEnvironmentOrChildAndLeftNowhereByAnInterrupt)
{
    for (const tried_command &tried : tried_commands) {
        if (tried.request.empty())
            continue;
        SCOPED_TRACE(tried.name);
        program_home home;
        furnish(home);
        std::promise<void> waits;
        std::atomic_flag said = ATOMIC_FLAG_INIT;
        serve(tried, [&](connection &client, const request &) {
            if (!said.test_and_set())
                waits.set_value();
            client.stall();
        });
        process running(command_in(home, tried, {}));
        ASSERT_EQ(waits.get_future().wait_for(patience), std::future_status::ready);

        EXPECT_THAT(secrets.in_arguments(), IsEmpty());
        EXPECT_THAT(secrets.in_environment_of(running.pid()), IsEmpty());
        EXPECT_THAT(children_of(running.pid()), IsEmpty());
        running.send_signal(SIGINT);
        const outcome ended = running.wait();

        EXPECT_EQ(ended.exit_status, 130) << ended.err;
        expect_hidden(home, ended);
        ASSERT_TRUE(secure.wait_until_idle() && plain.wait_until_idle());
    }
}

canaries::names session_after(const std::string &command)
{
    if (command == "logout")
        return {};
    return {command == "login" || command == "renew" ? "new session token" : "session token"};
}

// All that is looked for above has been there to be found.
TEST_F(Secrets, ReachTheServiceAndTheirFiles)
{
    std::string sent;
    for (const tried_command &tried : tried_commands) {
        program_home home;
        furnish(home);
        serve(tried, {});

        run(command_in(home, tried, {}));

        for (const request &asked : secure.requests())
            sent += asked.head;
        EXPECT_EQ(in_file(secrets, home, "state/quillmere/session.json"), session_after(tried.name))
            << tried.name;
        EXPECT_EQ(in_file(secrets, home, "login-token"),
                  tried.name == "login-token" ? canaries::names{"login token"} : canaries::names{});
    }

    EXPECT_EQ(secrets.in(sent),
              (canaries::names{"Facebook token", "password", "session token", "signature"}));
}

} // namespace
} // namespace quillmere_test
