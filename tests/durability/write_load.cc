#include "durability/write_load.h"

write_load::write_load(std::vector<writer> &writers, std::uint16_t port) : running_(writers.size())
{
    for (writer &each : writers)
        threads_.emplace_back([this, &each, port] { run(each, port); });
}

write_load::~write_load()
{
    for (std::thread &each : threads_)
        each.join();
}

void write_load::wait_past(std::size_t acknowledgements, std::chrono::microseconds some_time)
{
    std::unique_lock<std::mutex> lock(mutex_);
    changed_.wait(lock, [&] { return acknowledged_ >= acknowledgements || running_ == 0; });
    // Nothing is waited for here but the instant, so that it falls anywhere within a change.
    changed_.wait_for(lock, some_time, [&] { return running_ == 0; });
}

void write_load::run(writer &which, std::uint16_t port)
{
    which.write(port, [this] {
        const std::lock_guard<std::mutex> lock(mutex_);
        ++acknowledged_;
        changed_.notify_all();
    });
    const std::lock_guard<std::mutex> lock(mutex_);
    --running_;
    changed_.notify_all();
}
