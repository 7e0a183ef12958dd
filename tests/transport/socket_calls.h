// Stands between the upload connection and what it moves its bytes with: the clock, the wait for
// the socket, the pause, and libcurl.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include <curl/curl.h>
#include <poll.h>
#include <time.h>

namespace quillmere_test {

struct socket_wait {
    int descriptor;
    short events;
    int milliseconds;
};

inline bool operator==(const socket_wait &one, const socket_wait &other)
{
    return one.descriptor == other.descriptor && one.events == other.events &&
           one.milliseconds == other.milliseconds;
}

// What libcurl was asked to move.
struct chunk {
    const void *bytes;
    size_t size;
};

inline bool operator==(const chunk &one, const chunk &other)
{
    return one.bytes == other.bytes && one.size == other.size;
}

// While it lives, the calls of the thread that made it go by its fields.
class socket_calls {
public:
    using mover = std::function<CURLcode(size_t call, size_t *moved)>; // counted from 1

    socket_calls();
    ~socket_calls();
    socket_calls(const socket_calls &) = delete;
    socket_calls &operator=(const socket_calls &) = delete;

    std::optional<time_t> clock;          // what it says, -1 if it cannot be read; else the truth
    std::function<int(size_t call)> wait; // the result of a wait, counted from 1, instead of it
    mover move;                           // instead of sending and receiving
    bool pauses = false;                  // whether a pause takes its time

    std::vector<socket_wait> waits;
    std::vector<long> pauses_nanoseconds;
    std::vector<chunk> sent;
    std::vector<chunk> received;
    std::string order; // "w" for a wait, "m" for a chunk, "p" for a pause
};

} // namespace quillmere_test
