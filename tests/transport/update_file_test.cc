// The change of a file's metadata: what is sent, over which address, and what is logged.
#include "support/library_fixture.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using testing::MatchesRegex;

constexpr const char *every = "a-b_c.d~e(x)*!^\xc3\xa9&=%+ /";
constexpr const char *every_encoded = "a%2db%5fc%2ed%7ee(x)*!^%c3%a9%26%3d%25%2b%20%2f";

struct update {
    const char *token = nullptr;
    const char *key = nullptr;
    const char *filename = nullptr;
    const char *description = nullptr;
    const char *tags = nullptr;
    const char *privacy = nullptr;
    const char *mtime = nullptr;
};

struct updated {
    int32_t status;
    std::optional<std::string> message;
};

// The message holds rubbish before the call.
updated perform(const update &with)
{
    char rubbish[] = "rubbish";
    char *message = rubbish;
    int32_t status = update_file(with.token, with.key, with.filename, with.description, with.tags,
                                 with.privacy, with.mtime, &message);
    EXPECT_NE(message, rubbish);
    updated result = {status, message ? std::optional<std::string>(message) : std::nullopt};
    api_free(message);
    return result;
}

struct update_case {
    const char *name;
    update with;
    std::string query;
};

void PrintTo(const update_case &each, std::ostream *out) { *out << each.name; }

class UpdateFileRequest : public library_test, public testing::WithParamInterface<update_case> {};

TEST_P(UpdateFileRequest, IsComposedInOrder)
{
    plain_server.answer(xml_reply(success));

    updated result = perform(GetParam().with);

    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.message, std::nullopt);
    ASSERT_EQ(plain_server.requests().size(), 1u);
    EXPECT_EQ(plain_server.requests()[0].method, "GET");
    EXPECT_EQ(plain_server.requests()[0].target, "/api/file/update.php?" + GetParam().query);
    EXPECT_EQ(server.connections(), 0u);
}

TEST_P(UpdateFileRequest, IsLoggedWholeWithItsPlainToken)
{
    plain_server.answer(xml_reply(success));

    perform(GetParam().with);

    EXPECT_EQ(log.text(), "Api url:\n" + plain_server.base_url() + "/api/file/update.php?" +
                              GetParam().query + "\nGot text:\n" + success + "\n");
}

const std::string e = every_encoded;

const update_case updates[] = {
    {"every value",
     {every, every, every, every, every, every, every},
     "&session_token=" + e + "&quick_key=" + e + "&filename=" + e + "&description=" + e +
         "&tags=" + e + "&privacy=" + e + "&mtime=" + e + "&version=2"},
    {"every value empty",
     {"", "", "", "", "", "", ""},
     "&session_token=&quick_key=&description=&tags=&version=2"},
    {"no value", {}, "&session_token=&quick_key=&version=2"},
    {"the file alone", {"t", "q"}, "&session_token=t&quick_key=q&version=2"},
    {"a name", {"t", "q", "n"}, "&session_token=t&quick_key=q&filename=n&version=2"},
    {"a description",
     {"t", "q", nullptr, "d"},
     "&session_token=t&quick_key=q&description=d&version=2"},
    {"no description any more",
     {"t", "q", nullptr, ""},
     "&session_token=t&quick_key=q&description=&version=2"},
    {"tags", {"t", "q", nullptr, nullptr, "g"}, "&session_token=t&quick_key=q&tags=g&version=2"},
    {"no tags any more",
     {"t", "q", nullptr, nullptr, ""},
     "&session_token=t&quick_key=q&tags=&version=2"},
    {"privacy",
     {"t", "q", nullptr, nullptr, nullptr, "p"},
     "&session_token=t&quick_key=q&privacy=p&version=2"},
    {"a time",
     {"t", "q", nullptr, nullptr, nullptr, nullptr, "m"},
     "&session_token=t&quick_key=q&mtime=m&version=2"},
};
INSTANTIATE_TEST_SUITE_P(All, UpdateFileRequest, testing::ValuesIn(updates));

class UpdateFile : public library_test {
protected:
    updated perform_answered_by(const std::string &reply)
    {
        plain_server.answer(reply);
        return perform({"t", "q", "n"});
    }

    std::string url() const
    {
        return plain_server.base_url() +
               "/api/file/update.php?&session_token=t&quick_key=q&filename=n&version=2";
    }

    hook_recorder hook;
};

TEST_F(UpdateFile, HasItsPath) { EXPECT_STREQ(update_file_uri, "/api/file/update.php"); }

TEST_F(UpdateFile, ReadsItsPathAndTheVersionAtEveryCall)
{
    update_file_uri = "/another/path.php";
    api_version = "1.5";

    EXPECT_EQ(perform_answered_by(xml_reply(success)).status, 0);
    EXPECT_EQ(plain_server.requests().at(0).target,
              "/another/path.php?&session_token=t&quick_key=q&filename=n&version=1%2e5");
}

TEST_F(UpdateFile, IsRefusedWithTheServicesNumberAndMessage)
{
    const std::string refusal =
        "<response><result>Error</result><error>114</error><message>m</message></response>";

    updated result = perform_answered_by(xml_reply(refusal));

    EXPECT_EQ(result.status, 114);
    EXPECT_EQ(result.message, "m");
    ASSERT_EQ(hook.calls().size(), 1u);
    EXPECT_EQ(hook.calls()[0].url, url());
    EXPECT_EQ(hook.calls()[0].response, refusal);
    EXPECT_EQ(hook.calls()[0].status, 114);
    EXPECT_EQ(hook.calls()[0].message, "m");
}

TEST_F(UpdateFile, FailsWithAReplyThatIsNoEnvelope)
{
    updated result = perform_answered_by(http_reply(404, "<html/>"));

    EXPECT_EQ(result.status, QM_UNUSABLE_RESPONSE);
    EXPECT_EQ(result.message, "Response error: received server HTTP response code 404");
    EXPECT_TRUE(hook.calls().empty());
}

TEST_F(UpdateFile, FailsWithAReplyThatIsNoDocument)
{
    updated result = perform_answered_by(http_reply(404, "<html>"));

    EXPECT_EQ(result.status, QM_MALFORMED_REPLY);
    EXPECT_EQ(result.message, "Response error: received server HTTP response code 404");
}

TEST_F(UpdateFile, FailsWithoutAnAnswer)
{
    plain_server.script(closing());

    updated result = perform({"t", "q", "n"});

    EXPECT_EQ(result.status, QM_NO_RESPONSE);
    EXPECT_EQ(result.message, no_code);
    EXPECT_TRUE(hook.calls().empty());
    EXPECT_THAT(log.text(), MatchesRegex(literally("Api url:\n" + url() + "\n") + any_failure_line +
                                         literally("Got text:\n(null)\n")));
}

} // namespace
} // namespace quillmere_test
