#include "xml_writer.h"

#include <stdexcept>

#include <gtest/gtest.h>

using emulator::xml_writer;

namespace {

constexpr char declaration[] = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n";

std::string written(std::string_view text)
{
    xml_writer xml;
    xml.element("t", text);
    return xml.take().substr(sizeof declaration - 1);
}

} // namespace

TEST(XmlWriter, NestsElements)
{
    xml_writer xml;
    xml.open("a");
    xml.element("b", "1");
    xml.open("c");
    xml.element("d", std::uint64_t{18446744073709551615u});
    xml.close();
    xml.close();

    EXPECT_EQ(xml.take(),
              std::string(declaration) + "<a><b>1</b><c><d>18446744073709551615</d></c></a>");
}

TEST(XmlWriter, EscapesWhatWouldBeMarkup)
{
    EXPECT_EQ(written("<a href=\"x\">'&amp;' ]]>"),
              "<t>&lt;a href=\"x\"&gt;'&amp;amp;' ]]&gt;</t>");
}

TEST(XmlWriter, KeepsCarriageReturnsAndOtherBlanks)
{
    EXPECT_EQ(written("a\r\n\tb"), "<t>a&#13;\n\tb</t>");
}

TEST(XmlWriter, PassesUtf8Through) { EXPECT_EQ(written("\xe2\x82\xac"), "<t>\xe2\x82\xac</t>"); }

TEST(XmlWriter, RefusesTextThatXmlCannotCarry)
{
    for (const char *text : {"\x01", "\x1b[0m", "\xff", "\xc3", "\xef\xbf\xbf"})
        EXPECT_THROW(written(text), std::invalid_argument);
}

TEST(XmlWriter, GivesNoDocumentWithAnOpenElement)
{
    xml_writer xml;
    xml.open("a");

    EXPECT_THROW(xml.take(), std::logic_error);
}
