// What an upload server answers, headers and all.
#include <cstdlib>

#include "support/library.h"
#include "support/reference_document.h"

namespace quillmere_fuzz {
namespace {

struct upload_answer {
    int32_t status;
    std::optional<std::string> key;
};

std::string_view body_of(std::string_view reply)
{
    // One that ends with the reply has nothing behind it, and is none.
    size_t end_of_headers = reply.substr(0, reply.size() - 1).find("\r\n\r\n");
    return end_of_headers == std::string_view::npos ? reply : reply.substr(end_of_headers + 4);
}

upload_answer read_answer(std::string_view reply)
{
    if (reply.size() < 4)
        return {-1, std::nullopt};
    document body = read_document(body_of(reply));
    if (!body.well_formed)
        return {QM_MALFORMED_REPLY, std::nullopt};
    std::optional<std::string> result = look_up(body, "result");
    bool accepted = result && result->substr(0, 1) == "0";
    return {accepted ? std::atoi(result->c_str()) : -1, look_up(body, "key")};
}

void try_reply(std::string_view input)
{
    silence_log();
    // Without a NUL behind it, as it comes off a connection.
    std::vector<char> reply(input.begin(), input.end());
    char *key = nullptr;
    int32_t status = 77;
    within_budget(linear, input.size(),
                  [&] { status = parse_upload_response(reply.data(), reply.size(), &key); });
    owned_text owned(key);
    if (input.size() > most_bytes_to_compare)
        return;

    upload_answer expected = read_answer(input);
    expect(status == expected.status, "the status of an upload");
    expect(as_optional(key) == expected.key, "the key of an upload");
}

const known_target upload("upload_reply", try_reply);

} // namespace
} // namespace quillmere_fuzz
