// Digests, random texts and stretched passwords, all from libcrypto.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <openssl/evp.h>

namespace emulator {

/** 40 lower-case hexadecimal digits. */
std::string sha1_hex(std::string_view text);

/** The 32 bytes of the digest. Tokens are stored this way, so that the store gives none away. */
std::string sha256(std::string_view text);

/** The same digest of bytes that come piece by piece. */
class sha256_sum {
public:
    sha256_sum();
    void add(std::string_view piece);
    /** 64 lower-case hexadecimal digits; nothing may be added afterwards. */
    std::string finish_hex();

private:
    struct releaser {
        void operator()(EVP_MD_CTX *context) const { EVP_MD_CTX_free(context); }
    };

    std::unique_ptr<EVP_MD_CTX, releaser> context_;
};

/** Unpredictable bytes, and the same written as lower-case hexadecimal digits, two for a byte. */
std::string random_bytes(std::size_t count);
std::string random_hex(std::size_t bytes);

/** The bytes that a base64 text stands for, as lower-case hexadecimal digits; nothing if it stands
 * for none. */
std::optional<std::string> hex_of_base64(std::string_view text);

/** Compares without telling by its time where the texts differ. */
bool equal_secrets(std::string_view one, std::string_view other);

/** A password as it is stored. The work is kept beside it, so that it may be raised later. */
struct stretched_password {
    std::string salt;
    std::int64_t iterations = 0;
    std::string digest;
};

stretched_password stretch_password(std::string_view password);
bool password_matches(std::string_view password, const stretched_password &stored);

} // namespace emulator
