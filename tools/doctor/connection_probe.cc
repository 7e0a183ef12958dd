#include "connection_probe.h"

#include <ctime>
#include <memory>

#include <curl/curl.h>

#include "../failure.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

using std::chrono::microseconds;

struct releaser {
    void operator()(CURL *handle) const { curl_easy_cleanup(handle); }
};
using easy_handle = std::unique_ptr<CURL, releaser>;

enum class trust { authorities, anybody };

/** When the connection stood, which libcurl tells only of one that got further than that. */
struct handshake_start {
    std::chrono::steady_clock::time_point begun = std::chrono::steady_clock::now();
    std::chrono::microseconds at{0};
};

extern "C" {
static size_t take_nothing(char *, size_t size, size_t count, void *) { return size * count; }

static CURLcode begin_handshake(CURL *, void *, void *where)
{
    handshake_start &start = *static_cast<handshake_start *>(where);
    start.at = std::chrono::duration_cast<std::chrono::microseconds>(
        std::chrono::steady_clock::now() - start.begun);
    return CURLE_OK;
}
}

easy_handle handle_for(const settings &chosen, trust whom)
{
    easy_handle handle(curl_easy_init());
    if (!handle)
        throw failure(exit_code::other, "libcurl made no handle");
    CURL *const curl = handle.get();
    const bool verified = chosen.ca && whom == trust::authorities;
    curl_easy_setopt(curl, CURLOPT_URL, (chosen.addresses.secure + "/").c_str());
    curl_easy_setopt(curl, CURLOPT_PROTOCOLS_STR, "https");
    curl_easy_setopt(curl, CURLOPT_NOBODY, 1L);
    curl_easy_setopt(curl, CURLOPT_NOSIGNAL, 1L);
    curl_easy_setopt(curl, CURLOPT_TIMEOUT, static_cast<long>(chosen.timeout_seconds));
    curl_easy_setopt(curl, CURLOPT_CERTINFO, 1L);
    if (chosen.ca)
        curl_easy_setopt(curl, CURLOPT_CAINFO, chosen.ca->path.c_str());
    curl_easy_setopt(curl, CURLOPT_SSL_VERIFYPEER, verified ? 1L : 0L);
    curl_easy_setopt(curl, CURLOPT_SSL_VERIFYHOST, verified ? 2L : 0L);
    curl_easy_setopt(curl, CURLOPT_WRITEFUNCTION, take_nothing);
    curl_easy_setopt(curl, CURLOPT_HEADERFUNCTION, take_nothing);
    return handle;
}

std::string field_of(std::string_view line, std::string_view name)
{
    if (!starts_with(line, name) || line.substr(name.size(), 1) != ":")
        return {};
    return std::string(trimmed(line.substr(name.size() + 1)));
}

/** The first certificate of the chain is the service's own. */
std::optional<service_certificate> certificate_of(CURL *curl)
{
    curl_certinfo *chain = nullptr;
    if (curl_easy_getinfo(curl, CURLINFO_CERTINFO, &chain) != CURLE_OK || chain == nullptr ||
        chain->num_of_certs < 1)
        return std::nullopt;
    service_certificate found;
    for (const curl_slist *each = chain->certinfo[0]; each != nullptr; each = each->next) {
        const std::pair<const char *, std::string *> wanted[] = {{"Subject", &found.subject},
                                                                 {"Issuer", &found.issuer},
                                                                 {"Expire date", &found.expires}};
        for (const auto &[name, place] : wanted)
            if (const std::string value = field_of(each->data, name); !value.empty())
                *place = value;
    }
    return found;
}

// It tells most where it was refused, and then the transport does not keep it. Nothing is sent on
// this connection.
std::optional<service_certificate> refused_certificate(const settings &chosen)
{
    const easy_handle handle = handle_for(chosen, trust::anybody);
    curl_easy_setopt(handle.get(), CURLOPT_CONNECT_ONLY, 1L);
    curl_easy_perform(handle.get());
    return certificate_of(handle.get());
}

