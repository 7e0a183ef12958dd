// What the device change feed sends and reads, and the sample that stands in for it.
#include <cctype>
#include <string>
#include <vector>

#include "api/account_call_test.h"
#include "records/descriptions.h"

namespace quillmere_test {
namespace {

class ChangesRequest : public account_call_test,
                       public testing::WithParamInterface<request_case> {};

TEST_P(ChangesRequest, IsComposedInOrder)
{
    EXPECT_EQ(target_of(GetParam().call), GetParam().target);
}

const std::string changes_path = "/api/device/get_changes.php";

const request_case changes_requests[] = {
    {"zero", [] { return device_changes_call("t", 0, 0); },
     changes_path + "?session_token=t&revision=0&device_id=0&version=2"},
    {"largest", [] { return device_changes_call("t", UINT64_MAX, UINT32_MAX); },
     changes_path +
         "?session_token=t&revision=18446744073709551615&device_id=4294967295&version=2"},
    {"special", [] { return device_changes_call(special, 1, 2); },
     changes_path + "?session_token=" + special + "&revision=1&device_id=2&version=2"},
    {"empty", [] { return device_changes_call("", 1, 2); },
     changes_path + "?session_token=&revision=1&device_id=2&version=2"},
    {"nothing", [] { return device_changes_call(nullptr, 1, 2); },
     changes_path + "?session_token=&revision=1&device_id=2&version=2"},
};
INSTANTIATE_TEST_SUITE_P(Api, ChangesRequest, testing::ValuesIn(changes_requests), name_of_case);

class GetDeviceChanges : public account_call_test {
protected:
    call_outcome reading(const std::string &elements)
    {
        return with_elements(elements, [] { return device_changes_call("t", 1, 2); });
    }
};

TEST_F(GetDeviceChanges, ListsThemInReverse)
{
    EXPECT_EQ(reading("<updated><files><file><quickkey>a</quickkey><revision>1</revision></file>"
                      "</files></updated><deleted><folders><folder><folderkey>b</folderkey>"
                      "<revision>2</revision></folder></folders></deleted>"),
              accepted("revision=0 count=2 block=0 "
                       "changes{2 deleted folder: key=b}{1 updated file: key=a}"));
}

TEST_F(GetDeviceChanges, HasAnEmptyListWithoutChanges)
{
    EXPECT_EQ(reading("<updated/><device_revision>5</device_revision>"),
              accepted("revision=5 count=0 block=0 changes{}"));
}

TEST_F(GetDeviceChanges, ReadsItsNumbers)
{
    EXPECT_EQ(reading("<device_revision>18446744073709551615</device_revision>"
                      "<changes_list_block>500 and more</changes_list_block>"),
              accepted("revision=18446744073709551615 count=0 block=500 changes{}"));
    EXPECT_EQ(reading("<device_revision>x</device_revision>"
                      "<changes_list_block>x</changes_list_block>"),
              accepted("revision=0 count=0 block=0 changes{}"));
    EXPECT_EQ(reading("<recent_changes_limit>5</recent_changes_limit>"),
              accepted("revision=0 count=0 block=0 changes{}"));
}

TEST_F(GetDeviceChanges, ReadsAFeedOfFiveHundredEntries)
{
    std::string feed;
    std::string listed;
    for (int index = 0; index < 500; ++index) {
        std::string number = std::to_string(index);
        feed += "<file><quickkey>k</quickkey><revision>" + number + "</revision></file>";
        listed = "{" + number + " deleted file: key=k}" + listed;
    }

    EXPECT_EQ(reading(feed), accepted("revision=0 count=500 block=0 changes" + listed));
}

TEST_F(GetDeviceChanges, IsMalformedWithOneChangeInsideAnother)
{
    hook_recorder hook;
    call_outcome outcome = reading("<file><quickkey>done</quickkey></file><file><file/></file>"
                                   "<device_revision>5</device_revision>");

    EXPECT_EQ(outcome, (call_outcome{QM_MALFORMED_REPLY, std::nullopt,
                                     "revision=5 count=1 block=0 changes=deleted"}));
    EXPECT_TRUE(hook.calls().empty());
}

// The entries of the sample, of which only the first is a fixed one.
class SampleChanges : public account_call_test {
protected:
    SampleChanges()
    {
        char *message = nullptr;
        uint64_t revision = 0;
        uint32_t count = 0;
        int32_t block_size = 0;
        test_get_device_changes("t", 0, 0, &revision, &changes, &count, &block_size, &message);
        for (const change_list *node = changes->next; node; node = node->next)
            entries.insert(entries.begin(), node->record);
    }
    ~SampleChanges() override { delete_all_change_list(&changes); }

