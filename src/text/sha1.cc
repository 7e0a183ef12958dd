// SHA-1 in hexadecimal. The service signs its authentication requests with it, so a newer digest is
// no choice of ours.
#define OPENSSL_SUPPRESS_DEPRECATED // the plain SHA1_ functions, which every OpenSSL has and no
                                    // provider can switch off
#include <openssl/sha.h>

#include "quillmere.h"

int32_t simple_sha1(const void *data, uint64_t length, char *output, uint64_t output_capacity)
{
    constexpr uint64_t text_size = 2 * SHA_DIGEST_LENGTH + 1;
    if (output_capacity < text_size)
        return 1;

    SHA_CTX context;
    unsigned char digest[SHA_DIGEST_LENGTH];
    SHA1_Init(&context);
    SHA1_Update(&context, data, length);
    SHA1_Final(digest, &context);

    static const char digits[] = "0123456789abcdef";
    for (unsigned char byte : digest) {
        *output++ = digits[byte >> 4];
        *output++ = digits[byte & 15];
    }
    *output = '\0';
    return 0;
}
