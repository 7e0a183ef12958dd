// The state of the service and of the device: which elements become what.
#include <gtest/gtest.h>

#include "api/operations.h"
#include "support/library_fixture.h"

namespace quillmere_test {
namespace {

class SystemLimits : public library_test {
protected:
    ~SystemLimits() override { system_limits_delete(&limits); }

    int32_t get()
    {
        char *message = nullptr;
        int32_t status = get_system_limits(&limits, &message);
        EXPECT_EQ(message, nullptr);
        return status;
    }

    system_limits *limits = nullptr;
};

TEST_F(SystemLimits, AreReadFromTheirElements)
{
    server.answer(success_reply("<max_objects>a</max_objects><max_keys>b</max_keys>"
                                "<max_image_size>c</max_image_size>"
                                "<zip_max_filesize>d</zip_max_filesize>"
                                "<zip_max_total_filesize>e</zip_max_total_filesize>"
                                "<folder_content_chunk_size>f</folder_content_chunk_size>"
                                "<folder_depth_limit>g</folder_depth_limit>"
                                "<limit_search_results>h</limit_search_results>"
                                "<daily_shares_limit>i</daily_shares_limit>"
                                "<device_changes_list_limit>j</device_changes_list_limit>"));

    EXPECT_EQ(get(), 0);

    ASSERT_NE(limits, nullptr);
    EXPECT_STREQ(system_limits_get_max_objects(limits), "a");
    EXPECT_STREQ(system_limits_get_max_keys(limits), "b");
    EXPECT_STREQ(system_limits_get_max_image_size(limits), "c");
    EXPECT_STREQ(system_limits_get_zip_max_filesize(limits), "d");
    EXPECT_STREQ(system_limits_get_zip_max_total_filesize(limits), "e");
    EXPECT_STREQ(system_limits_get_folder_content_chunk_size(limits), "f");
    EXPECT_STREQ(system_limits_get_folder_depth_limit(limits), "g");
    EXPECT_STREQ(system_limits_get_limit_search_results(limits), "h");
    EXPECT_STREQ(system_limits_get_daily_shares_limit(limits), "i");
    EXPECT_STREQ(system_limits_get_device_changes_list_limit(limits), "j");
}

TEST_F(SystemLimits, MayLackOne)
{
    server.answer(success_reply("<max_keys>10</max_keys>"
                                "<zip_max_total_filesize>20</zip_max_total_filesize>"));

    EXPECT_EQ(get(), 0);

    ASSERT_NE(limits, nullptr);
    EXPECT_EQ(system_limits_get_zip_max_filesize(limits), nullptr);
    EXPECT_STREQ(system_limits_get_zip_max_total_filesize(limits), "20");
}

TEST_F(SystemLimits, AreSentWithoutQuery)
{
    server.answer(success_reply(""));

    get();

    EXPECT_EQ(server.requests().at(0).target, "/api/system/get_limits.php");
}

TEST_F(SystemLimits, AreNotHandedOutWhenTheReplyIsMalformed)
{
    server.answer(xml_reply("<response><result>Success</result><max_keys>10</max_keys>"
                            "<max_objects>&none;</max_objects></response>"));

    EXPECT_EQ(get(), QM_MALFORMED_REPLY);

    EXPECT_EQ(limits, nullptr);
}

class SystemStatus : public library_test {};

TEST_F(SystemStatus, IsReadFromItsElements)
{
    server.answer(success_reply("<memcache>cold</memcache><database>warm</database>"));
    system_status *status = nullptr;
    char *message = nullptr;

    EXPECT_EQ(get_system_status(&status, &message), 0);

    EXPECT_STREQ(system_status_get_database(status), "warm");
    EXPECT_STREQ(system_status_get_memcache(status), "cold");
    EXPECT_EQ(message, nullptr);
    EXPECT_EQ(server.requests().at(0).target, "/api/system/get_status.php");
    system_status_delete(&status);
}

TEST_F(SystemStatus, MayLackBoth)
{
    server.answer(success_reply(""));
    system_status *status = nullptr;
    char *message = nullptr;

    EXPECT_EQ(get_system_status(&status, &message), 0);

    ASSERT_NE(status, nullptr);
    EXPECT_EQ(system_status_get_database(status), nullptr);
    EXPECT_EQ(system_status_get_memcache(status), nullptr);
    system_status_delete(&status);
}

TEST_F(SystemStatus, MayHoldATextOf50Megabytes)
{
    const std::string text(50 * 1000 * 1000, 't');
    server.answer(success_reply("<database>" + text + "</database>"));
    system_status *status = nullptr;
    char *message = nullptr;

    EXPECT_EQ(get_system_status(&status, &message), 0);

    EXPECT_TRUE(system_status_get_database(status) == text);
    system_status_delete(&status);
}

class DeviceStatus : public library_test {
protected:
    int32_t get(uint32_t device_id = 1)
    {
        char *message = nullptr;
        int32_t status =
            get_device_status("tok&en", device_id, &revision, &jobs_in_progress, &message);
        EXPECT_EQ(message, nullptr);
        return status;
    }

