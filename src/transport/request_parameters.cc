// The parameters of a request object's URL. Each function appends one, or skips it by a rule of its
// own.
#include "quillmere.h"

namespace quillmere {

namespace {

enum class secrecy { open, sensitive };

// The separator is "&" for the first parameter too, so that every such URL reads "?&",
// deliberately.
void add_key(string_buffer *url, const char *key)
{
    string_append(url, "&");
    string_append(url, key);
    string_append(url, "=");
}

// A NULL value leaves the key with nothing behind it.
int64_t add_text(string_buffer *url, const char *key, const char *value, secrecy secret)
{
    add_key(url, key);
    return secret == secrecy::sensitive ? string_append_urlencode_obfs(url, value)
                                        : string_append_urlencode(url, value);
}

int64_t add_number(string_buffer *url, const char *key, int64_t value)
{
    add_key(url, key);
    return string_append_num(url, static_cast<uint64_t>(value));
}

int64_t skipped(const string_buffer *url) { return static_cast<int64_t>(string_get_size(url)); }

bool empty(const char *value) { return !value || !*value; }

} // namespace

} // namespace quillmere

using namespace quillmere;

int64_t url_add_required_parameter(string_buffer *url, const char *key, const char *value)
{
    return add_text(url, key, value, secrecy::open);
}

int64_t url_add_required_sensitive_parameter(string_buffer *url, const char *key, const char *value)
{
    return add_text(url, key, value, secrecy::sensitive);
}

int64_t url_add_required_num_parameter(string_buffer *url, const char *key, int64_t value)
{
    return add_number(url, key, value);
}

int64_t url_add_optional_parameter_null(string_buffer *url, const char *key, const char *value)
{
    return value ? add_text(url, key, value, secrecy::open) : skipped(url);
}

int64_t url_add_optional_parameter_null_or_empty(string_buffer *url, const char *key,
                                                 const char *value)
{
    return empty(value) ? skipped(url) : add_text(url, key, value, secrecy::open);
}

int64_t url_add_optional_sensitive_parameter_null(string_buffer *url, const char *key,
                                                  const char *value)
{
    return value ? add_text(url, key, value, secrecy::sensitive) : skipped(url);
}

int64_t url_add_optional_sensitive_parameter_null_or_empty(string_buffer *url, const char *key,
                                                           const char *value)
{
    return empty(value) ? skipped(url) : add_text(url, key, value, secrecy::sensitive);
}

int64_t url_add_optional_num_parameter_negative(string_buffer *url, const char *key, int64_t value)
{
    return value < 0 ? skipped(url) : add_number(url, key, value);
}

int64_t url_add_optional_num_parameter_zero(string_buffer *url, const char *key, int64_t value)
{
    return value <= 0 ? skipped(url) : add_number(url, key, value);
}

int64_t url_add_string_parameter_(string_buffer *url, const char *key, const char *value)
{
    return url_add_required_parameter(url, key, value);
}

int64_t url_add_sensitive_string_parameter_(string_buffer *url, const char *key, const char *value)
{
    return url_add_required_sensitive_parameter(url, key, value);
}

int64_t url_add_num_parameter_(string_buffer *url, const char *key, int64_t value)
{
    return url_add_required_num_parameter(url, key, value);
}
