// Certificates from memory, in the place of a file that libcurl would read for every connection.
#pragma once

#include "owned.h"

namespace quillmere {

// Whether libcurl's TLS library takes them. Known once the library was started.
bool takes_certificates_from_memory();

// Has the handle, whose CURLOPT_CAINFO is set, verify peers against these certificates, which must
// outlive its transfer, instead of the file. Everything else about verifying stays libcurl's. When
// libcurl refuses, the file stays.
void verify_against(CURL *handle, X509_STORE *certificates);

} // namespace quillmere
