// Uploads as an application makes them, and the server that takes them.
#pragma once

#include <string>

#include "support/http_message.h"

namespace quillmere_test {

// The server: its answer tells which upload it belongs to, and how much of it arrived.
std::string answer_to_upload(const request &upload);

// Uploads a file under a name of its own to the address in urls[3] or urls[2]: whether the answer
// belongs to it and all of it arrived.
bool upload_arrives(unsigned number, bool use_tls);

} // namespace quillmere_test
