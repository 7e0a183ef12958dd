/* A program's own functions, which happen to have names that the library has too. They are for the
   program alone: the library must not notice them. */
#include <stdio.h>
#include <stdlib.h>

static void must_not_be_called(const char *name)
{
    fprintf(stderr, "the library called the program's own %s\n", name);
    exit(EXIT_FAILURE);
}

/* clang-format off */
#define OWN_FUNCTION(name) void name(void); void name(void) { must_not_be_called(#name); }
/* clang-format on */

OWN_FUNCTION(string_new)
OWN_FUNCTION(string_append)
OWN_FUNCTION(string_append_len)
OWN_FUNCTION(string_append_num)
OWN_FUNCTION(string_get)
OWN_FUNCTION(string_delete)
OWN_FUNCTION(string_dup)
OWN_FUNCTION(qm_printf)
OWN_FUNCTION(get_response_from_url)
OWN_FUNCTION(curl_write_function)
OWN_FUNCTION(simple_get_xml_node_value)
OWN_FUNCTION(get_error_from_xml)
OWN_FUNCTION(create_curl_share_init)
OWN_FUNCTION(curl_sh_lock_function)
OWN_FUNCTION(tls_init)
OWN_FUNCTION(cleanup_proxy)
