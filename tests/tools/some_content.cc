#include "some_content.h"

#include <fstream>
#include <memory>
#include <random>
#include <sstream>
#include <vector>

#include <gtest/gtest.h>
#include <openssl/evp.h>

namespace quillmere_test {

namespace {

std::string sha256_of_stream(std::istream &from)
{
    const std::unique_ptr<EVP_MD_CTX, void (*)(EVP_MD_CTX *)> sum(EVP_MD_CTX_new(),
                                                                  EVP_MD_CTX_free);
    EVP_DigestInit_ex(sum.get(), EVP_sha256(), nullptr);
    std::vector<char> piece(1 << 20);
    while (from) {
        from.read(piece.data(), static_cast<std::streamsize>(piece.size()));
        EVP_DigestUpdate(sum.get(), piece.data(), static_cast<std::size_t>(from.gcount()));
    }
    unsigned char digest[32];
    EVP_DigestFinal_ex(sum.get(), digest, nullptr);
    std::string text;
    for (const unsigned char byte : digest) {
        text += "0123456789abcdef"[byte >> 4];
        text += "0123456789abcdef"[byte & 0xf];
    }
    return text;
}

} // namespace

std::string sha256_of(const std::string &bytes)
{
    std::istringstream stream(bytes);
    return sha256_of_stream(stream);
}

std::string sha256_of_file(const std::string &path)
{
    std::ifstream stream(path, std::ios::binary);
    EXPECT_TRUE(stream) << path;
    return sha256_of_stream(stream);
}

std::string some_bytes(std::size_t count, std::uint32_t seed)
{
    std::mt19937 generator(seed);
    std::string bytes(count, '\0');
    for (char &each : bytes)
        each = static_cast<char>(generator());
    return bytes;
}

} // namespace quillmere_test
