// One upload: the request, its bytes and the reply, over the library's upload connection.
#pragma once

#include <cstdint>
#include <functional>
#include <string>

namespace quillmere::tools {

struct upload {
    std::string url;                         ///< from get_upload_url() or get_patch_upload_url()
    bool tls = true;                         ///< as the URL says
    std::int64_t timeout = 0;                ///< seconds for connecting
    std::string name;                        ///< of a new file
    int file = -1;                           ///< whose bytes are sent, from its beginning
    std::uint64_t size = 0;                  ///< their number
    std::string digest;                      ///< SHA-256 of them, 32 bytes
    std::function<void(std::uint64_t)> sent; ///< told of each piece
};

/**
 * Sends the file. Results are those of the library's operations, so that it is asked for through
 * the service as they are.
 *
 * @param key           receives the key of the upload, or nothing
 * @param error_message receives the message of a failure or NULL; freed with api_free()
 *
 * Throws failure when the local file cannot be read to the size that was announced.
 */
std::int32_t send_upload(const upload &asked, std::string &key, char **error_message);

/** The value of a Content-Disposition field for a file name of any characters (RFC 6266). */
std::string disposition_of(const std::string &name);

} // namespace quillmere::tools
