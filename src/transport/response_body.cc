#include "transport/response_body.h"

#include "quillmere.h"

namespace quillmere {

namespace {

uint64_t response_limit = 0;

extern "C" {
static size_t write_within_limit(char *data, size_t size, size_t count, void *body)
{
    return static_cast<response_body *>(body)->take(data, size * count);
}
}

} // namespace

void response_body::receive_with(CURL *handle)
{
    limit_ = response_limit;
    if (limit_ == 0) {
        curl_easy_setopt(handle, CURLOPT_WRITEFUNCTION, curl_write_function);
        curl_easy_setopt(handle, CURLOPT_WRITEDATA, received_);
        return;
    }
    curl_easy_setopt(handle, CURLOPT_WRITEFUNCTION, write_within_limit);
    curl_easy_setopt(handle, CURLOPT_WRITEDATA, this);
}

size_t response_body::take(const char *bytes, size_t count)
{
    if (count <= limit_ - received_->length)
        return curl_write_function(const_cast<char *>(bytes), 1, count, received_);
    qm_printf("Response is longer than the limit of %llu bytes.\n",
              static_cast<unsigned long long>(limit_));
    return 0; // libcurl ends the transfer
}

} // namespace quillmere

int32_t set_response_limit(int64_t bytes)
{
    if (bytes < 0) {
        qm_printf("set_response_limit error: limit must not be negative\n");
        return 1;
    }
    quillmere::response_limit = static_cast<uint64_t>(bytes);
    return 0;
}
