// The certificates of the configured file, read once and kept for as long as the file stays as it
// is: reading a full bundle costs twenty times what the rest of a request does.
#pragma once

#include "owned.h"

namespace quillmere {

// The certificates that the file holds now, to be read only. The same object as before means the
// same certificates. Null if they cannot be had; whoever reads the file instead finds out why. Any
// thread.
certificate_store certificates_of(const char *path);

void forget_certificates();

} // namespace quillmere
