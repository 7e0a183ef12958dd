// What the HTTP exchange shows to tests beyond its exported functions.
#pragma once

namespace quillmere {

// libcurl's error text that counts as critical: some OpenSSL builds get into a state in which no
// TLS session can be set up until the process is restarted, and this text is all there is to tell
// it by.
extern const char *critical_error_text;

} // namespace quillmere
