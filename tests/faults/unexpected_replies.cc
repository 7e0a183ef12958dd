// Good HTTP whose content is not what was asked for.
#include "faults/fault.h"

namespace quillmere_test {
namespace {

// "<response/>", compressed.
const std::string gzip_body(
    "\x1f\x8b\x08\x00\x00\x00\x00\x00\x00\x03\xb3\x29\x4a\x2d\x2e\xc8\xcf\x2b\x4e\xd5\xb7\x03\x00"
    "\xc1\xd7\x2c\x6a\x0b\x00\x00\x00",
    31);

const std::string tidy_page = "<html><body><h1>Forbidden</h1></body></html>";
const std::string page = "<html><body>Sorry!<br>Come back later.</body></html>";

fault page_with(const std::string &kind, const std::string &text, int status, int32_t becomes)
{
    return {kind + " with status " + std::to_string(status),
            {answering(http_reply(status, text, {"Content-Type: text/html"}))},
            yields_unusable(status, text, becomes)};
}

fault empty_with(int status)
{
    return {"empty reply with status " + std::to_string(status),
            {answering(http_reply(status, ""))},
            yields_unusable(status, std::nullopt, QM_UNUSABLE_RESPONSE)};
}

} // namespace

std::vector<fault> unexpected_replies()
{
    return {
        {"gzip that nobody asked for",
         {answering(http_reply(200, gzip_body, {"Content-Encoding: gzip"}))},
         yields_unusable(200, gzip_body, QM_MALFORMED_REPLY)},
        page_with("page", page, 200, QM_MALFORMED_REPLY),
        page_with("page", page, 403, QM_MALFORMED_REPLY),
        page_with("page", page, 500, QM_MALFORMED_REPLY),
        page_with("well formed page", tidy_page, 200, QM_UNUSABLE_RESPONSE),
        page_with("well formed page", tidy_page, 403, QM_UNUSABLE_RESPONSE),
        page_with("well formed page", tidy_page, 500, QM_UNUSABLE_RESPONSE),
        empty_with(200),
        empty_with(204),
        empty_with(500),
        // The service's word counts, not the status.
        {"good reply with status 500", {answering(http_reply(500, good_body))}, succeeds(500)},
    };
}

} // namespace quillmere_test
