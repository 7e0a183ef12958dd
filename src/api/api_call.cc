#include "api/api_call.h"

#include <cstring>

#include "text/number.h"
#include "transport/failed_exchange.h"

namespace quillmere {

namespace {

constexpr auto standard_reply = index_of(standard_elements);
constexpr auto direct_reply = index_of(direct_elements);

} // namespace

api_call::api_call(const char *path, char **error_message)
    : url_(string_new(256)), error_message_(error_message)
{
    *error_message_ = nullptr;
    string_append(url_.get(), urls[1]);
    string_append(url_.get(), path);
}

void api_call::text(const char *text) { string_append(url_.get(), text); }

void api_call::plain(const char *key, const char *value)
{
    string_append(url_.get(), key);
    string_append(url_.get(), value);
}

void api_call::encoded(const char *key, const char *value)
{
    string_append(url_.get(), key);
    string_append_urlencode(url_.get(), value);
}

void api_call::secret(const char *key, const char *value)
{
    string_append(url_.get(), key);
    string_append_urlencode_obfs(url_.get(), value);
}

void api_call::number(const char *key, uint64_t value)
{
    string_append(url_.get(), key);
    string_append_num(url_.get(), value);
}

void api_call::version() { plain("&version=", api_version); }

void api_call::fetch(const char *url_heading, reply_log log)
{
    log_url(url_heading);
    char *reply = nullptr;
    response_code_ =
        get_response_from_url(string_get(url_.get()), nullptr, 0, &reply, &reply_length_, 0);
    reply_.reset(reply);
    log_reply(log);
}

void api_call::pretend(const char *url_heading, const char *reply, uint64_t length)
{
    log_url(url_heading);
    reply_.reset(string_dup(reply));
    reply_length_ = length;
    log_reply(reply_log::text);
}

void api_call::log_url(const char *heading)
{
    if (heading)
        qm_printf("%s%s\n", heading, string_get_obfs(url_.get(), nullptr));
}

void api_call::log_reply(reply_log log) const
{
    if (log == reply_log::none)
        return;
    qm_printf("%s\n%s\n", log == reply_log::response ? "Got response:" : "Got text:", reply_.get());
    if (log == reply_log::text_and_length)
        qm_printf("Text len: %lu\n", static_cast<unsigned long>(reply_length_));
    if (log == reply_log::text_and_int_length)
        qm_printf("Text len: %d\n", static_cast<int>(reply_length_));
}

bool api_call::accepted(error_reading reading, exchange_verdict verdict)
{
    if (!reader_.expects())
        reader_.expect(reading == error_reading::direct ? direct_reply : standard_reply);
    heap_text result = text_of("result");
    if (!result) {
        failed_exchange(verdict);
        return false;
    }
    if (std::strcmp(result.get(), "Success") != 0) {
        refused(reading);
        return false;
    }
    status_ = QM_OK;
    return true;
}

heap_text api_call::text_of(const char *element)
{
    heap_text text;
    if (read_in_one_pass() && reader_.take(element, &text))
        return text;
    int32_t parse_failed = 0;
    text.reset(simple_get_xml_node_value(reply_.get(), reply_length_, element, &parse_failed));
    parse_failures_ += static_cast<uint32_t>(parse_failed);
    return text;
}

bool api_call::read_in_one_pass()
{
    if (one_pass_ == one_pass::untried)
        one_pass_ = reader_.read(reply_.get(), reply_length_) ? one_pass::whole : one_pass::failed;
    return one_pass_ == one_pass::whole;
}

heap_text api_call::required_text_of(const char *element)
{
    heap_text text = text_of(element);
    if (!text)
        reply_is_unusable();
    return text;
}

void api_call::refused(error_reading reading)
{
    if (reading == error_reading::direct)
        read_error("error", "message", QM_NO_ERROR_ELEMENT);
    else if (one_pass_ == one_pass::whole)
        read_error("/error", "/message", QM_UNUSABLE_ERROR_NUMBER);
    else
        get_error_from_xml(reply_.get(), reply_length_, &status_, error_message_);
    if (check_api_error)
        check_api_error(string_get(url_.get()), reply_.get(), status_, *error_message_);
}

void api_call::read_error(const char *number_element, const char *message_element,
                          int32_t without_number)
{
    heap_text number = text_of(number_element);
    status_ = number ? error_number_in(number.get()) : without_number;
    *error_message_ = text_of(message_element).release();
}

void api_call::failed_exchange(exchange_verdict verdict)
{
    status_ = failed_exchange_status(response_code_);
    if (verdict == exchange_verdict::silent_unless_zero)
        status_ = !reply_ && response_code_ == 0 ? QM_NO_RESPONSE : QM_UNUSABLE_RESPONSE;
    if (verdict == exchange_verdict::with_message)
        *error_message_ = failed_exchange_message(response_code_).release();
}

} // namespace quillmere
