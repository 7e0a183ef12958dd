#include "support/stubbed_exchange.h"

#include <cstdlib>
#include <cstring>

#include "quillmere.h"

namespace quillmere_fuzz {

stubbed_exchange &the_exchange()
{
    static stubbed_exchange exchange;
    return exchange;
}

} // namespace quillmere_fuzz

extern "C" {

int64_t stubbed_get_response(const char *url, const void *body, uint64_t body_length,
                             char **response, uint64_t *response_length,
                             int64_t) __asm__("__wrap_get_response_from_url");

int64_t stubbed_get_response(const char *url, const void *body, uint64_t body_length,
                             char **response, uint64_t *response_length, int64_t)
{
    auto &exchange = quillmere_fuzz::the_exchange();
    exchange.asked = url;
    exchange.posted.assign(static_cast<const char *>(body), body ? body_length : 0);
    *response = nullptr;
    *response_length = 0;
    if (!exchange.body)
        return exchange.code;
    *response_length = exchange.body->size();
    *response = static_cast<char *>(std::malloc(*response_length + 1));
    std::memcpy(*response, exchange.body->c_str(), *response_length + 1);
    return exchange.code;
}
}
