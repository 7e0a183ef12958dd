// SHA-256 of bytes that come piece by piece, as transfers need it.
#pragma once

#include <memory>
#include <string>
#include <string_view>

#include <openssl/evp.h>

namespace quillmere::tools {

class sha256_sum {
public:
    sha256_sum();
    void add(std::string_view piece);
    /** The 32 bytes of the digest; nothing may be added afterwards. */
    std::string finish();

private:
    struct releaser {
        void operator()(EVP_MD_CTX *context) const { EVP_MD_CTX_free(context); }
    };

    std::unique_ptr<EVP_MD_CTX, releaser> context_;
};

/** Bytes as lower-case hexadecimal digits, and as base64 (RFC 4648). */
std::string hex_of(std::string_view bytes);
std::string base64_of(std::string_view bytes);

/** Whether the text is a SHA-256 as hexadecimal digits in lower case. */
bool is_sha256_hex(std::string_view text);

} // namespace quillmere::tools
