#include "xml/document.h"

#include <sys/random.h>

namespace quillmere {

namespace {

// Replies are small and define no entities. Beyond this much expansion expat compares it with what
// was sent, so that a few bytes cannot unfold into gigabytes.
constexpr unsigned long long unguarded_expansion = 65536; // 64 KiB

// For the hashes of names, against replies that are made to slow their tables down. Drawn once for
// the process, since drawing is what costs most in making a parser; without one, which is 0, expat
// draws one for every document.
unsigned long drawn_salt()
{
    unsigned long salt = 0;
    while (salt == 0)
        if (getrandom(&salt, sizeof salt, GRND_NONBLOCK) != static_cast<ssize_t>(sizeof salt))
            return 0;
    return salt;
}

unsigned long hash_salt()
{
    static const unsigned long salt = drawn_salt();
    return salt;
}

} // namespace

xml_parser new_document_parser(void *state, const document_handlers &handlers)
{
    xml_parser parser(XML_ParserCreate("UTF-8"));
    if (!parser)
        return parser;
    XML_SetBillionLaughsAttackProtectionActivationThreshold(parser.get(), unguarded_expansion);
    XML_SetHashSalt(parser.get(), hash_salt());
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
