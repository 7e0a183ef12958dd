// The emulator's own certificate authority, and the certificate with which it serves HTTPS.
#pragma once

#include <cstdint>

#include "data_directory.h"

namespace emulator {

/**
 * Makes whatever is missing, damaged, expired or near its expiry: the root, which clients are told
 * to trust, and the certificate for localhost, 127.0.0.1 and ::1 that it signs. What is sound is
 * left as it is, so that clients may keep the root.
 *
 * @param now seconds since 1970
 */
void ensure_certificates(const data_directory &in, std::int64_t now);

} // namespace emulator
