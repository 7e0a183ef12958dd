// The streaming upload connection: libcurl connects, and the application speaks HTTP over it
// itself, one chunk a call.
#define CURL_DISABLE_DEPRECATION // the connection's socket is asked for by its older name, which
                                 // every libcurl knows
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <utility>

#include <poll.h>

#include "owned.h"
#include "runtime/memory.h"
#include "transport/transfer.h"

namespace quillmere {

namespace {

constexpr int64_t idle_limit_milliseconds = 60000;
constexpr int64_t default_connect_seconds = 60;
constexpr long tls_port = 443;
constexpr timespec back_off = {0, 10'000'000};

constexpr int32_t connect_failed = -1;
constexpr int32_t socket_unknown = -2;
constexpr int32_t no_handle = -200;
constexpr int32_t timed_out = -5;
constexpr int32_t send_failed = -6;
constexpr int32_t receive_failed = -7;

// The proxy and ssl_disabled are for the operations, deliberately: they are not applied here.
CURLcode connect(CURL *handle, const char *url, bool use_tls, X509_STORE *certificates,
                 int64_t timeout)
{
    curl_easy_setopt(handle, CURLOPT_URL, url);
    curl_easy_setopt(handle, CURLOPT_FOLLOWLOCATION, 1L);
    curl_easy_setopt(handle, CURLOPT_NOSIGNAL, 1L);
    curl_easy_setopt(handle, CURLOPT_TIMEOUT,
                     static_cast<long>(timeout >= 1 ? timeout : default_connect_seconds));
    if (use_tls) {
        curl_easy_setopt(handle, CURLOPT_PORT, tls_port);
        curl_easy_setopt(handle, CURLOPT_USE_SSL, static_cast<long>(CURLUSESSL_ALL));
        keep_no_tls_sessions(handle);
        if (!verify_peer(handle, certificates))
            return CURLE_OUT_OF_MEMORY;
    }
    curl_easy_setopt(handle, CURLOPT_CONNECT_ONLY, 1L);
    return curl_easy_perform(handle);
}

bool read_clock(int64_t &now)
{
    now = static_cast<int64_t>(std::time(nullptr));
    return now != -1;
}

// How long the connection may still wait, or below 0 if it has idled for too long. Exactly the
// limit still passes.
int64_t wait_budget(const send_file &connection)
{
    int64_t now = 0;
    if (!read_clock(now))
        return idle_limit_milliseconds;
    int64_t left = idle_limit_milliseconds - (now - connection.last_transmission) * 1000;
    return std::min(left, idle_limit_milliseconds); // the clock may have been set back
}

// Waits until the socket is ready or fails: false if neither happens in time.
bool wait_for(const send_file &connection, short events)
{
    int64_t budget = wait_budget(connection);
    if (budget < 0) {
        std::puts("Error: Transmission timeout.");
        return false;
    }
    pollfd waited = {connection.socket, events, 0};
    if (poll(&waited, 1, static_cast<int>(budget)) == 0) {
        std::puts("Error: Connection timeout.");
        return false;
    }
    return true;
}

// One chunk in one direction. move is curl_easy_send() or curl_easy_recv() on the caller's bytes.
template <class Move>
int32_t move_chunk(send_file &connection, short events, uint64_t size, int32_t failed, Move move)
{
    if (!wait_for(connection, events))
        return timed_out;
    if (size == 0)
        return 0; // libcurl would answer "again" for ever

    size_t moved = 0;
    CURLcode code = CURLE_OK;
    while ((code = move(&moved)) == CURLE_AGAIN) {
        std::puts("Error: wait_on_socket failed."); // on every retry, deliberately
        if (!wait_for(connection, events))
            return timed_out;
        nanosleep(&back_off, nullptr);
    }
    if (code != CURLE_OK) {
        std::printf("Error: %d %s\n", static_cast<int>(code), curl_easy_strerror(code));
        return failed;
    }
    if (moved > 0)
        send_file_update_connection_last_timestamp(&connection);
    return static_cast<int32_t>(moved);
}

} // namespace

} // namespace quillmere

using namespace quillmere;

int32_t send_file_new(send_file **connection, const char *url, int32_t use_tls, int64_t timeout)
{
    *connection = nullptr;
    easy_handle handle(curl_easy_init());
    if (!handle)
        return no_handle;

    certificate_store certificates = use_tls ? trusted_certificates(url) : nullptr;
    CURLcode code = connect(handle.get(), url, use_tls != 0, certificates.get(), timeout);
    if (code != CURLE_OK) {
        std::printf("Curl error: %s\n", curl_easy_strerror(code));
        return connect_failed;
    }
    long socket = -1;
    if (curl_easy_getinfo(handle.get(), CURLINFO_LASTSOCKET, &socket) != CURLE_OK) {
        static_cast<void>(handle.release()); // dropped as it is, deliberately
        return socket_unknown;
    }

    auto *connected = allocate_zeroed<send_file>();
    connected->handle = handle.release();
    connected->timeout = timeout;
    connected->socket = static_cast<int32_t>(socket);
    send_file_update_connection_last_timestamp(connected);
    *connection = connected;
    return 0;
}

int32_t send_file_write(send_file *connection, const void *data, uint64_t size)
{
    return move_chunk(*connection, POLLOUT, size, send_failed, [&](size_t *sent) {
        return curl_easy_send(connection->handle, data, size, sent);
    });
}

int32_t send_file_read(send_file *connection, void *buffer, uint64_t size)
{
    return move_chunk(*connection, POLLIN, size, receive_failed, [&](size_t *received) {
        return curl_easy_recv(connection->handle, buffer, size, received);
    });
}

void send_file_delete(send_file **connection)
{
    if (!connection || !*connection)
        return;
    send_file *deleted = std::exchange(*connection, nullptr);
    curl_easy_cleanup(deleted->handle);
    std::free(deleted);
}

uint64_t send_file_seconds_since_last_transmission(const send_file *connection)
{
    int64_t now = 0;
    if (!read_clock(now))
        return 0;
    return static_cast<uint64_t>(now - connection->last_transmission);
}

int64_t send_file_update_connection_last_timestamp(send_file *connection)
{
    int64_t now = 0;
    if (read_clock(now))
        connection->last_transmission = now;
    return now;
}
