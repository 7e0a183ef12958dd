// The emulator's own certificate authority, and the certificates with which it serves HTTPS.
#pragma once

#include <cstdint>
#include <string>

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

/** Certificates that a client must refuse. */
enum class certificate_variant {
    expired,
    wrong_host,  // sound, but for another name
    self_signed, // for the right names, but no root vouches for it
};

/** A certificate and its key, in PEM. */
struct certificate_text {
    std::string certificate;
    std::string key;
};

/** Makes one, signed by the root of the folder unless the variant is that it is not. */
certificate_text make_variant(const data_directory &in, certificate_variant which,
                              std::int64_t now);

} // namespace emulator
