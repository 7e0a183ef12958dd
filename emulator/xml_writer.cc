#include "xml_writer.h"

#include <stdexcept>

#include "text.h"

namespace emulator {

xml_writer::xml_writer() : document_("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n") {}

void xml_writer::open(const char *name)
{
    document_.append("<").append(name).append(">");
    open_elements_.push_back(name);
}

void xml_writer::close()
{
    document_.append("</").append(open_elements_.back()).append(">");
    open_elements_.pop_back();
}

void xml_writer::element(const char *name, std::string_view text)
{
    open(name);
    escaped(text);
    close();
}

void xml_writer::element(const char *name, std::uint64_t number)
{
    element(name, std::to_string(number));
}

std::string xml_writer::take()
{
    if (!open_elements_.empty())
        throw std::logic_error("an XML element was left open");
    return std::move(document_);
}

void xml_writer::escaped(std::string_view text)
{
    if (!is_xml_text(text))
        throw std::invalid_argument("text that XML cannot carry");
    for (const char byte : text) {
        switch (byte) {
        case '&':
            document_ += "&amp;";
            break;
        case '<':
            document_ += "&lt;";
            break;
        case '>': // only "]]>" needs it, but nobody has to look back this way
            document_ += "&gt;";
            break;
        case '\r': // a parser would turn it into a line feed
            document_ += "&#13;";
            break;
        default:
            document_ += byte;
        }
    }
}

} // namespace emulator
