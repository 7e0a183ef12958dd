// The owners of everything that must be released: one type for each kind of resource, each naming
// the one function that releases it.
#pragma once

#include <cstdlib>
#include <memory>
#include <type_traits>

#include <curl/curl.h>
#include <expat.h>
#include <openssl/x509.h>

#include "quillmere.h"

namespace quillmere {

template <auto Release> struct releaser {
    template <class Resource> void operator()(Resource *resource) const { Release(resource); }
};

inline void free_memory(void *memory) { std::free(memory); }
inline void delete_buffer_and_text(string_buffer *buffer) { string_delete(buffer, 1); }

using heap_text = std::unique_ptr<char, releaser<free_memory>>;
using owned_buffer = std::unique_ptr<string_buffer, releaser<delete_buffer_and_text>>;
using easy_handle = std::unique_ptr<CURL, releaser<curl_easy_cleanup>>;
using certificate_store = std::unique_ptr<X509_STORE, releaser<X509_STORE_free>>;
using xml_parser = std::unique_ptr<std::remove_pointer_t<XML_Parser>, releaser<XML_ParserFree>>;

} // namespace quillmere
