/* Compiled as C99, so that the offsets are those that a C program sees. */
#include "interface/layout.h"

#include "quillmere.h"

/* clang-format off */
#define OFFSET(type, field, expected) {#type "." #field, offsetof(type, field), expected}
#define SIZE(type, expected) {"size of " #type, sizeof(type), expected}
/* clang-format on */

const struct layout_entry layout_entries[] = {
    OFFSET(transfer_settings, path, 0),
    OFFSET(transfer_settings, default_timeout, 8),
    OFFSET(transfer_settings, connection_attempts, 16),
    SIZE(transfer_settings, 24),

    OFFSET(proxy_settings, enabled, 0),
    OFFSET(proxy_settings, host, 8),
    OFFSET(proxy_settings, user, 16),
    OFFSET(proxy_settings, password, 24),
    OFFSET(proxy_settings, port, 32),
    SIZE(proxy_settings, 40),

    OFFSET(string_buffer, length, 0),
    OFFSET(string_buffer, capacity, 8),
    OFFSET(string_buffer, bytes, 16),
    OFFSET(string_buffer, redaction_ranges, 24),
    OFFSET(string_buffer, redacted_copy, 32),
    SIZE(string_buffer, 40),

    OFFSET(redaction_range, start, 0),
    OFFSET(redaction_range, end, 8),
    OFFSET(redaction_range, next, 16),
    SIZE(redaction_range, 24),

    OFFSET(node_value_state, sought, 0),
    OFFSET(node_value_state, value, 8),
    OFFSET(node_value_state, collecting, 16),
    OFFSET(node_value_state, depth, 20),
    OFFSET(node_value_state, path, 24),
    SIZE(node_value_state, 32),

    SIZE(ssl_disabled, 4),
    SIZE(urls, 4 * sizeof(char *)),
    SIZE(qm_status, 4),
};

const size_t layout_entry_count = sizeof layout_entries / sizeof layout_entries[0];
