#include "xml/document.h"

#include <climits>
#include <cstring>

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

// expat copies what it is given. So a very long document goes to it in pieces, for all of which
// one buffer of 64 KiB is enough: expat wants room for a piece and for 1 KiB before it. Behind each
// piece it counts the lines, which for shorter ones would cost more than the copy.
constexpr size_t longest_whole = 1024 * 1024;
constexpr size_t longest_piece = 60 * 1024;

bool has_markup(const char *xml, size_t length, char kind)
{
    const char *end = xml + length;
    for (const void *found = std::memchr(xml, kind, length); found;) {
        const char *at = static_cast<const char *>(found);
        if (at > xml && at[-1] == '<')
            return true;
        found = std::memchr(at + 1, kind, static_cast<size_t>(end - at - 1));
    }
    return false;
}

// Whether there is nothing but tags and text behind a declaration. Then nothing goes on past the
// end of a tag, where another begins, so that a cut there changes nothing that expat reports. What
// can go on, such as a comment, expat would also read again for every piece of it.
bool may_be_cut(const char *xml, size_t length)
{
    constexpr size_t declaration = 2; // "<?"
    return length > longest_whole && length <= INT_MAX && !has_markup(xml, length, '!') &&
           !has_markup(xml + declaration, length - declaration, '?');
}

// Of the next piece: up to the last place to cut, or all the rest.
size_t piece_length(const char *xml, size_t left)
{
    for (size_t cut = longest_piece; left > longest_piece && cut > 1; --cut)
        if (xml[cut] == '<' && xml[cut - 1] == '>')
            return cut;
    return left;
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
    size_t left = static_cast<uint32_t>(length);
    const bool in_pieces = may_be_cut(xml, left);
    while (true) {
        const size_t piece = in_pieces ? piece_length(xml, left) : left;
        const bool last = piece == left;
        XML_Status status = XML_Parse(parser.get(), xml, static_cast<int>(piece), last);
        if (last || status != XML_STATUS_OK)
            return status;
        xml += piece;
        left -= piece;
    }
}

} // namespace quillmere
