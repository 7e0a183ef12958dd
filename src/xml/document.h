// One pass of expat over a whole document: what the value lookup and the list extractors share.
#pragma once

#include "owned.h"

namespace quillmere {

struct document_handlers {
    XML_StartElementHandler start;
    XML_EndElementHandler end;
    XML_CharacterDataHandler text;
};

// A parser for UTF-8 with its handlers and their state; null if expat could not make one.
xml_parser new_document_parser(void *state, const document_handlers &handlers);

// Parses the whole document. Only the low 32 bits of the length count. Without a parser
// it fails like a malformed document.
XML_Status parse_document(const xml_parser &parser, const char *xml, uint64_t length);

} // namespace quillmere