    uint64_t revision = 77;
    int32_t jobs_in_progress = 77;
};

TEST_F(DeviceStatus, IsReadFromItsElements)
{
    server.answer(success_reply("<device_revision>123</device_revision>"
                                "<async_jobs_in_progress>yes</async_jobs_in_progress>"));

    EXPECT_EQ(get(), 0);

    EXPECT_EQ(revision, 123u);
    EXPECT_EQ(jobs_in_progress, 1);
}

TEST_F(DeviceStatus, IsLoggedWithItsToken)
{
    server.answer(success_reply(""));

    get();

    EXPECT_EQ(log.text(),
              "get_status url: " + server.base_url() +
                  "/api/device/get_status.php?session_token=tok&en&device_id=1&version=2\n"
                  "Got text:\n<response><result>Success</result></response>\n");
}

TEST_F(DeviceStatus, SendsItsTokenAsItIs)
{
    server.answer(success_reply(""));
    char *message = nullptr;

    get_device_status("a&b=c%20d+e", 1, &revision, &jobs_in_progress, &message);

    EXPECT_EQ(server.requests().at(0).target,
              "/api/device/get_status.php?session_token=a&b=c%20d+e&device_id=1&version=2");
}

TEST_F(DeviceStatus, KeepsTheRevisionOfAReplyThatIsMalformed)
{
    server.answer(xml_reply("<response><result>Success</result>"
                            "<device_revision>123</device_revision>"
                            "<async_jobs_in_progress>yes</async_jobs_in_progress>"));

    EXPECT_EQ(get(), QM_MALFORMED_REPLY);

    EXPECT_EQ(revision, 123u);
    EXPECT_EQ(jobs_in_progress, 1);
}

TEST_F(DeviceStatus, IsResetBeforeAnythingElse)
{
    server.script(resetting());
    char *message = nullptr;

    EXPECT_EQ(get_device_status("t", 1, &revision, &jobs_in_progress, &message), QM_NO_RESPONSE);

    EXPECT_EQ(revision, 0u);
    EXPECT_EQ(jobs_in_progress, 0);
    api_free(message);
}

TEST_F(DeviceStatus, IsNotReadFromARefusal)
{
    server.answer(xml_reply("<response><result>Error</result><error>105</error>"
                            "<device_revision>123</device_revision>"
                            "<async_jobs_in_progress>yes</async_jobs_in_progress></response>"));

    EXPECT_EQ(get(), 105);

    EXPECT_EQ(revision, 0u);
    EXPECT_EQ(jobs_in_progress, 0);
}

struct revision_text {
    const char *element;
    uint64_t revision;
};

void PrintTo(const revision_text &each, std::ostream *out) { *out << each.element; }

class DeviceRevision : public DeviceStatus, public testing::WithParamInterface<revision_text> {};

TEST_P(DeviceRevision, IsTheNumberThatTheTextBeginsWith)
{
    server.answer(success_reply(GetParam().element));

    EXPECT_EQ(get(), 0);

    EXPECT_EQ(revision, GetParam().revision);
}

INSTANTIATE_TEST_SUITE_P(
    Texts, DeviceRevision,
    testing::Values(revision_text{"<device_revision>abc</device_revision>", 0},
                    revision_text{"<device_revision>123abc</device_revision>", 123},
                    revision_text{"<device_revision> \n42</device_revision>", 42},
                    revision_text{"<device_revision>0x10</device_revision>", 0},
                    revision_text{"<device_revision>010</device_revision>", 10},
                    revision_text{"<device_revision>18446744073709551615</device_revision>",
                                  18446744073709551615u},
                    revision_text{"<device_revision>18446744073709551616</device_revision>",
                                  18446744073709551615u},
                    revision_text{"<device_revision/>", 0}, revision_text{"", 0}));

struct jobs_text {
    const char *element;
    int32_t flag;
};

void PrintTo(const jobs_text &each, std::ostream *out) { *out << each.element; }

class AsyncJobs : public DeviceStatus, public testing::WithParamInterface<jobs_text> {};

TEST_P(AsyncJobs, AreInProgressIfTheTextIsExactlyYes)
{
    server.answer(success_reply(GetParam().element));

    EXPECT_EQ(get(), 0);

    EXPECT_EQ(jobs_in_progress, GetParam().flag);
}

INSTANTIATE_TEST_SUITE_P(
    Texts, AsyncJobs,
    testing::Values(jobs_text{"<async_jobs_in_progress>yes</async_jobs_in_progress>", 1},
                    jobs_text{"<async_jobs_in_progress>no</async_jobs_in_progress>", 0},
                    jobs_text{"<async_jobs_in_progress>Yes</async_jobs_in_progress>", 0},
                    jobs_text{"<async_jobs_in_progress>yes </async_jobs_in_progress>", 0},
                    jobs_text{"<async_jobs_in_progress>true</async_jobs_in_progress>", 0},
                    jobs_text{"<async_jobs_in_progress>1</async_jobs_in_progress>", 0},
                    jobs_text{"<async_jobs_in_progress/>", 0}, jobs_text{"", 0}));

class DeviceId : public DeviceStatus, public testing::WithParamInterface<uint32_t> {};

TEST_P(DeviceId, IsSentInDecimal)
{
    server.answer(success_reply(""));

    get(GetParam());

    EXPECT_EQ(server.requests().at(0).target,
              "/api/device/get_status.php?session_token=tok&en&device_id=" +
                  std::to_string(GetParam()) + "&version=2");
}

INSTANTIATE_TEST_SUITE_P(Numbers, DeviceId, testing::Values(0, 1, 2147483648u, 4294967295u));

} // namespace
} // namespace quillmere_test
