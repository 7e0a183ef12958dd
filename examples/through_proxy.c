/*
 * How do I go through a proxy, with a root certificate of my own?
 *
 *     through_proxy PROXY-HOST PROXY-PORT
 *
 * Prints how much of its storage the account uses.
 *
 * Environment: QUILLMERE_SERVICE   the service, such as https://localhost:8443
 *              QUILLMERE_CA_FILE   the root certificate that vouches for it (PEM)
 *              QUILLMERE_EMAIL, QUILLMERE_PASSWORD
 *              QUILLMERE_PROXY_USER, QUILLMERE_PROXY_PASSWORD, if the proxy asks for them
 */
#include <inttypes.h>
#include <stdio.h>
#include <stdlib.h>

#include <quillmere.h>

static void complain(const char *step, int32_t status, char *message)
{
    /* What a login hands out with a malformed reply may be the token: nothing to show. */
    int is_fit_to_show = message && status != QM_MALFORMED_REPLY;
    fprintf(stderr, "%s failed: %" PRId32 " %s\n", step, status, is_fit_to_show ? message : "");
    api_free(message);
}

/* Returns the session token, or NULL. */
static char *log_in(void)
{
    /* The application's own id and key; these are what a fresh emulator knows. */
    char *token = NULL;
    int32_t status = get_session_token(getenv("QUILLMERE_EMAIL"), getenv("QUILLMERE_PASSWORD"),
                                       NULL, "42", "quillmere-development-key", &token);
    if (status == QM_OK)
        return token;
    complain("logging in", status, token);
    return NULL;
}

static int show_storage(const char *token)
{
    user_limits *limits = NULL;
    char *message = NULL;
    int32_t status = get_user_limits(token, &limits, &message);
    if (status != QM_OK) {
        complain("reading the limits", status, message);
        return 0;
    }
    const char *used = user_limits_get_storage_used(limits);
    const char *limit = user_limits_get_storage_limit(limits);
    printf("%s of %s bytes used\n", used ? used : "?", limit ? limit : "?");
    user_limits_delete(&limits);
    return 1;
}

static void use_proxy(const char *host, const char *port)
{
    /* The texts are copied. libcurl heeds no_proxy in the environment all the same, and a proxy
     * that the environment names is not asked any more. Uploads (send_file_new) know no proxy. */
    set_user_proxy(host, strtol(port, NULL, 10), getenv("QUILLMERE_PROXY_USER"),
                   getenv("QUILLMERE_PROXY_PASSWORD"));
    proxy_server.enabled = 1; /* the description alone changes nothing */
}

int main(int argc, char **argv)
{
    const char *ca_file = getenv("QUILLMERE_CA_FILE");
    FILE *log = fopen("/dev/null", "w");
    urls[1] = getenv("QUILLMERE_SERVICE");
    if (argc != 3 || !log || !ca_file || !urls[1]) {
        fputs("usage: through_proxy PROXY-HOST PROXY-PORT; its source tells of the environment\n",
              stderr);
        return 2;
    }
    set_output_file(log); /* it shows session tokens, so keep it from the terminal */
    /* The proxy opens a tunnel and sees nothing of what passes: what this file has to vouch for is
     * the service. For a proxy that looks inside, its own root belongs into it. */
    api_global_init(ca_file);
    use_proxy(argv[1], argv[2]);

    char *token = log_in();
    int done = token && show_storage(token);

    api_free(token);
    api_global_cleanup();
    fclose(log);
    return done ? EXIT_SUCCESS : EXIT_FAILURE;
}
