// Several writers at work at once, each on a thread of its own.
#pragma once

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <mutex>
#include <thread>
#include <vector>

#include "durability/writer.h"

class write_load {
public:
    /** Starts the writers. They stop when the server does. */
    write_load(std::vector<writer> &writers, std::uint16_t port);
    ~write_load();
    write_load(const write_load &) = delete;
    write_load &operator=(const write_load &) = delete;

    /** Returns some time after so many changes were acknowledged, or once no writer is left. */
    void wait_past(std::size_t acknowledgements, std::chrono::microseconds some_time);

private:
    void run(writer &which, std::uint16_t port);

    std::mutex mutex_;
    std::condition_variable changed_;
    std::size_t acknowledged_ = 0;
    std::size_t running_;
    std::vector<std::thread> threads_;
};
