// A very long document goes to the parser in pieces, and nobody can tell.
#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

#include "support/resources.h"
#include "xml/document.h"

namespace quillmere_test {
namespace {

using quillmere::document_handlers;
using quillmere::new_document_parser;
using quillmere::parse_document;
using quillmere::xml_parser;

constexpr size_t very_long = 1200 * 1000; // bytes, more than the parser is given at once

// What the parser has reported, call by call, and how it ended.
struct report {
    std::vector<std::string> calls;
    XML_Status status = XML_STATUS_ERROR;
    XML_Error error = XML_ERROR_NONE;
};

void add(void *calls, const std::string &call)
{
    static_cast<report *>(calls)->calls.push_back(call);
}

extern "C" {
static void start_element(void *calls, const char *element, const char **attributes)
{
    add(calls, std::string("<") + element + (*attributes ? attributes[1] : ""));
}

static void end_element(void *calls, const char *element)
{
    add(calls, "/" + std::string(element));
}

static void take_text(void *calls, const char *text, int length)
{
    add(calls, std::string(text, static_cast<size_t>(length)));
}
}

template <class Parse> report report_of(Parse parse)
{
    report result;
    xml_parser parser = new_document_parser(&result, {start_element, end_element, take_text});
    result.status = parse(parser);
    result.error = XML_GetErrorCode(parser.get());
    return result;
}

void expect_no_difference(const std::string &xml)
{
    report whole = report_of([&](const xml_parser &parser) {
        return XML_Parse(parser.get(), xml.data(), static_cast<int>(xml.size()), XML_TRUE);
    });

    report read = report_of(
        [&](const xml_parser &parser) { return parse_document(parser, xml.data(), xml.size()); });

    EXPECT_EQ(read.status, whole.status);
    EXPECT_EQ(read.error, whole.error);
    EXPECT_TRUE(read.calls == whole.calls);
}

// Repeats such parts, in an order of chance, until the document is very long.
std::string very_long_document(const std::vector<std::string> &parts)
{
    std::mt19937 random(20261121);
    std::string xml = "<?xml version=\"1.0\" encoding=\"utf-8\"?><r>";
    while (xml.size() < very_long)
        xml += parts[random() % parts.size()];
    return xml + "</r>";
}

const std::vector<std::string> plain_parts = {
    "<a>1</a>",    "<b></b>",          "<c/>",      "<d e=\"&gt;>\">x</d>",
    "<f>a>b]</f>", "<g>\r\n \r</g>\n", "why? now!", "<h>\xc3\xa9&#233;&amp;<i>]]</i>></h>\r",
};

// To the plain parts, in the middle of the document.
std::string very_long_document_around(const std::string &part)
{
    std::string xml = very_long_document(plain_parts);
    size_t middle = xml.find("<a>", xml.size() / 2);
    return xml.insert(middle, part);
}

class VeryLongDocument : public testing::TestWithParam<std::string> {};

INSTANTIATE_TEST_SUITE_P(Around, VeryLongDocument,
                         testing::Values("", "<!-- ><a> -->", "<![CDATA[12><34]]>", "<?p ><a> ?>",
                                         "<a b='><c'/>", "<a b='>", "]]>", "<a></b>", "&unknown;",
                                         "<", "\xff", "</r>"));

TEST_P(VeryLongDocument, IsReadAsIfInOnePiece)
{
    expect_no_difference(very_long_document_around(GetParam()));
}

TEST_P(VeryLongDocument, IsReadAsIfInOnePieceWhenItIsCutOff)
{
    const std::string whole = very_long_document_around(GetParam());

    for (const size_t missing : {size_t{1}, size_t{5}})
        expect_no_difference(whole.substr(0, whole.size() - missing));
}

TEST(VeryLongDocumentOfOneSection, IsReadAsIfInOnePiece)
{
    std::string section;
    while (section.size() < very_long)
        section += "12><34";

    expect_no_difference("<r><![CDATA[" + section + "]]></r>");
}

TEST(VeryLongDocumentOfOneText, IsReadAsIfInOnePiece)
{
    expect_no_difference("<r>" + std::string(very_long, '>') + "</r>");
}

TEST(VeryLongDocumentOfTags, IsNotHeldTwice)
{
    constexpr size_t length = 50 * 1000 * 1000;
    std::string xml = "<r>";
    xml.reserve(length + 100);
    while (xml.size() < length)
        xml += "<file><quickkey>a key</quickkey></file>";
    xml += "</r>";
    xml_parser parser = new_document_parser(nullptr, {nullptr, nullptr, nullptr});
    const size_t before = peak_resident_bytes();

    XML_Status status = parse_document(parser, xml.data(), xml.size());

    EXPECT_EQ(status, XML_STATUS_OK);
    EXPECT_LT(peak_resident_bytes() - before, length / 2);
}

} // namespace
} // namespace quillmere_test
