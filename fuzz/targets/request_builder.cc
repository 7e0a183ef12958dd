// A request object: its parameters, and what is sent, shown and made of the reply.
#include <optional>

#include "support/choices.h"
#include "support/library.h"
#include "support/reference_document.h"
#include "support/stubbed_exchange.h"

namespace quillmere_fuzz {
namespace {

enum class skips { never, null, null_or_empty };

struct text_parameter {
    int64_t (*add)(string_buffer *url, const char *key, const char *value);
    skips skipped;
    bool secret;
};

const text_parameter text_parameters[] = {
    {url_add_required_parameter, skips::never, false},
    {url_add_required_sensitive_parameter, skips::never, true},
    {url_add_optional_parameter_null, skips::null, false},
    {url_add_optional_parameter_null_or_empty, skips::null_or_empty, false},
    {url_add_optional_sensitive_parameter_null, skips::null, true},
    {url_add_optional_sensitive_parameter_null_or_empty, skips::null_or_empty, true},
};

struct number_parameter {
    int64_t (*add)(string_buffer *url, const char *key, int64_t value);
    int64_t smallest;
};

const number_parameter number_parameters[] = {
    {url_add_required_num_parameter, INT64_MIN},
    {url_add_optional_num_parameter_negative, 0},
    {url_add_optional_num_parameter_zero, 1},
};

constexpr const char *hidden = "(omitted)";

struct expected_url {
    std::string sent;
    std::string shown;

    void add(const std::string &both) { add(both, both); }

    void add(const std::string &to_send, const std::string &to_show)
    {
        sent += to_send;
        shown += to_show;
    }
};

std::string encoded(const std::string &text)
{
    owned_buffer buffer(string_new(0));
    string_append_urlencode(buffer.get(), text.c_str());
    return string_get(buffer.get());
}

bool is_skipped(skips rule, const std::optional<std::string> &value)
{
    return (rule != skips::never && !value) ||
           (rule == skips::null_or_empty && value.value_or("").empty());
}

void add_text(string_buffer *url, expected_url &expected, choices &chosen)
{
    const text_parameter &kind = text_parameters[chosen.below(std::size(text_parameters))];
    std::string key = chosen.text();
    std::optional<std::string> value;
    if (chosen.below(8) > 0)
        value = chosen.text();

    int64_t length = kind.add(url, key.c_str(), value ? value->c_str() : nullptr);

    if (!is_skipped(kind.skipped, value)) {
        std::string sent = encoded(value.value_or(""));
        expected.add("&" + key + "=");
        expected.add(sent, kind.secret && !sent.empty() ? hidden : sent);
    }
    bool nothing_to_encode = kind.skipped == skips::never && !value;
    expect(length == (nothing_to_encode ? -1 : static_cast<int64_t>(expected.sent.size())),
           "the new length");
}

void add_number(string_buffer *url, expected_url &expected, choices &chosen)
{
    const number_parameter &kind = number_parameters[chosen.below(std::size(number_parameters))];
    std::string key = chosen.text();
    uint64_t bits = chosen.number();
    auto value = static_cast<int64_t>(bits);

    int64_t length = kind.add(url, key.c_str(), value);

    if (value >= kind.smallest)
        expected.add("&" + key + "=" + std::to_string(bits));
    expect(length == static_cast<int64_t>(expected.sent.size()), "the new length");
}

struct owned_request {
    api_request *made = api_request_new();
    ~owned_request() { api_request_delete(&made); }
};

expected_url build(api_request &request, choices &chosen)
{
    std::string path = chosen.text();
    bool encrypted = chosen.yes();
    request.url = (encrypted ? api_url_new_https : api_url_new_http)(path.c_str());
    expected_url expected;
    expected.add(urls[encrypted ? 1 : 0] + path + "?");
    for (size_t left = chosen.below(16); left > 0; --left) {
        if (chosen.below(4) > 0)
            add_text(request.url, expected, chosen);
        else
            add_number(request.url, expected, chosen);
    }
    return expected;
}

int32_t expected_status(const document &reply, const stubbed_exchange &exchange)
{
    if (!exchange.body)
        return exchange.code < 1 ? QM_NO_RESPONSE : QM_UNUSABLE_RESPONSE;
    if (!reply.well_formed)
        return QM_MALFORMED_REPLY;
    std::optional<std::string> result = look_up(reply, "result");
    if (!result)
        return exchange.code < 1 ? QM_NO_RESPONSE : QM_UNUSABLE_RESPONSE;
    return *result == "Success" ? QM_OK : read_error(reply).number;
}

void try_request(std::string_view input)
{
    silence_log();
    choices chosen(input);
    owned_request request;
    expected_url expected;
    within_budget(linear, input.size(), [&] { expected = build(*request.made, chosen); });
    expect(string_get(request.made->url) == expected.sent, "the URL");
    expect(string_get_obfs(request.made->url, nullptr) == expected.shown, "the URL as it is shown");

    the_exchange().code = chosen.byte() * 3 - 1;
    the_exchange().body.reset();
    if (chosen.yes())
        the_exchange().body = std::string(chosen.rest());
    char *message = nullptr;
    int32_t status = 77;
    within_budget(linear, input.size(), [&] { status = make_api_call(request.made, &message); });
    owned_text owned(message);

    expect(the_exchange().asked == expected.sent, "what is asked is the whole URL");
    if (input.size() <= most_bytes_to_compare)
        expect(status ==
                   expected_status(read_document(the_exchange().body.value_or("")), the_exchange()),
               "the status");
}

const known_target builder("request_builder", try_request);

} // namespace
} // namespace quillmere_fuzz
