// The little HTTP that the scripted server needs: a request as it arrived, and replies as text.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace quillmere_test {

struct request {
    std::string head; // everything up to and with the empty line, exactly as it arrived
    std::string method;
    std::string target;
    std::string version;
    std::vector<std::pair<std::string, std::string>> headers; // in the order of arrival
    std::string body;

    // The value of a header, whose name may be written in any case.
    std::optional<std::string> header(std::string_view name) const;

    // The target up to its "?".
    std::string path() const;

    // The value of a query parameter as it was sent, still percent-encoded.
    std::optional<std::string> parameter(std::string_view name) const;
};

// Reads a head that ends in an empty line. The body is left empty.
request parse_request_head(std::string head);

using header_lines = std::vector<std::string>; // such as "Location: /elsewhere"

// A whole answer, with its Content-Length and "Connection: close".
std::string http_reply(int status, std::string_view body, const header_lines &extra_headers = {});

// The answer 200 with an XML body.
std::string xml_reply(std::string_view body);

// What the service says of a call that did its work, with the elements behind the result.
std::string success_body(std::string_view elements);
std::string success_reply(std::string_view elements);

} // namespace quillmere_test
