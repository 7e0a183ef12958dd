#include "ready_signal.h"

#include <system_error>

#include <unistd.h>

#include "files.h"

namespace emulator {
namespace {

std::string url(const char *scheme, std::uint16_t port)
{
    return std::string(scheme) + "://127.0.0.1:" + std::to_string(port);
}

std::string json_text(const std::string &text)
{
    static constexpr char digits[] = "0123456789abcdef";
    std::string quoted = "\"";
    for (const char byte : text) {
        if (byte == '"' || byte == '\\')
            quoted += '\\';
        if (static_cast<unsigned char>(byte) < 0x20)
            quoted.append("\\u00").append(1, digits[byte >> 4]).append(1, digits[byte & 0xF]);
        else
            quoted += byte;
    }
    return quoted + '"';
}

std::string admin_members(const listening_at &where)
{
    if (!where.admin)
        return "";
    return ", \"admin_port\": " + std::to_string(where.admin->port) +
           ", \"admin_url\": " + json_text(where.admin->http_url());
}

} // namespace

std::string listening_at::https_url() const { return url("https", https_port); }

std::string listening_at::http_url() const { return url("http", http_port); }

std::string ready_line(const listening_at &where)
{
    return "{\"https_port\": " + std::to_string(where.https_port) +
           ", \"http_port\": " + std::to_string(where.http_port) +
           ", \"https_url\": " + json_text(where.https_url()) +
           ", \"http_url\": " + json_text(where.http_url()) +
           ", \"ca_file\": " + json_text(where.root_certificate.string()) +
           ", \"pid\": " + std::to_string(::getpid()) + admin_members(where) + "}\n";
}

ready_signal::ready_signal(std::filesystem::path file, int descriptor)
    : file_(std::move(file)), descriptor_(descriptor)
{
    if (!file_.empty())
        std::filesystem::remove(file_);
}

ready_signal::~ready_signal()
{
    std::error_code ignored;
    if (!file_.empty())
        std::filesystem::remove(file_, ignored);
}

void ready_signal::give(const listening_at &where)
{
    const std::string line = ready_line(where);
    if (!file_.empty())
        write_file(file_, line, 0644);
    if (descriptor_ < 0)
        return;
    const descriptor pipe(descriptor_); // closes it: a reader may wait for the end
    descriptor_ = -1;
    write_all(pipe.number(), line);
}

} // namespace emulator
