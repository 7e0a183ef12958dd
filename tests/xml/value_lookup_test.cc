// Which text a lookup finds in a document.
#include "xml/lookup.h"

#include <stdio.h>
#include <sys/stat.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include <vector>

#include "support/log_capture.h"
#include "support/stdout_capture.h"

namespace quillmere_test {
namespace {

struct sought_value {
    const char *what;
    const char *xml;
    const char *sought;
    std::optional<std::string> value;
};

void PrintTo(const sought_value &each, std::ostream *out) { *out << each.what; }

class ValueLookup : public testing::TestWithParam<sought_value> {};

TEST_P(ValueLookup, FindsItsText)
{
    log_capture log;
    const sought_value &each = GetParam();

    looked_up found = look_up(each.xml, each.sought);

    EXPECT_EQ(found.value, each.value);
    EXPECT_EQ(found.parse_failed, 0);
    EXPECT_EQ(log.text(), "");
}

constexpr const char *success = "<response><result>Success</result></response>";
constexpr const char *folder = "<response><folder_info><name>x</name></folder_info></response>";
constexpr const char *keys = "<response><quickkey>A</quickkey><quickkey>B</quickkey></response>";
constexpr const char *mixed = "<response><a>one<b>two</b>three</a></response>";

INSTANTIATE_TEST_SUITE_P(
    NamesAndPaths, ValueLookup,
    testing::Values(
        sought_value{"a bare name", success, "result", "Success"},
        sought_value{"a path", success, "/result", "Success"},
        sought_value{"a longer path", folder, "/folder_info/name", "x"},
        sought_value{"a bare name at any depth", folder, "name", "x"},
        sought_value{"a path is not searched for at any depth", folder, "/name", std::nullopt},
        sought_value{"a path does not end early", folder, "/folder", std::nullopt},
        sought_value{"a parent's path finds its child's text", folder, "/folder_info", "x"},
        sought_value{"a path leaves out the root", folder, "/response/folder_info/name",
                     std::nullopt},
        sought_value{"a path needs its first slash", folder, "folder_info/name", std::nullopt},
        sought_value{"a path has no last slash", folder, "/folder_info/name/", std::nullopt},
        sought_value{"an absent name", success, "error", std::nullopt},
        sought_value{"names tell cases apart", success, "Result", std::nullopt},
        sought_value{"a name is taken whole", success, "resul", std::nullopt},
        sought_value{"a longer name", success, "results", std::nullopt},
        sought_value{"the same name elsewhere does not match a path",
                     "<response><a><c>1</c></a><b><c>2</c></b></response>", "/b/c", "2"},
        sought_value{"a path behind a sibling with children",
                     "<response><a><b><c>1</c></b></a><d>2</d></response>", "/d", "2"},
        sought_value{"a prefixed name", "<response><a:b>1</a:b></response>", "a:b", "1"},
        sought_value{"the root may have any name", "<anything><result>1</result></anything>",
                     "/result", "1"},
        sought_value{"a long path",
                     "<response><a_name_of_some_length><another_name_of_some_length>"
                     "<and_yet_another_name>deep</and_yet_another_name>"
                     "</another_name_of_some_length></a_name_of_some_length></response>",
                     "/a_name_of_some_length/another_name_of_some_length/and_yet_another_name",
                     "deep"},
        sought_value{"the empty name is the root's path",
                     "<response>root<result>1</result></response>", "", "root1"}));

INSTANTIATE_TEST_SUITE_P(
    Collecting, ValueLookup,
    testing::Values(
        sought_value{"several matches are joined", keys, "quickkey", "AB"},
        sought_value{"several matches of a path are joined", keys, "/quickkey", "AB"},
        sought_value{"matches at several depths are joined",
                     "<response><k>A</k><f><k>B</k><g><k>C</k></g></f></response>", "k", "ABC"},
        sought_value{"a path joins its own alone",
                     "<response><k>A</k><f><k>B</k></f><k>C</k></response>", "/k", "AC"},
        sought_value{"text of a child is kept and text behind it lost", mixed, "a", "onetwo"},
        sought_value{"a child that is sought itself", mixed, "b", "two"},
        sought_value{"white space before a child is kept",
                     "<response><a>\n  <b>two</b>\n  <c>three</c>\n</a></response>", "a",
                     "\n  two"},
        sought_value{"only the first end tag counts",
                     "<response><a>1<b>2<c>3</c>4</b>5</a>6</response>", "a", "123"},
        sought_value{"an empty child ends the text too", "<response><a>1<b/>2</a></response>", "a",
                     "1"},
        sought_value{"the root's text up to its first child's end",
                     "<response>\n <action>limits</action>\n <result>Success</result></response>",
                     "response", "\n limits"},
        sought_value{"an element within itself", "<response><a>1<a>2</a>3</a></response>", "a",
                     "12"},
        sought_value{"an empty element", "<response><a></a></response>", "a", std::nullopt},
        sought_value{"a self-closing element", "<response><a/></response>", "a", std::nullopt},
        sought_value{"an empty and a full element",
                     "<response><a/><a>1</a><a></a><a>2</a></response>", "a", "12"},
        sought_value{"an element of blanks", "<response><a> </a></response>", "a", " "},
        sought_value{"text after a match is not collected",
                     "<response><a>1</a>2<b>3</b></response>", "a", "1"}));

INSTANTIATE_TEST_SUITE_P(
    Markup, ValueLookup,
    testing::Values(
        sought_value{"the predefined entities",
                     "<response><a>&lt;&amp;&gt;&quot;&apos;</a></response>", "a", "<&>\"'"},
        sought_value{"character references", "<response><a>&#65;&#x42;&#xe9;</a></response>", "a",
                     "AB\xc3\xa9"},
        sought_value{"UTF-8", "<response><a>\xc3\xa9\xe2\x82\xac\xf0\x9f\x98\x80</a></response>",
                     "a", "\xc3\xa9\xe2\x82\xac\xf0\x9f\x98\x80"},
        sought_value{"a CDATA section", "<response><a>1<![CDATA[<b>&amp;</b>]]>2</a></response>",
                     "a", "1<b>&amp;</b>2"},
        sought_value{"a comment", "<response><a>1<!-- <b>no</b> -->2</a></response>", "a", "12"},
        sought_value{"a processing instruction", "<response><a>1<?no no?>2</a></response>", "a",
                     "12"},
        sought_value{"attributes", "<response><a b=\"no\" sought=\"no\">1</a></response>", "a",
                     "1"},
        sought_value{"an attribute is no element", "<response><a b=\"no\">1</a></response>", "b",
                     std::nullopt},
        sought_value{"line ends are made one", "<response><a>1\r\n2\r3\n4</a></response>", "a",
                     "1\n2\n3\n4"},
        sought_value{"a declaration",
                     "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                     "<response><a>1</a></response>\n",
                     "a", "1"},
        sought_value{"a byte order mark", "\xef\xbb\xbf<response><a>1</a></response>", "a", "1"},
        // The encoding that the library names goes before the one that the document declares.
        sought_value{"a declared encoding is overruled",
                     "<?xml version=\"1.0\" encoding=\"ISO-8859-1\"?>"
                     "<response><a>\xc3\xa9</a></response>",
                     "a", "\xc3\xa9"},
        sought_value{"an entity of the document's own",
                     "<!DOCTYPE response [<!ENTITY e \"value\">]>"
                     "<response><a>&e;</a></response>",
                     "a", "value"}));

TEST(ValueLookupOfNothing, GivesNullAndNoParseFailure)
{
    log_capture log;
    int32_t parse_failed = 77;

    EXPECT_EQ(simple_get_xml_node_value(nullptr, 10, "a", &parse_failed), nullptr);
    EXPECT_EQ(parse_failed, 0);
    parse_failed = 77;
    EXPECT_EQ(simple_get_xml_node_value("<a>1</a>", 0, "a", &parse_failed), nullptr);
    EXPECT_EQ(parse_failed, 0);
    EXPECT_EQ(log.text(), "");
}

TEST(ValueLookupLength, EndsTheDocument)
{
    const char *xml = "<r><a>1</a></r>and anything behind it";
    int32_t parse_failed = 77;

    EXPECT_EQ(taken(simple_get_xml_node_value(xml, 15, "a", &parse_failed)), "1");
    EXPECT_EQ(parse_failed, 0);
}

TEST(ValueLookupLength, CountsWithItsLow32BitsAlone)
{
    const char *xml = "<r><a>1</a></r>and anything behind it";
    int32_t parse_failed = 77;
    constexpr uint64_t beyond = uint64_t{1} << 32;

    EXPECT_EQ(taken(simple_get_xml_node_value(xml, beyond + 15, "a", &parse_failed)), "1");
    EXPECT_EQ(parse_failed, 0);

    log_capture log;
    EXPECT_EQ(taken(simple_get_xml_node_value(xml, beyond, "a", &parse_failed)), std::nullopt);
    EXPECT_EQ(parse_failed, 1);
}

TEST(ValueLookupLength, BeyondWhatTheParserTakesIsAParseFailure)
{
    log_capture log;
    int32_t parse_failed = 77;

    EXPECT_EQ(simple_get_xml_node_value("<r/>", 0x80000000u, "a", &parse_failed), nullptr);

    EXPECT_EQ(parse_failed, 1);
}

std::string parse_failure_log(const std::string &sought, const std::string &xml)
{
    return "Expat failed parsing a node with error 0\n"
           "Name of node whose value is sought: " +
           sought + "\nXML we are searching for this node:\n" + xml + "\n";
}

struct malformed_document {
    const char *what;
    const char *xml;
    std::optional<std::string> value; // of "a"
};

void PrintTo(const malformed_document &each, std::ostream *out) { *out << each.what; }

class MalformedDocument : public testing::TestWithParam<malformed_document> {};

TEST_P(MalformedDocument, IsFlaggedAndLoggedAndKeepsWhatWasFound)
{
    log_capture log;

    looked_up found = look_up(GetParam().xml, "a");

    EXPECT_EQ(found.value, GetParam().value);
    EXPECT_EQ(found.parse_failed, 1);
    EXPECT_EQ(log.text(), parse_failure_log("a", GetParam().xml));
}

INSTANTIATE_TEST_SUITE_P(
    Damages, MalformedDocument,
    testing::Values(
        malformed_document{"no XML at all", "not XML", std::nullopt},
        malformed_document{"blanks", "  \n", std::nullopt},
        malformed_document{"no end tag of the root", "<response><a>1</a>", "1"},
        malformed_document{"cut off in the text", "<response><a>12", "12"},
        malformed_document{"cut off in an end tag", "<response><a>12</", "12"},
        malformed_document{"tags that do not match", "<response><a>1</b></response>", "1"},
        malformed_document{"damage before the match", "<response><b>&</b><a>1</a></response>",
                           std::nullopt},
        malformed_document{"damage between two matches", "<response><a>1</a><<a>2</a></response>",
                           "1"},
        malformed_document{"two roots", "<response><a>1</a></response><b/>", "1"},
        malformed_document{"text behind the root", "<response><a>1</a></response>x", "1"},
        malformed_document{"an unknown entity", "<response><a>1&no;</a></response>", "1"},
        malformed_document{"bytes that are no UTF-8", "<response><a>1</a>\xff</response>", "1"},
        malformed_document{"a page of HTML",
                           "<!DOCTYPE html><html><head><meta charset=\"utf-8\">"
                           "<title>Log in</title></head></html>",
                           std::nullopt}));

// A log that looks, at each of its lines, how much of standard output has got through, and then
// prints a byte more there.
class stdout_watching_log {
public:
    stdout_watching_log()
    {
        stream_ = ::fopencookie(this, "w", {nullptr, note_line, nullptr, nullptr});
        set_quillmere_output_file(stream_);
    }
    ~stdout_watching_log()
    {
        set_quillmere_output_file(nullptr);
        std::fclose(stream_);
    }
    stdout_watching_log(const stdout_watching_log &) = delete;
    stdout_watching_log &operator=(const stdout_watching_log &) = delete;

    // How many bytes had got through at each line, and at last.
    std::vector<size_t> lengths() const
    {
        std::vector<size_t> all = lengths_;
        all.push_back(got_through());
        return all;
    }

private:
    static ssize_t note_line(void *log, const char *, size_t length)
    {
        auto *self = static_cast<stdout_watching_log *>(log);
        self->lengths_.push_back(got_through());
        std::fputc('x', stdout);
        return static_cast<ssize_t>(length);
    }

    // For a standard output that is a file.
    static size_t got_through()
    {
        struct stat found = {};
        ::fstat(STDOUT_FILENO, &found);
        return static_cast<size_t>(found.st_size);
    }

    std::FILE *stream_;
    std::vector<size_t> lengths_;
};

TEST(MalformedDocumentLog, FlushesStandardOutputAfterEachOfItsLines)
{
    stdout_capture out;
    stdout_watching_log log;

    look_up("not XML", "a");

    EXPECT_EQ(log.lengths(), (std::vector<size_t>{0, 1, 2, 3}));
}

} // namespace
} // namespace quillmere_test
