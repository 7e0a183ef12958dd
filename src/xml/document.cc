#include "xml/document.h"

namespace quillmere {

namespace {

// Replies are small and define no entities. Beyond this much expansion expat compares it with what
// was sent, so that a few bytes cannot unfold into gigabytes.
constexpr unsigned long long unguarded_expansion = 65536; // 64 KiB

} // namespace

xml_parser new_document_parser(void *state, const document_handlers &handlers)
{
    xml_parser parser(XML_ParserCreate("UTF-8"));
    if (!parser)
        return parser;
    XML_SetBillionLaughsAttackProtectionActivationThreshold(parser.get(), unguarded_expansion);
    XML_SetUserData(parser.get(), state);
    XML_SetElementHandler(parser.get(), handlers.start, handlers.end);
    XML_SetCharacterDataHandler(parser.get(), handlers.text);
    return parser;
}

XML_Status parse_document(const xml_parser &parser, const char *xml, uint64_t length)
{
    if (!parser)
        return XML_STATUS_ERROR;
    return XML_Parse(parser.get(), xml, static_cast<int>(static_cast<uint32_t>(length)), XML_TRUE);
}

} // namespace quillmere
