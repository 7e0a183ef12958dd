#include "transport/socket_calls.h"

namespace quillmere_test {
namespace {

// The servers' threads wait for their sockets too.
thread_local socket_calls *current_sockets = nullptr;

} // namespace

socket_calls::socket_calls() { current_sockets = this; }
socket_calls::~socket_calls() { current_sockets = nullptr; }

} // namespace quillmere_test

using namespace quillmere_test;

extern "C" {

time_t real_time(time_t *out) __asm__("__real_time");
int real_poll(pollfd *waits, nfds_t count, int milliseconds) __asm__("__real_poll");
int real_nanosleep(const timespec *pause, timespec *left) __asm__("__real_nanosleep");
CURLcode real_send(CURL *handle, const void *bytes, size_t size,
                   size_t *moved) __asm__("__real_curl_easy_send");
CURLcode real_recv(CURL *handle, void *bytes, size_t size,
                   size_t *moved) __asm__("__real_curl_easy_recv");

time_t pretended_time(time_t *out) __asm__("__wrap_time");
int watched_poll(pollfd *waits, nfds_t count, int milliseconds) __asm__("__wrap_poll");
int watched_nanosleep(const timespec *pause, timespec *left) __asm__("__wrap_nanosleep");
CURLcode watched_send(CURL *handle, const void *bytes, size_t size,
                      size_t *moved) __asm__("__wrap_curl_easy_send");
CURLcode watched_recv(CURL *handle, void *bytes, size_t size,
                      size_t *moved) __asm__("__wrap_curl_easy_recv");

time_t pretended_time(time_t *out)
{
    if (!current_sockets || !current_sockets->clock)
        return real_time(out);
    if (out)
        *out = *current_sockets->clock;
    return *current_sockets->clock;
}

int watched_poll(pollfd *waits, nfds_t count, int milliseconds)
{
    if (!current_sockets)
        return real_poll(waits, count, milliseconds);
    current_sockets->waits.push_back({waits->fd, waits->events, milliseconds});
    current_sockets->order += 'w';
    return current_sockets->wait ? current_sockets->wait(current_sockets->waits.size())
                                 : real_poll(waits, count, milliseconds);
}

int watched_nanosleep(const timespec *pause, timespec *left)
{
    if (!current_sockets)
        return real_nanosleep(pause, left);
    current_sockets->pauses_nanoseconds.push_back(pause->tv_sec * 1'000'000'000 + pause->tv_nsec);
    current_sockets->order += 'p';
    return current_sockets->pauses ? real_nanosleep(pause, left) : 0;
}

CURLcode watched_send(CURL *handle, const void *bytes, size_t size, size_t *moved)
{
    if (!current_sockets)
        return real_send(handle, bytes, size, moved);
    current_sockets->sent.push_back({bytes, size});
    current_sockets->order += 'm';
    return current_sockets->move ? current_sockets->move(current_sockets->sent.size(), moved)
                                 : real_send(handle, bytes, size, moved);
}

CURLcode watched_recv(CURL *handle, void *bytes, size_t size, size_t *moved)
{
    if (!current_sockets)
        return real_recv(handle, bytes, size, moved);
    current_sockets->received.push_back({bytes, size});
    current_sockets->order += 'm';
    return current_sockets->move ? current_sockets->move(current_sockets->received.size(), moved)
                                 : real_recv(handle, bytes, size, moved);
}

} // extern "C"
