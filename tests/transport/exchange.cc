#include "transport/exchange.h"

namespace quillmere_test {

exchange fetch(const std::string &url, posted post, int64_t timeout_seconds)
{
    char rubbish[] = "rubbish";
    char *response = rubbish;
    uint64_t length = 77;
    int64_t code = get_response_from_url(url.c_str(), post.body, post.length, &response, &length,
                                         timeout_seconds);

    exchange result = {code, std::nullopt, length};
    if (response) {
        EXPECT_NE(response, rubbish);
        EXPECT_EQ(response[length], '\0');
        result.body = std::string(response, length);
        api_free(response);
    }
    return result;
}

std::string literally(const std::string &text)
{
    std::string pattern;
    for (char each : text) {
        if (std::string_view("\\^$.|?*+()[]{}").find(each) != std::string_view::npos)
            pattern += '\\';
        pattern += each;
    }
    return pattern;
}

std::string failure_line(CURLcode code, const char *said)
{
    std::string start =
        "cUrl error: (" + std::to_string(code) + ") " + curl_easy_strerror(code) + ": ";
    return literally(start) + said + "\n";
}

const char *const any_failure_line = "cUrl error: \\([0-9]+\\) [^\n]+: [^\n]+\n";

std::string repeated(const std::string &text, size_t times)
{
    std::string result;
    for (size_t i = 0; i < times; ++i)
        result += text;
    return result;
}

} // namespace quillmere_test
