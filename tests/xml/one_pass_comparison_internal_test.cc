// One pass finds and logs what a pass for each question finds and logs, in whatever document.
#include <gtest/gtest.h>

#include <random>

#include "xml/one_pass_comparison.h"

namespace quillmere_test {
namespace {

struct question {
    std::string xml;
    std::vector<std::string> sought;
};

const question questions[] = {
    {"<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<response>\n <action>a</action>\n"
     " <folder_info>\n  <name>n &amp; m</name><tags/><created a='1'>c</created>\n"
     "  <owner><name>o</name> rest</owner>\n </folder_info>\n <result>Success</result>\n"
     "</response>\n",
     {"result", "/result", "name", "/folder_info/name", "/folder_info/owner/name",
      "/folder_info/tags", "/folder_info", "response"}},
    {"<r>a<k>b<k>c</k>d</k>e<k>f</k>g<l><k>h</k>i</l></r>",
     {"k", "/k", "/k/k", "/l/k", "k", "r", "/r", "l"}},
    {"<r><k><![CDATA[<k>]]>&#233;\r\n<!-- k -->&lt;<?k k?>\xc3\xa9</k><k/><k> </k></r>",
     {"k", "/k", "r", "", "/", "//", "/r/k", "K"}},
    {"<!DOCTYPE r [<!ENTITY e 'x<k>y</k>z'><!ATTLIST k a CDATA 'b'>]><r><k>&e;&e;</k>&e;</r>",
     {"k", "/k", "/k/k", "r"}},
    {"<r><error>12</error><message>No\nmore</message><result>Error</result></r>",
     {"result", "/error", "/message", "error", "message"}},
    {"<r><a-name-that-is-longer-than-all-the-paths-that-are-sought-in-any-reply>1<b>2</b>3"
     "</a-name-that-is-longer-than-all-the-paths-that-are-sought-in-any-reply><b>4</b></r>",
     {"/a-name-that-is-longer-than-all-the-paths-that-are-sought-in-any-reply",
      "a-name-that-is-longer-than-all-the-paths-that-are-sought-in-any-reply",
      "/a-name-that-is-longer-than-all-the-paths-that-are-sought-in-any-reply/b", "/b", "b"}},
    {"<r><folder><folderkey>k1</folderkey><name>n</name><name>m</name><folder><tags>t</tags>"
     "</folder><flag>1</flag></folder><file><quickkey>q</quickkey><desc>d</desc><x><size>9</size>"
     "2</x><folder><file><hash>h</hash></file><name>late</name></folder></file><name>out</name>"
     "<file/><chunk_size>7</chunk_size></r>",
     {"chunk_size", "result", "name", "folder", "/folder/name"}},
    {"<r><file><quickkey>early</quickkey></file><updated><files><file><quickkey>q</quickkey>"
     "<revision>12&#32;</revision><revision>1&amp;3</revision><folderkey>no</folderkey><folders>"
     "<folderkey>yes</folderkey></folders></file></files></updated><deleted><folders><folder>"
     "<folderkey>k</folderkey><created>no</created><quickkey>no</quickkey><parent_folderkey>p"
     "</parent_folderkey><revision> 99999999999999999999999999999999999999999</revision></folder>"
     "</folders></deleted><device_revision>59</device_revision></r>",
     {"device_revision", "result", "revision", "/file/quickkey"}},
    {"<r><files><file><quickkey>q</quickkey></file><file><revision>1</revision><folder/></file>"
     "</files></r>",
     {"quickkey", "revision"}},
    {"<r><error>5</error><links><link><quickkey>q</quickkey><error>6</error><link><view>v</view>"
     "</link><edit>lost</edit></link><link><direct_download>d</direct_download>"
     "<direct_download_error>e</direct_download_error></link></links><view>none</view></r>",
     {"error", "/error", "/links/link/error", "direct_download_error"}},
    {"", {"result"}},
    {"not XML", {"result"}},
};

void expect_no_difference(const std::string &xml, const std::vector<std::string> &sought)
{
    EXPECT_EQ(one_pass_difference(xml, sought), "") << xml;
}

class OnePass : public testing::TestWithParam<question> {};

INSTANTIATE_TEST_SUITE_P(Documents, OnePass, testing::ValuesIn(questions));

TEST_P(OnePass, FindsAndLogsWhatSeparatePassesDo)
{
    expect_no_difference(GetParam().xml, GetParam().sought);
}

TEST_P(OnePass, DoesSoWhereverTheDocumentIsCutOff)
{
    const std::string &whole = GetParam().xml;

    for (size_t length = 0; length < whole.size(); ++length)
        expect_no_difference(whole.substr(0, length), GetParam().sought);
}

// The same bytes in every run. Most of these documents are damaged, some only changed.
TEST_P(OnePass, DoesSoWhateverBytesAreChanged)
{
    constexpr const char bytes[] = "<>/& ;ak\0\n\xc3\xff'!-]";
    std::mt19937 random(20261121);
    const std::string &whole = GetParam().xml;

    for (size_t round = 0; round < 2 * whole.size(); ++round) {
        std::string changed = whole;
        for (size_t changes = 1 + random() % 2; changes > 0; --changes)
            changed[random() % whole.size()] = bytes[random() % (sizeof bytes - 1)];
        expect_no_difference(changed, GetParam().sought);
    }
}

constexpr const char *names[] = {"r",        "file",      "folder", "link",    "files",
                                 "folders",  "updated",   "name",   "tags",    "quickkey",
                                 "revision", "folderkey", "view",   "deleted", "error"};

void add_element(std::mt19937 &random, int depth, std::string &xml)
{
    const std::string name = names[random() % std::size(names)];
    xml += "<" + name + ">";
    for (size_t parts = random() % (depth > 5 ? 1 : 5); parts > 0; --parts)
        if (random() % 3 == 0)
            xml += std::to_string(random() % 1000);
        else
            add_element(random, depth + 1, xml);
    xml += "</" + name + ">";
}

TEST(OnePass, FindsAndLogsWhatSeparatePassesDoInDocumentsMadeAtRandom)
{
    std::mt19937 random(20261121);
    for (int round = 0; round < 1000; ++round) {
        std::string xml;
        add_element(random, 0, xml);
        std::vector<std::string> sought;
        for (size_t i = 0; i < most_sought; ++i) {
            std::string path = "/" + std::string(names[random() % std::size(names)]);
            if (random() % 2 == 0)
                path += "/" + std::string(names[random() % std::size(names)]);
            sought.push_back(random() % 2 == 0 ? path.substr(path.rfind('/') + 1) : path);
        }
        expect_no_difference(xml, sought);
    }
}

} // namespace
} // namespace quillmere_test
