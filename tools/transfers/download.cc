#include "download.h"

#include <cstring>
#include <exception>

#include <quillmere.h>

#include "../failure.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

constexpr long most_redirects = 30;
constexpr long longest_stall_seconds = 60;
constexpr long buffer_bytes = 256 * 1024;
constexpr std::size_t largest_refusal = 64 * 1024;

constexpr long whole_content = 200;
constexpr long partial_content = 206;
constexpr long range_not_satisfiable = 416;

/** A fetch that is under way, as libcurl's callback finds it. */
struct running_fetch {
    CURL *handle;
    partial_file &into;
    progress &shown;
    std::string refusal;        // the body of a reply that does not bring the bytes
    std::exception_ptr problem; // of the local file
    bool begun = false;
    bool other_range = false;
};

long status_of(CURL *handle)
{
    long status = 0;
    curl_easy_getinfo(handle, CURLINFO_RESPONSE_CODE, &status);
    return status;
}

bool brings_bytes(long status) { return status == whole_content || status == partial_content; }

// "bytes 100-199/200"
bool begins_at(CURL *handle, std::uint64_t wanted)
{
    curl_header *field = nullptr;
    if (curl_easy_header(handle, "Content-Range", 0, CURLH_HEADER, -1, &field) != CURLHE_OK)
        return false;
    return starts_with(lower_case(field->value), "bytes " + std::to_string(wanted) + "-");
}

// The first bytes of a reply tell whether they are those that were asked for: a server may ignore a
// range and send the whole.
void begin(running_fetch &under_way)
{
    under_way.begun = true;
    const long status = status_of(under_way.handle);
    if (status == partial_content && !begins_at(under_way.handle, under_way.into.size()))
        under_way.other_range = true;
    if (status == whole_content && under_way.into.size() > 0) {
        under_way.into.restart();
        under_way.shown.restart();
    }
}

bool take(running_fetch &under_way, std::string_view piece)
{
    if (!under_way.begun)
        begin(under_way);
    if (under_way.other_range)
        return false;
    if (brings_bytes(status_of(under_way.handle))) {
        if (piece.size() > under_way.into.missing())
            throw failure(exit_code::unreadable_answer,
                          "the link leads to more bytes than the file has",
                          "the file may have changed meanwhile: try again");
        under_way.into.append(piece);
        under_way.shown.advance(piece.size());
        return true;
    }
    under_way.refusal.append(piece);
    return under_way.refusal.size() <= largest_refusal;
}

extern "C" {
static size_t take_piece(char *bytes, size_t size, size_t count, void *where)
{
    running_fetch &under_way = *static_cast<running_fetch *>(where);
    try {
        return take(under_way, {bytes, size * count}) ? size * count : CURL_WRITEFUNC_ERROR;
    } catch (...) {
        under_way.problem = std::current_exception();
        return CURL_WRITEFUNC_ERROR;
    }
}
}

// Of a reply without the bytes: the service's own refusal, or the HTTP status.
std::int32_t judge(const running_fetch &under_way, char **error_message)
{
    qm_printf("Got text:\n%s\n", under_way.refusal.c_str());
    std::int32_t error = 0;
    get_error_from_xml(under_way.refusal.data(), under_way.refusal.size(), &error, error_message);
    if (error > 0)
        return error;
    api_free(*error_message);
    const std::string message = "Response error: received server HTTP response code " +
                                std::to_string(status_of(under_way.handle));
    *error_message = ::strdup(message.c_str());
    return QM_UNUSABLE_RESPONSE;
}

} // namespace

downloader::downloader(link_security security, int timeout_seconds)
    : handle_(curl_easy_init()), security_(security), timeout_seconds_(timeout_seconds)
{
    if (!handle_)
        throw failure(exit_code::other, "libcurl made no handle");
}

void downloader::prepare(const std::string &url, std::uint64_t from)
{
    CURL *const handle = handle_.get();
    curl_easy_reset(handle); // its connection stays
    const bool tls_alone = security_ == link_security::tls_alone;
    const bool is_tls = starts_with(lower_case(url), "https:");
    curl_easy_setopt(handle, CURLOPT_URL, url.c_str());
    curl_easy_setopt(handle, CURLOPT_PROTOCOLS_STR, tls_alone ? "https" : "http,https");
    // What has begun encrypted stays so.
    curl_easy_setopt(handle, CURLOPT_REDIR_PROTOCOLS_STR, is_tls ? "https" : "http,https");
    curl_easy_setopt(handle, CURLOPT_FOLLOWLOCATION, 1L);
    curl_easy_setopt(handle, CURLOPT_MAXREDIRS, most_redirects);
    curl_easy_setopt(handle, CURLOPT_NOSIGNAL, 1L);
    curl_easy_setopt(handle, CURLOPT_BUFFERSIZE, buffer_bytes);
    // A large file may take long, a server that stalls may not.
    curl_easy_setopt(handle, CURLOPT_CONNECTTIMEOUT, static_cast<long>(timeout_seconds_));
    curl_easy_setopt(handle, CURLOPT_LOW_SPEED_LIMIT, 1L);
    curl_easy_setopt(handle, CURLOPT_LOW_SPEED_TIME, longest_stall_seconds);
    if (ca_cert_pem_path.path)
        curl_easy_setopt(handle, CURLOPT_CAINFO, ca_cert_pem_path.path);
    curl_easy_setopt(handle, CURLOPT_SSL_VERIFYPEER, ssl_disabled ? 0L : 1L);
    curl_easy_setopt(handle, CURLOPT_SSL_VERIFYHOST, ssl_disabled ? 0L : 2L);
    curl_easy_setopt(handle, CURLOPT_WRITEFUNCTION, take_piece);
    if (from > 0)
        curl_easy_setopt(handle, CURLOPT_RANGE, (std::to_string(from) + "-").c_str());
}

std::int32_t downloader::fetch(const std::string &url, partial_file &into, progress &shown,
                               char **error_message)
{
    char detail[CURL_ERROR_SIZE] = "";
    running_fetch under_way = {handle_.get(), into, shown, {}, nullptr};
    const std::uint64_t from = into.size();
    prepare(url, from);
    curl_easy_setopt(handle_.get(), CURLOPT_ERRORBUFFER, detail);
    curl_easy_setopt(handle_.get(), CURLOPT_WRITEDATA, &under_way);
    qm_printf("download url: %s\n", url.c_str());
    const CURLcode code = curl_easy_perform(handle_.get());
    curl_easy_setopt(handle_.get(), CURLOPT_ERRORBUFFER, nullptr);
    if (under_way.problem)
        std::rethrow_exception(under_way.problem);

    const long status = status_of(handle_.get());
    if (from > 0 && (status == range_not_satisfiable || under_way.other_range)) {
        into.restart();
        shown.restart();
        return fetch(url, into, shown, error_message); // the whole of it, with no range to refuse
    }
    if (code != CURLE_OK) {
        // As the library writes it, which tells the command line why there is no reply.
        qm_printf("cUrl error: (%d) %s: %s\n", static_cast<int>(code), curl_easy_strerror(code),
                  detail);
        return QM_NO_RESPONSE;
    }
    return brings_bytes(status) ? QM_OK : judge(under_way, error_message);
}

} // namespace quillmere::tools
