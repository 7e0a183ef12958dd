/* Makes one request through the library, with every exported variable set, and says what came of
   it: caller LIBRARY BASE CA_PATH SSL_DISABLED PROXY_PORT. An empty CA_PATH is none. The log goes
   to descriptor 3. */
#include "interface/caller.h"

#include <inttypes.h>
#include <stdio.h>
#include <stdlib.h>

static int32_t print_refusal(const char *url, const char *response, int32_t status,
                             const char *message)
{
    printf("hook: %s, %s, %" PRId32 ", %s\n", url, response, status, message);
    return 0;
}

int main(int count, char **arguments)
{
    struct settings settings;
    struct device_status result;
    if (count != 6)
        return EXIT_FAILURE;

    settings.library = arguments[1];
    settings.base = arguments[2];
    settings.ca_path = arguments[3][0] != '\0' ? arguments[3] : NULL;
    settings.ssl_disabled = (int32_t)strtol(arguments[4], NULL, 10);
    settings.proxy_port = strtol(arguments[5], NULL, 10);
    settings.log = fopen("/dev/fd/3", "w");
    settings.hook = print_refusal;
    if (settings.log == NULL)
        return EXIT_FAILURE;

    result = ask_for_device_status(&settings);
    printf("status %" PRId32 ", revision %" PRIu64 ", busy %" PRId32 ", error %s\n", result.status,
           result.revision, result.busy, result.error != NULL ? result.error : "none");
    free(result.error);
    fclose(settings.log);
    return EXIT_SUCCESS;
}
