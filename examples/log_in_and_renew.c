/*
 * How do I log in, and keep the session alive?
 *
 *     log_in_and_renew
 *
 * Logs in, trades the session token for a fresh one, and reads the account's revision with that.
 *
 * Environment: QUILLMERE_SERVICE   the service, such as https://localhost:8443
 *              QUILLMERE_CA_FILE   the root certificate that vouches for it (PEM)
 *              QUILLMERE_EMAIL, QUILLMERE_PASSWORD
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

/* Takes the token over and returns the one to go on with, or NULL. */
static char *renew(char *token)
{
    char *fresh = NULL;
    int32_t status = renew_session_token(token, &fresh);
    if (status == QM_OK) {
        api_free(token); /* the service has ended it */
        return fresh;
    }
    complain("renewing", status, fresh);
    if (status < 0)
        return token; /* the service did not refuse it: it may well be good still */
    api_free(token);
    return log_in(); /* it has ended, and only the password helps */
}

static int show_revision(const char *token)
{
    uint64_t revision = 0;
    int32_t busy = 0;
    char *message = NULL;
    int32_t status = get_device_status(token, 0, &revision, &busy, &message);
    if (status != QM_OK) {
        complain("reading the revision", status, message);
        return 0;
    }
    printf("revision %" PRIu64 "\n", revision);
    return 1;
}

int main(void)
{
    const char *ca_file = getenv("QUILLMERE_CA_FILE");
    FILE *log = fopen("/dev/null", "w");
    urls[1] = getenv("QUILLMERE_SERVICE");
    if (!log || !ca_file || !urls[1]) {
        fputs("usage: log_in_and_renew; its source tells of the environment\n", stderr);
        return 2;
    }
    set_output_file(log); /* it shows session tokens, so keep it from the terminal */
    api_global_init(ca_file);

    char *token = log_in();
    if (token) /* in time: an unused session ends by itself after some minutes */
        token = renew(token);
    int done = token && show_revision(token);

    api_free(token);
    api_global_cleanup();
    fclose(log);
    return done ? EXIT_SUCCESS : EXIT_FAILURE;
}
