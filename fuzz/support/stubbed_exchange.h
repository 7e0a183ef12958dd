// Stands in for the exchange, so that what is built upon it can be given any reply at all. The
// linker leads get_response_from_url() here.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace quillmere_fuzz {

struct stubbed_exchange {
    int64_t code = -1;
    std::optional<std::string> body; // none: NULL
    std::string asked;               // the URL of the last exchange
    std::string posted;              // and its body
};

stubbed_exchange &the_exchange();

} // namespace quillmere_fuzz
