#include "digest.h"

#include <stdexcept>

#include <openssl/crypto.h>
#include <openssl/evp.h>
#include <openssl/rand.h>

namespace emulator {
namespace {

constexpr std::size_t salt_bytes = 16;
constexpr std::size_t stretched_bytes = 32;

// About a millisecond. A service with real accounts would spend far more, but this one is started
// by test suites that log in thousands of times, and serves everybody on one thread.
constexpr std::int64_t stretch_iterations = 1000;

const unsigned char *bytes_of(std::string_view text)
{
    return reinterpret_cast<const unsigned char *>(text.data());
}

unsigned char *bytes_of(std::string &text) { return reinterpret_cast<unsigned char *>(&text[0]); }

std::string hex(std::string_view bytes)
{
    static constexpr char digits[] = "0123456789abcdef";
    std::string text;
    text.reserve(2 * bytes.size());
    for (const char byte : bytes) {
        text += digits[static_cast<unsigned char>(byte) >> 4];
        text += digits[static_cast<unsigned char>(byte) & 0xF];
    }
    return text;
}

std::string digest_of(std::string_view text, const EVP_MD *algorithm)
{
    std::string digest(static_cast<std::size_t>(EVP_MD_get_size(algorithm)), '\0');
    if (EVP_Digest(text.data(), text.size(), bytes_of(digest), nullptr, algorithm, nullptr) != 1)
        throw std::runtime_error("libcrypto made no digest");
    return digest;
}

std::string stretch(std::string_view password, std::string_view salt, std::int64_t iterations)
{
    std::string digest(stretched_bytes, '\0');
    if (PKCS5_PBKDF2_HMAC(password.data(), static_cast<int>(password.size()), bytes_of(salt),
                          static_cast<int>(salt.size()), static_cast<int>(iterations), EVP_sha256(),
                          static_cast<int>(digest.size()), bytes_of(digest)) != 1)
        throw std::runtime_error("libcrypto could not stretch a password");
    return digest;
}

} // namespace

std::string sha1_hex(std::string_view text) { return hex(digest_of(text, EVP_sha1())); }

std::string sha256(std::string_view text) { return digest_of(text, EVP_sha256()); }

sha256_sum::sha256_sum() : context_(EVP_MD_CTX_new())
{
    if (!context_ || EVP_DigestInit_ex(context_.get(), EVP_sha256(), nullptr) != 1)
        throw std::runtime_error("libcrypto made no digest");
}

void sha256_sum::add(std::string_view piece)
{
    if (EVP_DigestUpdate(context_.get(), piece.data(), piece.size()) != 1)
        throw std::runtime_error("libcrypto made no digest");
}

std::string sha256_sum::finish_hex()
{
    std::string digest(static_cast<std::size_t>(EVP_MD_get_size(EVP_sha256())), '\0');
    if (EVP_DigestFinal_ex(context_.get(), bytes_of(digest), nullptr) != 1)
        throw std::runtime_error("libcrypto made no digest");
    return hex(digest);
}

std::string random_bytes(std::size_t count)
{
    std::string bytes(count, '\0');
    if (RAND_bytes(bytes_of(bytes), static_cast<int>(count)) != 1)
        throw std::runtime_error("libcrypto has no random bytes");
    return bytes;
}

std::string random_hex(std::size_t bytes) { return hex(random_bytes(bytes)); }

std::optional<std::string> hex_of_base64(std::string_view text)
{
    const std::size_t padding = text.size() - (text.find_last_not_of('=') + 1);
    // libcrypto would pass over blanks at either end, and knows of padding only that it may be.
    if (padding > 2 || text.find_first_of(" \t\r\n") != text.npos)
        return std::nullopt;
    std::string bytes(text.size() / 4 * 3, '\0');
    const int decoded =
        EVP_DecodeBlock(bytes_of(bytes), bytes_of(text), static_cast<int>(text.size()));
    if (decoded < 0 || static_cast<std::size_t>(decoded) != bytes.size())
        return std::nullopt;
    bytes.resize(bytes.size() - padding);
    return hex(bytes);
}

bool equal_secrets(std::string_view one, std::string_view other)
{
    return one.size() == other.size() && CRYPTO_memcmp(one.data(), other.data(), one.size()) == 0;
}

stretched_password stretch_password(std::string_view password)
{
    stretched_password made{random_bytes(salt_bytes), stretch_iterations, {}};
    made.digest = stretch(password, made.salt, made.iterations);
    return made;
}

bool password_matches(std::string_view password, const stretched_password &stored)
{
    return equal_secrets(stretch(password, stored.salt, stored.iterations), stored.digest);
}

} // namespace emulator
