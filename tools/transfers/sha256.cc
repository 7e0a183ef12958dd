#include "sha256.h"

#include "../failure.h"

namespace quillmere::tools {

namespace {

constexpr std::size_t digest_bytes = 32;

void require(bool done)
{
    if (!done)
        throw failure(exit_code::other, "libcrypto made no digest");
}

} // namespace

sha256_sum::sha256_sum() : context_(EVP_MD_CTX_new())
{
    require(context_ && EVP_DigestInit_ex(context_.get(), EVP_sha256(), nullptr) == 1);
}

void sha256_sum::add(std::string_view piece)
{
    require(EVP_DigestUpdate(context_.get(), piece.data(), piece.size()) == 1);
}

std::string sha256_sum::finish()
{
    unsigned char digest[digest_bytes];
    require(EVP_DigestFinal_ex(context_.get(), digest, nullptr) == 1);
    return std::string(std::begin(digest), std::end(digest));
}

std::string hex_of(std::string_view bytes)
{
    constexpr char digits[] = "0123456789abcdef";
    std::string text;
    for (const char byte : bytes) {
        text += digits[static_cast<unsigned char>(byte) >> 4];
        text += digits[static_cast<unsigned char>(byte) & 0xf];
    }
    return text;
}

std::string base64_of(std::string_view bytes)
{
    std::string text((bytes.size() + 2) / 3 * 4 + 1, '\0'); // libcrypto writes a NUL behind it
    EVP_EncodeBlock(reinterpret_cast<unsigned char *>(text.data()),
                    reinterpret_cast<const unsigned char *>(bytes.data()),
                    static_cast<int>(bytes.size()));
    text.pop_back();
    return text;
}

bool is_sha256_hex(std::string_view text)
{
    return text.size() == 2 * digest_bytes &&
           text.find_first_not_of("0123456789abcdef") == std::string_view::npos;
}

} // namespace quillmere::tools