    change_list *changes = nullptr;
    std::vector<const change_info *> entries; // as they stand in the reply
};

bool is_key(const char *text, size_t length)
{
    std::string key = text ? text : "";
    for (char letter : key)
        if (!std::isdigit(letter) && !std::islower(letter))
            return false;
    return key.size() == length;
}

TEST_F(SampleChanges, AreTheSameWhateverIsAsked)
{
    for (call_outcome outcome :
         {sample_changes_call("t", 1, 2), sample_changes_call("", UINT64_MAX, UINT32_MAX),
          sample_changes_call(nullptr, 0, 0)}) {
        EXPECT_EQ(outcome.status, QM_OK);
        EXPECT_EQ(outcome.message, std::nullopt);
        EXPECT_EQ(outcome.results.find("revision=59 count=17 block=0 changes{"), 0u);
    }
}

TEST_F(SampleChanges, AskNobody)
{
    sample_changes_call("t", 1, 2);

    EXPECT_EQ(server.connections(), 0u);
    EXPECT_EQ(plain_server.connections(), 0u);
}

TEST_F(SampleChanges, CallNoHook)
{
    hook_recorder hook;

    sample_changes_call("t", 1, 2);

    EXPECT_TRUE(hook.calls().empty());
}

TEST_F(SampleChanges, BeginWithOneUpdatedFile)
{
    ASSERT_EQ(entries.size(), 17u);
    EXPECT_EQ(description_of(entries.front()),
              "2 updated file: key=fk6a6h3kv3s46yb parent_folderkey=y3dyu25r85iji");
}

TEST_F(SampleChanges, GoOnWithFourteenDeletedFilesAndTwoDeletedFolders)
{
    ASSERT_EQ(entries.size(), 17u);
    for (size_t index = 1; index < entries.size(); ++index) {
        bool folder = index > 14;
        EXPECT_EQ(change_info_get_changetype(entries[index]), 0);
        EXPECT_EQ(change_info_get_is_folder(entries[index]), folder ? 1 : 0);
        EXPECT_TRUE(is_key(change_info_get_key(entries[index]), folder ? 13 : 15));
        EXPECT_TRUE(is_key(change_info_get_parent_folderkey(entries[index]), 13));
        EXPECT_GT(change_info_get_revision(entries[index]), 0u);
    }
}

TEST_F(SampleChanges, EndWithAFolderThatIsItsOwnParentTwice)
{
    ASSERT_EQ(entries.size(), 17u);
    std::string key = change_info_get_key(entries[15]);

    EXPECT_STREQ(change_info_get_parent_folderkey(entries[15]), key.c_str());
    EXPECT_STREQ(change_info_get_key(entries[16]), key.c_str());
    EXPECT_STREQ(change_info_get_parent_folderkey(entries[16]), key.c_str());
}

// The reply is to be had from the log alone.
class SampleReply : public account_call_test {
protected:
    std::string logged()
    {
        sample_changes_call("to&ken", 12, 34);
        return log.text();
    }

    const std::string heading =
        "get_changes url: " + server.base_url() +
        "/api/device/get_changes.php?session_token=to&ken&revision=12&device_id=34&version=2\n"
        "Got text:\n";
    const std::string counts = "\nxml extract: num changes: 0\nxml extract: num changes: 17\n";
};

TEST_F(SampleReply, IsLoggedBehindTheUrl)
{
    constexpr size_t sample_length = 2399;
    std::string lines = logged();

    ASSERT_EQ(lines.size(), heading.size() + sample_length + counts.size());
    EXPECT_EQ(lines.substr(0, heading.size()), heading);
    EXPECT_EQ(lines.substr(heading.size() + sample_length), counts);
}

TEST_F(SampleReply, IsOneLineBehindItsDeclaration)
{
    std::string reply = logged().substr(heading.size());
    const std::string start = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                              "<response><action>device/get_changes</action><updated><files>"
                              "<file><quickkey>fk6a6h3kv3s46yb</quickkey><revision>2</revision>"
                              "<parent_folderkey>y3dyu25r85iji</parent_folderkey></file></files>"
                              "</updated><deleted><files><file><quickkey>";
    const std::string end = "</folder></folders></deleted><device_revision>59</device_revision>"
                            "<changes_list_block>500</changes_list_block>"
                            "<result>Success</result>"
                            "<current_api_version>2.13</current_api_version></response>" +
                            counts;

    EXPECT_EQ(reply.substr(0, start.size()), start);
    EXPECT_EQ(reply.substr(reply.size() - end.size()), end);
    EXPECT_EQ(reply.find('\n', reply.find('\n') + 1), reply.size() - counts.size());
}

TEST_F(SampleReply, FollowsPathAndVersionAsTheFeedDoes)
{
    const char *path_before = get_device_changes_uri;
    get_device_changes_uri = "/elsewhere";
    api_version = "9";

    std::string lines = logged();
    get_device_changes_uri = path_before;

    EXPECT_EQ(lines.substr(0, lines.find('\n')),
              "get_changes url: " + server.base_url() +
                  "/elsewhere?session_token=to&ken&revision=12&device_id=34&version=9");
}

} // namespace
} // namespace quillmere_test
