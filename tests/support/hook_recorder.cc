#include "support/hook_recorder.h"

#include <mutex>

namespace quillmere_test {
namespace {

std::mutex mutex;
std::vector<hook_call> recorded;

std::optional<std::string> owned_copy_of(const char *text)
{
    return text ? std::optional<std::string>(text) : std::nullopt;
}

extern "C" {
static int32_t record_call(const char *url, const char *response, int32_t status,
                           const char *message)
{
    std::lock_guard<std::mutex> lock(mutex);
    recorded.push_back(
        {owned_copy_of(url), owned_copy_of(response), status, owned_copy_of(message)});
    return 0;
}
}

} // namespace

hook_recorder::hook_recorder() : before_(check_api_error)
{
    std::lock_guard<std::mutex> lock(mutex);
    recorded.clear();
    check_api_error = record_call;
}

hook_recorder::~hook_recorder() { check_api_error = before_; }

std::vector<hook_call> hook_recorder::calls() const
{
    std::lock_guard<std::mutex> lock(mutex);
    return recorded;
}

} // namespace quillmere_test
