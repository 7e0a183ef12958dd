#include <gtest/gtest.h>

#include <cstddef>
#include <string>
#include <vector>

#include "quillmere.h"
#include "records/descriptions.h"
#include "support/log_capture.h"
#include "xml/counting.h"

namespace quillmere_test {
namespace {

using texts = std::vector<std::string>;

constexpr int32_t untouched = -77;

class FileLinksReading : public testing::Test {
protected:
    ~FileLinksReading() override { delete_all_file_links_list(&links); }

    uint32_t read(const char *xml, uint64_t length)
    {
        return simple_extract_file_links(xml, length, links, &link_count);
    }
    uint32_t read(const std::string &xml) { return read(xml.data(), xml.size()); }

    log_capture log;
    file_links_list *links = file_links_list_new();
    int32_t link_count = untouched;
};

TEST_F(FileLinksReading, ListsLinksInReverse)
{
    EXPECT_EQ(read("<response><links><link><quickkey>a</quickkey></link>"
                   "<link><quickkey>b</quickkey></link><link><quickkey>c</quickkey></link></links>"
                   "</response>"),
              0u);

    EXPECT_EQ(link_count, 3);
    EXPECT_EQ(descriptions_of(links), (texts{"quickkey=c", "quickkey=b", "quickkey=a"}));
    EXPECT_EQ(log.text(), "xml extract: found link\nxml extract: found link\n"
                          "xml extract: found link\nxml extract: num_file_links 3\n");
}

TEST_F(FileLinksReading, TakesThirteenElements)
{
    read("<r><link><quickkey>01</quickkey><view>02</view><listen>03</listen><watch>04</watch>"
         "<normal_download>05</normal_download><direct_download>06</direct_download>"
         "<direct_download_error_message>07</direct_download_error_message>"
         "<direct_download_error>08</direct_download_error><edit>09</edit>"
         "<edit_error_message>10</edit_error_message><one_time_download>11</one_time_download>"
         "<one_time_download_error_message>12</one_time_download_error_message>"
         "<error>13</error></link></r>");

    EXPECT_EQ(descriptions_of(links),
              texts{"quickkey=01 view=02 listen=03 watch=04 normal_download=05 direct_download=06 "
                    "direct_download_error_message=07 direct_download_error=08 edit=09 "
                    "edit_error_message=10 one_time_download=11 "
                    "one_time_download_error_message=12 error=13"});
}

TEST_F(FileLinksReading, KeepsARefusalBesideAMissingLink)
{
    read("<r><link><quickkey>k</quickkey><direct_download_error>12</direct_download_error>"
         "<direct_download_error_message>No bandwidth</direct_download_error_message></link></r>");

    EXPECT_EQ(descriptions_of(links), texts{"quickkey=k direct_download_error_message=No bandwidth "
                                            "direct_download_error=12"});
}

TEST_F(FileLinksReading, HasNullForAMissingAndForAnEmptyElement)
{
    read("<r><link><view>v</view><watch/><edit></edit></link></r>");

    EXPECT_EQ(descriptions_of(links), texts{"view=v"});
}

TEST_F(FileLinksReading, PassesOverUnknownElements)
{
    read("<r><link><edit_error>x</edit_error><one_time>x</one_time><download>x</download>"
         "<View>x</View><link_type>x</link_type></link></r>");

    EXPECT_EQ(descriptions_of(links), texts{""});
}

TEST_F(FileLinksReading, TakesTheNameOfALinkExactly)
{
    read("<r><links/><Link/><link2/><alink/></r>");

    EXPECT_EQ(link_count, 0);
    EXPECT_EQ(log.text(), "xml extract: num_file_links 0\n");
}

TEST_F(FileLinksReading, JoinsPiecesAndRepeatedElements)
{
    read("<r><link><view>http://h/?a=1&amp;b=2</view><edit>x</edit><view>+more</view></link></r>");

    EXPECT_EQ(descriptions_of(links), texts{"view=http://h/?a=1&b=2+more edit=x"});
}

TEST_F(FileLinksReading, StartsEveryLinksTextsAnew)
{
    read("<r><link><view>a long &amp; winding text</view></link>"
         "<link><view>a</view><view>b</view></link></r>");

    EXPECT_EQ(descriptions_of(links), (texts{"view=ab", "view=a long & winding text"}));
}

TEST_F(FileLinksReading, EndsAnElementsTextAtAChild)
{
    read("<r><link>x<view>before<b>inside</b>behind</view>y</link></r>");

    EXPECT_EQ(descriptions_of(links), texts{"view=before"});
}

TEST_F(FileLinksReading, IgnoresTextsBesideTheLinks)
{
    EXPECT_EQ(read("<r><error>1</error><link><quickkey>k</quickkey></link><error>2</error>"
                   "<view>3</view></r>"),
              0u);

    EXPECT_EQ(descriptions_of(links), texts{"quickkey=k"});
}

TEST_F(FileLinksReading, ReplacesALinkInsideWhichAnotherStarts)
{
    EXPECT_EQ(read("<r><link><quickkey>outer</quickkey><link><quickkey>inner</quickkey></link>"
                   "<view>late</view></link></r>"),
              0u);

    EXPECT_EQ(descriptions_of(links), texts{"quickkey=inner"});
}

TEST_F(FileLinksReading, CountsWhatItLists)
{
    read("<r><link><link/></link></r>");

    EXPECT_EQ(link_count, 1);
    EXPECT_EQ(log.text(), "xml extract: found link\nxml extract: num_file_links 1\n");
}

TEST_F(FileLinksReading, TouchesNothingWithoutText)
{
    EXPECT_EQ(read(nullptr, 5), 0u);
    EXPECT_EQ(read("<r><link/></r>", 0), 0u);

    EXPECT_EQ(link_count, untouched);
    EXPECT_EQ(links->next, nullptr);
    EXPECT_EQ(log.text(), "");
}

TEST_F(FileLinksReading, ReadsNoFurtherThanItsLength)
{
    std::string xml = "<r><link/></r>";

    EXPECT_EQ(read((xml + "trailing rubbish").c_str(), xml.size()), 0u);

    EXPECT_EQ(link_count, 1);
}

TEST_F(FileLinksReading, GoesByTheLow32BitsOfTheLength)
{
    std::string xml = "<r><link/></r>";

    EXPECT_EQ(read(xml.c_str(), xml.size() + (uint64_t{1} << 32)), 0u);

    EXPECT_EQ(link_count, 1);
}

TEST_F(FileLinksReading, KeepsWhatWasFinishedBeforeDamage)
{
    EXPECT_EQ(read("<r><link><quickkey>a</quickkey></link><link><quickkey>open</quickkey></r>"),
              1u);

    EXPECT_EQ(link_count, 1);
    EXPECT_EQ(descriptions_of(links), texts{"quickkey=a"});
    EXPECT_EQ(log.text(), "xml extract: found link\nxml extract: num_file_links 1\n");
}

TEST_F(FileLinksReading, ReportsWhatIsNoXml)
{
    EXPECT_EQ(read("no markup"), 1u);

    EXPECT_EQ(link_count, 0);
    EXPECT_EQ(log.text(), "xml extract: num_file_links 0\n");
}

TEST_F(FileLinksReading, ReportsADocumentCutOffAnywhere)
{
    const std::string whole = "<r><link><quickkey>a</quickkey><view>b&amp;c</view></link>"
                              "<link><error>7</error></link></r>";

    for (size_t length = 1; length < whole.size(); ++length) {
        std::string part = whole.substr(0, length);
        EXPECT_EQ(read(part), 1u) << part;
        EXPECT_EQ(link_count, occurrences("</link>", part)) << part;
    }
}

TEST(LinksState, HasThePublicLayout)
{
    EXPECT_EQ(offsetof(links_state, current_link), 0u);
    EXPECT_EQ(offsetof(links_state, links), 8u);
    EXPECT_EQ(offsetof(links_state, in_link), 16u);
    EXPECT_EQ(offsetof(links_state, current_element), 24u);
    EXPECT_EQ(offsetof(links_state, link_count), 32u);
    EXPECT_EQ(sizeof(links_state), 40u);
}

class LinksCallbacks : public testing::Test {
protected:
    LinksCallbacks() { state.links = file_links_list_new(); }
    ~LinksCallbacks() override
    {
        api_free(state.current_element);
        file_links_delete(&state.current_link);
        delete_all_file_links_list(&state.links);
    }

