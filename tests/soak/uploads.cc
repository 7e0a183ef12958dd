#include "soak/uploads.h"

#include "quillmere.h"
#include "transport/upload_connection.h"

namespace quillmere_test {
namespace {

constexpr size_t file_size = 256 * 1024;
constexpr size_t chunk_size = 16 * 1024; // a TLS record
constexpr int64_t connect_seconds = 60;

struct free_text {
    void operator()(char *text) const { api_free(text); }
};
using owned_text = std::unique_ptr<char, free_text>;

bool write_file(send_file *connection)
{
    const std::string chunk(chunk_size, 'u');
    for (size_t written = 0; written < file_size; written += chunk_size)
        if (!write_all(connection, chunk).empty())
            return false;
    return true;
}

std::string request_head(const std::string &url, unsigned number)
{
    const std::string target = url.substr(url.find('/', url.find("//") + 2));
    return "POST " + target + " HTTP/1.1\r\nHost: localhost\r\nX-Name: " + std::to_string(number) +
           "\r\nContent-Length: " + std::to_string(file_size) + "\r\n\r\n";
}

std::string key_of(const std::string &name, size_t size)
{
    return "upload-" + name + "-" + std::to_string(size);
}

} // namespace

std::string answer_to_upload(const request &upload)
{
    return xml_reply("<response><doupload><result>0</result><key>" +
                     key_of(upload.header("X-Name").value_or(""), upload.body.size()) +
                     "</key></doupload></response>");
}

bool upload_arrives(unsigned number, bool use_tls)
{
    const owned_text url(get_upload_url("token", nullptr, use_tls));
    const opened peer = open_connection(url.get(), use_tls, connect_seconds);
    if (peer.result != 0 ||
        !write_all(peer.connection.get(), request_head(url.get(), number)).empty() ||
        !write_file(peer.connection.get()))
        return false;
    const whole_reply reply = read_all(peer.connection.get());
    char *key = nullptr;
    int32_t status = parse_upload_response(reply.bytes.data(), reply.bytes.size(), &key);
    const owned_text owned_key(key);
    return status == 0 && key == key_of(std::to_string(number), file_size);
}

} // namespace quillmere_test
