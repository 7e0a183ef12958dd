/*
 * How do I see every refusal in one place?
 *
 *     error_hook QUICK-KEY...
 *
 * Prints size and name of each file. An error hook, not the code that calls, notices what the
 * service refuses.
 *
 * Environment: QUILLMERE_SERVICE   the service, such as https://localhost:8443
 *              QUILLMERE_CA_FILE   the root certificate that vouches for it (PEM)
 *              QUILLMERE_EMAIL, QUILLMERE_PASSWORD
 */
#include <inttypes.h>
#include <pthread.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

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

/* The hook runs on whichever thread called the operation. */
static pthread_mutex_t refusals_lock = PTHREAD_MUTEX_INITIALIZER;
static int refusals = 0;

/* Told of everything that was answered and is no "Success". The texts are the library's. */
static int32_t note_refusal(const char *url, const char *response, int32_t status,
                            const char *message)
{
    (void)response; /* the whole reply, should the message not do */
    pthread_mutex_lock(&refusals_lock);
    ++refusals;
    pthread_mutex_unlock(&refusals_lock);
    /* Up to the "?" alone: behind it stand session tokens, and a login's password. */
    fprintf(stderr, "refused: %.*s: %" PRId32 " %s\n", (int)strcspn(url, "?"), url, status,
            message ? message : "");
    return 0;
}

/* Returns whether there was an answer, a refusal being one. */
static int show(const char *token, const char *quick_key)
{
    file_info *info = NULL;
    char *message = NULL;
    int32_t status = get_file_info(quick_key, token, &message, &info);
    if (status == QM_OK) {
        const char *size = file_info_get_size(info), *name = file_info_get_filename(info);
        printf("%s %s\n", size ? size : "?", name ? name : "?");
    }
    file_info_delete(&info);
    if (status != QM_NO_RESPONSE && status != QM_UNUSABLE_RESPONSE) {
        api_free(message); /* the hook was given it */
        return 1;
    }
    complain("reading a file's record", status, message);
    return 0;
}

int main(int argc, char **argv)
{
    const char *ca_file = getenv("QUILLMERE_CA_FILE");
    FILE *log = fopen("/dev/null", "w");
    urls[1] = getenv("QUILLMERE_SERVICE");
    if (argc < 2 || !log || !ca_file || !urls[1]) {
        fputs("usage: error_hook QUICK-KEY...; its source tells of the environment\n", stderr);
        return 2;
    }
    set_output_file(log); /* it shows session tokens, so keep it from the terminal */
    api_global_init(ca_file);
    check_api_error = note_refusal; /* before any other thread asks the service */
    char *token = log_in();
    int done = token != NULL;
    for (int index = 1; done && index < argc; ++index)
        done = show(token, argv[index]);
    printf("%d refused\n", refusals);

    api_free(token);
    api_global_cleanup();
    fclose(log);
    return done ? EXIT_SUCCESS : EXIT_FAILURE;
}