    void start(const char *element)
    {
        simple_extract_links_node_value_start(&state, element, nullptr);
    }
    void end(const char *element) { simple_extract_links_node_value_end(&state, element); }
    void data(const std::string &text)
    {
        simple_extract_links_node_value_data(&state, text.data(),
                                             static_cast<int32_t>(text.size()));
    }

    log_capture log;
    links_state state = {};
};

TEST_F(LinksCallbacks, OpenALink)
{
    start("link");

    EXPECT_EQ(state.in_link, 1);
    EXPECT_EQ(description_of(state.current_link), "");
    EXPECT_STREQ(state.current_element, "link");
}

TEST_F(LinksCallbacks, OpenNothingForAnotherElement)
{
    start("links");

    EXPECT_EQ(state.in_link, 0);
    EXPECT_EQ(state.current_link, nullptr);
    EXPECT_STREQ(state.current_element, "links");
}

TEST_F(LinksCallbacks, AppendPiecesOfText)
{
    start("link");
    start("view");
    data("pie");
    data("ces");

    EXPECT_EQ(description_of(state.current_link), "view=pieces");
}

TEST_F(LinksCallbacks, ListAFinishedLink)
{
    start("link");
    file_links *link = state.current_link;

    end("link");

    ASSERT_NE(state.links->next, nullptr);
    EXPECT_EQ(state.links->next->record, link);
    EXPECT_EQ(state.current_link, nullptr);
    EXPECT_EQ(state.in_link, 0);
    EXPECT_EQ(state.link_count, 1);
    EXPECT_EQ(state.current_element, nullptr);
    EXPECT_EQ(log.text(), "xml extract: found link\n");
}

TEST_F(LinksCallbacks, ForgetTheElementAtAnyEnd)
{
    start("link");
    start("view");

    end("view");
    data("behind");

    EXPECT_EQ(state.current_element, nullptr);
    EXPECT_EQ(state.in_link, 1);
    EXPECT_EQ(description_of(state.current_link), "");
}

TEST_F(LinksCallbacks, IgnoreTextWithoutALink)
{
    start("error");

    data("stray");

    EXPECT_EQ(state.current_link, nullptr);
}

} // namespace
} // namespace quillmere_test
