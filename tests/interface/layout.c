/* Compiled as C99, so that the offsets are those that a C program sees. */
#include "interface/layout.h"

#include "quillmere.h"

/* clang-format off */
#define FIELD(type, field, offset, size)                               \
    {"offset of " #type "." #field, offsetof(type, field), offset},    \
    {"size of " #type "." #field, sizeof(((type *)0)->field), size}
#define SIZE(type, expected) {"size of " #type, sizeof(type), expected}
/* clang-format on */

const struct layout_entry layout_entries[] = {
    FIELD(transfer_settings, path, 0, 8),
    FIELD(transfer_settings, default_timeout, 8, 8),
    FIELD(transfer_settings, connection_attempts, 16, 4),
    SIZE(transfer_settings, 24),

    FIELD(proxy_settings, enabled, 0, 4),
    FIELD(proxy_settings, host, 8, 8),
    FIELD(proxy_settings, user, 16, 8),
    FIELD(proxy_settings, password, 24, 8),
    FIELD(proxy_settings, port, 32, 8),
    SIZE(proxy_settings, 40),

    FIELD(string_buffer, length, 0, 8),
    FIELD(string_buffer, capacity, 8, 8),
    FIELD(string_buffer, bytes, 16, 8),
    FIELD(string_buffer, redaction_ranges, 24, 8),
    FIELD(string_buffer, redacted_copy, 32, 8),
    SIZE(string_buffer, 40),

    FIELD(redaction_range, start, 0, 8),
    FIELD(redaction_range, end, 8, 8),
    FIELD(redaction_range, next, 16, 8),
    SIZE(redaction_range, 24),

    FIELD(node_value_state, sought, 0, 8),
    FIELD(node_value_state, value, 8, 8),
    FIELD(node_value_state, collecting, 16, 4),
    FIELD(node_value_state, depth, 20, 4),
    FIELD(node_value_state, path, 24, 8),
    SIZE(node_value_state, 32),

    FIELD(send_file, handle, 0, 8),
    FIELD(send_file, timeout, 8, 8),
    FIELD(send_file, socket, 16, 4),
    FIELD(send_file, last_transmission, 24, 8),
    SIZE(send_file, 32),

    FIELD(api_request, url, 0, 8),
    FIELD(api_request, post_data, 8, 8),
    FIELD(api_request, response, 16, 8),
    FIELD(api_request, response_length, 24, 8),
    FIELD(api_request, timeout, 32, 8),
    FIELD(api_request, verbose, 40, 4),
    SIZE(api_request, 48),

    SIZE(ssl_disabled, 4),
    SIZE(urls, 4 * sizeof(char *)),
    SIZE(qm_status, 4),
};

const size_t layout_entry_count = sizeof layout_entries / sizeof layout_entries[0];
