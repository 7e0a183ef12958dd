// The commands on the account against a service whose every answer the test writes.
#include <functional>
#include <map>
#include <string>

#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "program.h"
#include "support/certificates.h"
#include "support/scripted_server.h"
#include "terminal.h"

namespace quillmere_test {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

using words = std::vector<std::string>;

std::string refusal(int number)
{
    return http_reply(400, "<response><result>Error</result><error>" + std::to_string(number) +
                               "</error><message>no</message></response>");
}

std::string folder(const std::string &key, const std::string &name)
{
    return "<folder><folderkey>" + key + "</folderkey><name>" + name + "</name></folder>";
}

std::string file(const std::string &key, const std::string &name)
{
    return "<file><quickkey>" + key + "</quickkey><filename>" + name + "</filename></file>";
}

class AccountService : public testing::Test {
protected:
    using replier = std::function<std::string(const request &)>;

    AccountService()
    {
        home.environment["QUILLMERE_SERVICE"] = server.base_url();
        home.environment["SSL_CERT_FILE"] = test_root_path();
        home.sign_in(server.base_url(), "token");
        server.answer_with([this](const request &asked) {
            const auto found = replies_.find(asked.path());
            return found == replies_.end() ? refusal(101) : found->second(asked);
        });
        on_listing([](const request &) { return success_reply(""); });
    }

    /** What an endpoint answers; to be said before the first run. */
    void on(const std::string &path, replier reply) { replies_[path] = std::move(reply); }
    void on(const std::string &path, const std::string &reply)
    {
        on(path, [reply](const request &) { return reply; });
    }
    void on_listing(replier reply) { on("/api/1.0/folder/get_content.php", std::move(reply)); }

    /** One chunk for the root's folders, one for its files. */
    void hold(const std::string &folders, const std::string &files)
    {
        on_listing([folders, files](const request &asked) {
            if (asked.parameter("folder_key"))
                return success_reply("");
            const bool of_folders = asked.parameter("content_type") == "folders";
            return success_reply(of_folders ? folders : files);
        });
    }

    /** How often an endpoint was asked. */
    std::size_t requests_for(const std::string &path) const
    {
        std::size_t count = 0;
        for (const request &each : server.requests())
            count += each.path() == path;
        return count;
    }

    nlohmann::json result_of(words arguments, int exit_code = 0) const
    {
        arguments.emplace_back("--json");
        const outcome ended = home.run(arguments);
        EXPECT_EQ(ended.exit_status, exit_code) << ended.out << ended.err;
        return nlohmann::json::parse(ended.out, nullptr, false);
    }

    words keys_in(const nlohmann::json &listing) const
    {
        words keys;
        for (const auto &each : listing.at("entries"))
            keys.push_back(each.at("key"));
        return keys;
    }