std::optional<std::chrono::seconds> clock_ahead_of(CURL *curl)
{
    curl_header *field = nullptr;
    if (curl_easy_header(curl, "Date", 0, CURLH_HEADER, -1, &field) != CURLHE_OK)
        return std::nullopt;
    const std::time_t told = curl_getdate(field->value, nullptr);
    if (told == -1)
        return std::nullopt;
    return std::chrono::seconds(told - std::time(nullptr));
}

microseconds time_of(CURL *curl, CURLINFO which)
{
    curl_off_t time = 0;
    curl_easy_getinfo(curl, which, &time);
    return microseconds(time);
}

std::string address_of(CURL *curl)
{
    char *address = nullptr;
    long port = 0;
    curl_easy_getinfo(curl, CURLINFO_PRIMARY_IP, &address);
    curl_easy_getinfo(curl, CURLINFO_PRIMARY_PORT, &port);
    if (address == nullptr || *address == '\0')
        return {};
    return std::string(address) + " port " + std::to_string(port);
}

bool concerns_tls(CURLcode code)
{
    switch (code) {
    case CURLE_SSL_CONNECT_ERROR:
    case CURLE_PEER_FAILED_VERIFICATION:
    case CURLE_SSL_CACERT_BADFILE:
    case CURLE_SSL_CIPHER:
    case CURLE_SSL_ISSUER_ERROR:
        return true;
    default:
        return false;
    }
}

// A time that is 0 belongs to a stage that was not passed.
stage stage_reached(CURLcode code, const connection_probe &found)
{
    if (code == CURLE_OK || found.ended[static_cast<int>(stage::handshake)].count() > 0)
        return stage::answer;
    if (concerns_tls(code))
        return stage::handshake;
    if (code == CURLE_COULDNT_CONNECT)
        return stage::connection;
    if (found.ended[static_cast<int>(stage::connection)].count() > 0)
        return stage::handshake;
    const bool known = found.ended[static_cast<int>(stage::lookup)].count() > 0;
    return known ? stage::connection : stage::lookup;
}

} // namespace

bool connection_probe::passed(stage which) const
{
    return which < reached || (which == reached && code == 0);
}

std::optional<microseconds> connection_probe::time_of(stage which) const
{
    if (!passed(which))
        return std::nullopt;
    const int index = static_cast<int>(which);
    const microseconds begun = index == 0 ? microseconds(0) : ended[index - 1];
    return std::max(microseconds(0), ended[index] - begun);
}

connection_probe probe_connection(const settings &chosen)
{
    char detail[CURL_ERROR_SIZE] = "";
    const easy_handle handle = handle_for(chosen, trust::authorities);
    CURL *const curl = handle.get();
    curl_easy_setopt(curl, CURLOPT_ERRORBUFFER, detail);
    handshake_start start;
    curl_easy_setopt(curl, CURLOPT_SSL_CTX_FUNCTION, begin_handshake);
    curl_easy_setopt(curl, CURLOPT_SSL_CTX_DATA, &start);
    const CURLcode code = curl_easy_perform(curl);

    connection_probe found;
    constexpr CURLINFO times[] = {CURLINFO_NAMELOOKUP_TIME_T, CURLINFO_CONNECT_TIME_T,
                                  CURLINFO_APPCONNECT_TIME_T, CURLINFO_TOTAL_TIME_T};
    for (std::size_t i = 0; i < std::size(times); ++i)
        found.ended[i] = time_of(curl, times[i]);
    found.ended[static_cast<int>(stage::connection)] = start.at;
    found.reached = stage_reached(code, found);
    found.code = code;
    if (code != CURLE_OK)
        found.problem = *detail != '\0' ? detail : curl_easy_strerror(code);
    found.address = address_of(curl);
    curl_easy_getinfo(curl, CURLINFO_RESPONSE_CODE, &found.http_status);
    found.clock_ahead = clock_ahead_of(curl);
    found.certificate =
        code == CURLE_PEER_FAILED_VERIFICATION ? refused_certificate(chosen) : certificate_of(curl);
    return found;
}

} // namespace quillmere::tools
