#include "support/library_fixture.h"

namespace quillmere_test {
namespace {

constexpr const char *upload_path = "/api/upload/upload.php?type=desktop";
constexpr int64_t timeout_seconds = 10;

} // namespace

proxyless_environment::proxyless_environment()
{
    for (const char *name : {"http_proxy", "https_proxy", "all_proxy", "no_proxy", "HTTP_PROXY",
                             "HTTPS_PROXY", "ALL_PROXY", "NO_PROXY"})
        guard_.unset(name);
}

library_test::library_test(const char *ca_path) : library(ca_path)
{
    set_connection_attempts(1);
    set_default_timeout(timeout_seconds);
    base_[0] = plain_server.base_url();
    base_[2] = base_[0] + upload_path;
    urls[0] = base_[0].c_str();
    urls[2] = base_[2].c_str();
    point_at(server);
    log.clear();
}

void library_test::point_at(const std::string &tls_base)
{
    base_[1] = tls_base;
    base_[3] = tls_base + upload_path;
    urls[1] = base_[1].c_str();
    urls[3] = base_[3].c_str();
}

} // namespace quillmere_test