    scripted_server server{tls_with(loopback_certificate())};
    program_home home;

private:
    std::map<std::string, replier> replies_;
};

TEST_F(AccountService, IsListedInItsOwnOrder)
{
    hold(folder("d1", "z") + folder("d2", "a"), file("f1", "y") + file("f2", "b"));

    EXPECT_THAT(keys_in(result_of({"ls"})), ElementsAre("d1", "d2", "f1", "f2"));
    EXPECT_EQ(home.run({"ls"}).out, "z/\na/\ny\nb\n");
}

TEST_F(AccountService, IsAskedForChunksUntilOneIsNotFull)
{
    on_listing([](const request &asked) {
        const std::string number = asked.parameter("chunk").value_or("none");
        const std::string size = "<chunk_size>2</chunk_size>";
        if (asked.parameter("content_type") == "files")
            return success_reply(size + file("f" + number, "x"));
        return success_reply(size + folder("a" + number, "x") +
                             (number == "3" ? "" : folder("b" + number, "y")));
    });

    EXPECT_THAT(keys_in(result_of({"ls"})), ElementsAre("a1", "b1", "a2", "b2", "a3", "f1"));
    EXPECT_EQ(server.requests().size(), 4U);
}

TEST_F(AccountService, ThatMovesEntriesBetweenChunksShowsThemOnce)
{
    on_listing([](const request &asked) {
        const std::string size = "<chunk_size>2</chunk_size>";
        if (asked.parameter("content_type") == "files")
            return success_reply(size);
        return success_reply(size + (asked.parameter("chunk") == "1"
                                         ? folder("a", "x") + folder("b", "y")
                                         : folder("b", "y")));
    });

    EXPECT_THAT(keys_in(result_of({"ls"})), ElementsAre("a", "b"));
}

TEST_F(AccountService, ThatRepeatsItsOnlyChunkIsLeftAlone)
{
    on_listing([](const request &) {
        return success_reply("<chunk_size>1</chunk_size>" + folder("a", "x") + file("f", "y"));
    });

    EXPECT_THAT(keys_in(result_of({"ls"})), ElementsAre("a", "f"));
    EXPECT_EQ(server.requests().size(), 3U) << "folders twice, files once";
}

TEST_F(AccountService, ThatGivesNoKeyOffersNothingToNameOrRemove)
{
    hold("<folder><name>x</name></folder>", "");

    EXPECT_THAT(keys_in(result_of({"ls"})), IsEmpty());
    EXPECT_EQ(home.run({"rm", "-r", "/x"}).exit_status, 3);
    EXPECT_EQ(requests_for("/api/folder/delete.php"), 0U);
}

TEST_F(AccountService, GivesTextsAsTextsAndNumbersAsNumbers)
{
    hold("", "<file><quickkey>123</quickkey><filename>2026</filename><size>2026</size>"
             "<tags>1</tags></file>");

    const auto entry = result_of({"ls"}).at("entries").at(0);

    EXPECT_EQ(entry.at("key"), "123");
    EXPECT_EQ(entry.at("name"), "2026");
    EXPECT_EQ(entry.at("tags"), "1");
    EXPECT_EQ(entry.at("size"), 2026);
    EXPECT_TRUE(entry.at("hash").is_null());
}

TEST_F(AccountService, CannotCommandATerminalByNames)
{
    hold(folder("d", "a\xc2\x9b"
                     "2J"),
         file("f", "b&#10;c\xe2\x80\xae"));
    for (const words &arguments : {words{"ls"}, words{"ls", "-l"}}) {
        terminal_program program(home.with(arguments));

        EXPECT_EQ(program.wait(), 0);
        EXPECT_THAT(program.shown(), HasSubstr("a\\u{9b}2J"));
        EXPECT_THAT(program.shown(), HasSubstr("b\\nc\\u{202e}"));
    }
    EXPECT_EQ(home.run({"ls"}).out, "a\xc2\x9b"
                                    "2J/\nb\nc\xe2\x80\xae\n");
}

TEST_F(AccountService, CannotCommandATerminalByFailures)
{
    on("/api/folder/delete.php", http_reply(400, "<response><result>Error</result><error>9</error>"
                                                 "<message>a\xc2\x9b"
                                                 "2J</message></response>"));
    hold(folder("d", "x"), "");

    EXPECT_THAT(home.run({"rm", "-r", "/x"}).err, HasSubstr("9: a\\u{9b}2J"));
}

TEST_F(AccountService, IsAskedAgainForWhatIsOnlyRead)
{
    int asked = 0;
    on_listing([&asked](const request &) {
        return ++asked == 1 ? http_reply(503, "") : success_reply("");
    });

    EXPECT_EQ(home.run({"ls"}).exit_status, 0);
    EXPECT_EQ(asked, 3) << "folders twice, files once";
}

TEST_F(AccountService, IsAskedOnceForEveryChange)
{
    const std::map<std::string, words> changes = {
        {"/api/folder/create.php", {"mkdir", "/new"}},
        {"/api/file/create.php", {"create", "/new"}},
        {"/api/folder/delete.php", {"rm", "-r", "/d"}},
        {"/api/file/delete.php", {"rm", "/f"}},
        {"/api/folder/move.php", {"mv", "/d", "/e"}},
        {"/api/file/move.php", {"mv", "/f", "/e"}},
        {"/api/folder/copy.php", {"cp", "-r", "/d", "/e"}},
        {"/api/file/copy.php", {"cp", "/f", "/e"}},
        {"/api/folder/update.php", {"set", "/d", "--tags", "x"}},
        {"/api/file/update.php", {"set", "/f", "--tags", "x"}},
        {"/api/file/get_links.php", {"links", "/f"}},
        {"/api/folder/attach_foreign.php", {"attach", "key:k"}},
        {"/api/folder/detach_foreign.php", {"detach", "key:k"}},
        {"/api/user/renew_session_token.php", {"renew"}},
    };
    hold(folder("d", "d") + folder("e", "e"), file("f", "f"));
    for (const auto &[path, arguments] : changes)
        on(path, http_reply(503, ""));

    for (const auto &[path, arguments] : changes) {
        const outcome ended = home.run(arguments);
        EXPECT_EQ(ended.exit_status, 6) << path << ended.out << ended.err;
        EXPECT_EQ(requests_for(path), 1U);
    }
}

TEST_F(AccountService, IsAskedAgainForLinksThatItOnlyLooksUp)
{
    hold("", file("f", "f"));
    int asked = 0;
    on("/api/file/get_links.php", [&asked](const request &) {
        return ++asked % 2 == 1 ? http_reply(503, "")
                                : success_reply("<link><quickkey>f</quickkey><view>v</view></link>"
                                                "<direct_download>//d</direct_download>");
    });

    EXPECT_EQ(result_of({"links", "/f", "--type", "view"}).at("links").at(0).at("link"), "v");
    EXPECT_EQ(home.run({"links", "/f", "--download"}).out, "http://d\n");
    EXPECT_EQ(home.run({"links", "/f", "--type", "one_time_download"}).exit_status, 6);
    EXPECT_EQ(asked, 5);
}

TEST_F(AccountService, TellsWhyThereIsNoLink)
{
    hold("", file("f", "f"));
    on("/api/file/get_links.php",
       success_reply("<link><quickkey>f</quickkey><view>v</view>"
                     "<direct_download_error>118</direct_download_error>"
                     "<direct_download_error_message>empty</direct_download_error_message>"
                     "<edit_error_message>never</edit_error_message><error>7</error></link>"));

    const auto links = result_of({"links", "/f"}).at("links");

    EXPECT_EQ(links.at(0).dump(), R"({"error":null,"link":"v","message":null,"type":"view"})");
    EXPECT_EQ(links.at(1).dump(),
              R"({"error":118,"link":null,"message":"empty","type":"direct_download"})");
    EXPECT_EQ(links.at(2).dump(), R"({"error":null,"link":null,"message":"never","type":"edit"})");
    EXPECT_EQ(links.at(3).dump(), R"({"error":7,"link":null,"message":null,"type":null})");
    EXPECT_EQ(home.run({"links", "/f"}).out, "Type             Link  Message\n"
                                             "view             v     -\n"
                                             "direct_download  -     empty\n"
                                             "edit             -     never\n"
                                             "-                -     -\n");
}

TEST_F(AccountService, RefusesADownloadByNumber)
{
    hold("", file("f", "f"));
    on("/api/file/get_links.php",
       success_reply(
           "<link><direct_download_error>118</direct_download_error>"
           "<direct_download_error_message>empty</direct_download_error_message></link>"));

    const auto error = result_of({"links", "/f", "--download"}, 3).at("error");

    EXPECT_EQ(error.at("code"), 118);
    EXPECT_EQ(error.at("message"), "there is no download of f: 118: empty");
}

TEST_F(AccountService, HandsOutItsFeedInBlocks)
{
    on("/api/device/get_changes.php", [](const request &asked) {
        const std::string since = asked.parameter("revision").value_or("none");
        EXPECT_EQ(asked.parameter("device_id"), "7");
        if (since == "3")
            return success_reply("<updated><folders>" + folder("d", "") + "</folders><files>" +
                                 file("f1", "one") + file("f2", "two") +
                                 "</files></updated><device_revision>9</device_revision>");
        if (since == "9")
            return success_reply("<deleted><files>" + file("f1", "") +
                                 "</files></deleted><device_revision>12</device_revision>");
        EXPECT_EQ(since, "12");
        return success_reply("<device_revision>12</device_revision>");
    });

    const auto document = result_of({"changes", "--since", "3", "--device", "7"});

    EXPECT_EQ(document.at("since"), 3);
    EXPECT_EQ(document.at("device_revision"), 12);
    words seen;
    for (const auto &each : document.at("changes"))
        seen.push_back(std::string(each.at("change")) + " " + std::string(each.at("kind")) + " " +
                       std::string(each.at("key")));
    EXPECT_THAT(seen, ElementsAre("updated folder d", "updated file f1", "updated file f2",
                                  "deleted file f1"));
}

TEST_F(AccountService, ThatAnswersWithHalfAFeedGivesNone)
{
    on("/api/device/get_changes.php",
       xml_reply("<response><result>Success</result><updated><files>" + file("f", "x")));

    const outcome ended = home.run({"changes"});

    EXPECT_EQ(ended.exit_status, 7);
    EXPECT_THAT(ended.out, IsEmpty());
    EXPECT_EQ(server.requests().size(), 1U);
}

TEST_F(AccountService, ThatOnlyMovesLeavesAMoveWithANewNamePartlyDone)
{
    hold(folder("d", "d"), file("f", "f"));
    on("/api/file/move.php", success_reply(""));
    on("/api/file/update.php", refusal(115));

    const auto error = result_of({"mv", "/f", "/d/g"}, 8).at("error");

    EXPECT_EQ(error.at("kind"), "partly_done");
    EXPECT_EQ(error.at("code"), 115);
    EXPECT_THAT(error.at("message"), HasSubstr("moved /f under its old name, but changing f"));
}

TEST_F(AccountService, ThatNamesNoCopyLeavesItsRenamingUndone)
{
    hold(folder("d", "d"), file("f", "f"));
    on("/api/file/copy.php", success_reply(""));

    const auto error = result_of({"cp", "/f", "/d/g"}, 8).at("error");

    EXPECT_THAT(error.at("message"), HasSubstr("did not tell the new key"));
    EXPECT_EQ(requests_for("/api/file/update.php"), 0U);
}

TEST_F(AccountService, ThatCreatesTheFirstFolderAloneLeavesTheRestUndone)
{
    on("/api/folder/create.php", [](const request &asked) {
        return asked.parameter("foldername") == "a"
                   ? success_reply("<folder_key>ka</folder_key>")
                   : refusal(asked.parameter("parent_key") == "ka" ? 116 : 1);
    });

    const auto error = result_of({"mkdir", "-p", "/a/b/c"}, 8).at("error");

    EXPECT_EQ(error.at("code"), 116);
    EXPECT_THAT(error.at("message"), HasSubstr("created a, but creating the folder b"));
}

TEST_F(AccountService, ThatNamesNoNewFolderGetsNothingElsewhere)
{
    on("/api/folder/create.php", success_reply(""));

    EXPECT_EQ(home.run({"mkdir", "-p", "/a/b"}).exit_status, 8);
    EXPECT_EQ(requests_for("/api/folder/create.php"), 1U) << "b must not land in the root";
}

TEST_F(AccountService, TellsOfAKeyThatNothingHas)
{
    const auto error = result_of({"stat", "key:k"}, 3).at("error");

    EXPECT_THAT(error.at("message"), HasSubstr("reading the folder failed"));
    EXPECT_THAT(error.at("message"), HasSubstr("reading the file failed"));
}

TEST_F(AccountService, ThatFailsOtherwiseIsNotAskedForAFileInPlaceOfAFolder)
{
    on("/api/folder/get_info.php", refusal(105));

    EXPECT_EQ(home.run({"stat", "key:k"}).exit_status, 4);
    EXPECT_EQ(requests_for("/api/file/get_info.php"), 0U);
}

TEST_F(AccountService, KeepsTheOldSessionUntilItGivesAnother)
{
    const std::string before = content_of(home.session_path());
    EXPECT_EQ(home.run({"renew"}).exit_status, 3);
    EXPECT_EQ(content_of(home.session_path()), before);
}

TEST_F(AccountService, GivesTheRenewedSessionToTheNextCommand)
{
    on("/api/user/renew_session_token.php", success_reply("<session_token>fresh</session_token>"));

    EXPECT_EQ(home.run({"renew"}).exit_status, 0);
    home.run({"ls"});

    EXPECT_EQ(server.requests().back().parameter("session_token"), "fresh");
}

TEST_F(AccountService, GivesALoginTokenToAFileAlone)
{
    on("/api/user/get_login_token.php",
       success_reply("<login_token>once-only</login_token><pkey>p</pkey>"));
    const std::string path = home.folder().path_of("token");
    const words arguments = {"login-token",
                             "a@b",
                             "--password-stdin",
                             "--app-id",
                             "7",
                             "--app-key-file",
                             home.folder().write("key", "k\n"),
                             "--token-file",
                             path,
                             "--verbose"};

    const outcome ended = home.run(arguments, "pw\n");

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_EQ(content_of(path), "once-only\n");
    EXPECT_EQ((ended.out + ended.err).find("once-only"), std::string::npos);
    EXPECT_EQ(home.run(arguments, "pw\n").exit_status, 9) << "the file is there already";
}

TEST_F(AccountService, MayCutALoginTokenShort)
{
    on("/api/user/get_login_token.php",
       xml_reply("<response><result>Success</result><login_token>t</login_token>"));
    const std::string path = home.folder().path_of("token");

    const outcome ended =
        home.run({"login-token", "a@b", "--password-stdin", "--app-id", "7", "--app-key-file",
                  home.folder().write("key", "k\n"), "--token-file", path},
                 "pw\n");

    EXPECT_EQ(ended.exit_status, 7);
    EXPECT_NE(::access(path.c_str(), F_OK), 0);
}

} // namespace
} // namespace quillmere_test
