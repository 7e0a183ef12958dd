#include "service.h"

#include <algorithm>
#include <cstdlib>
#include <iterator>

#include "heap.h"

namespace quillmere::tools {

namespace {

// Far beyond any listing, and little beside the memory of a machine.
constexpr int64_t longest_reply = 64 * 1024 * 1024; // bytes

void point_library_at(const service_addresses &addresses)
{
    urls[0] = addresses.plain.c_str();
    urls[1] = addresses.secure.c_str();
    urls[2] = addresses.plain_upload.c_str();
    urls[3] = addresses.secure_upload.c_str();
}

// The library takes the proxy from the environment alone.
void use_proxy(const std::optional<proxy_choice> &chosen)
{
    if (!chosen)
        return;
    ::setenv("https_proxy", chosen->url.c_str(), 1);
    ::setenv("http_proxy", chosen->url.c_str(), 1);
}

} // namespace

service::service(const settings &chosen, diagnostic_log &log, const retry_world &world)
    : chosen_(chosen), log_(log), world_(world)
{
    std::copy(std::begin(urls), std::end(urls), former_urls_);
    point_library_at(chosen.addresses);
    // An emulator listens on this machine alone, where no proxy of the environment finds it.
    if (chosen.emulator)
        ::setenv("no_proxy", "*", 1);
    use_proxy(chosen.proxy);
    set_quillmere_output_file(log.stream());
    // The pauses between attempts are ours to make, and only some requests may be repeated.
    set_connection_attempts(1);
    set_default_timeout(chosen.timeout_seconds);
    set_response_limit(longest_reply);
    ssl_disabled = chosen.ca ? 0 : 1;
    api_global_init(chosen.ca ? chosen.ca->path.c_str() : nullptr);
}

service::~service()
{
    api_global_cleanup();
    set_response_limit(0);
    set_quillmere_output_file(nullptr);
    std::copy(std::begin(former_urls_), std::end(former_urls_), urls);
}

void service::read(const std::string &action, const operation &asked)
{
    const auto again = [&] { return attempt(asked); };
    require_success(with_repetitions(again, chosen_.retries, world_), action);
}

void service::once(const std::string &action, const operation &asked)
{
    require_success(attempt(asked), action);
}

exchange service::attempt(const operation &asked)
{
    exchange ended;
    char *message = nullptr;
    log_.watch().begin();
    ended.status = asked(&message);
    const heap_text owned(message);
    if (message != nullptr)
        ended.message = message;
    ended.error = log_.watch().error();
    ended.html = looks_like_html(log_.watch().body_beginning());
    return ended;
}

void service::require_success(const exchange &ended, const std::string &action) const
{
    if (ended.status == QM_OK)
        return;
    exchange_setting setting = {chosen_.addresses.secure, chosen_.ca, std::nullopt};
    if (chosen_.emulator)
        setting.emulator_root = chosen_.emulator->ca_file;
    throw failure_of(ended, action, setting);
}

} // namespace quillmere::tools
