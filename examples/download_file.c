/*
 * How do I download a file?
 *
 *     download_file QUICK-KEY TARGET
 *
 * Fetches the file's bytes under its direct link, which libcurl does: the library hands out the
 * link. The target appears whole or not at all.
 *
 * Environment: QUILLMERE_SERVICE   the service, such as https://localhost:8443
 *              QUILLMERE_CA_FILE   the root certificate that vouches for it (PEM)
 *              QUILLMERE_EMAIL, QUILLMERE_PASSWORD
 */
#include <inttypes.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <curl/curl.h>
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

/* Returns the link, or NULL. */
static char *link_of(const char *token, const char *quick_key)
{
    char *link = NULL, *message = NULL, *refusal = NULL;
    int32_t bandwidth = 0, refused = 0;
    int32_t status =
        get_download_link(token, quick_key, &link, &bandwidth, &message, &refused, &refusal);
    if (status != QM_OK)
        complain("asking for the link", status, message);
    else if (!link) /* a question well answered, and yet no link: the bandwidth may be spent */
        complain("linking", refused, refusal);
    return link;
}

static int fetch(const char *link, const char *ca_file, FILE *into)
{
    CURL *handle = curl_easy_init(); /* api_global_init() has started libcurl */
    if (!handle)
        return 0;
    char reason[CURL_ERROR_SIZE] = "";
    curl_easy_setopt(handle, CURLOPT_URL, link);
    curl_easy_setopt(handle, CURLOPT_PROTOCOLS_STR, "http,https"); /* the link is another's text */
    curl_easy_setopt(handle, CURLOPT_CAINFO, ca_file);
    curl_easy_setopt(handle, CURLOPT_NOSIGNAL, 1L);
    curl_easy_setopt(handle, CURLOPT_FOLLOWLOCATION, 1L);
    curl_easy_setopt(handle, CURLOPT_FAILONERROR, 1L); /* or a page of regret would be the file */
    curl_easy_setopt(handle, CURLOPT_ERRORBUFFER, reason);
    curl_easy_setopt(handle, CURLOPT_WRITEDATA, into);
    CURLcode code = curl_easy_perform(handle);
    if (code != CURLE_OK)
        fprintf(stderr, "fetching failed: %s\n", *reason ? reason : curl_easy_strerror(code));
    curl_easy_cleanup(handle);
    return code == CURLE_OK;
}

/* Under another name first, so that nobody takes a part for the whole. */
static int download(const char *link, const char *ca_file, const char *target)
{
    string_buffer *part = string_new(0);
    string_append(part, target);
    string_append(part, ".part");
    FILE *file = fopen(string_get(part), "wb");
    int done = file && fetch(link, ca_file, file);
    if (file && fclose(file) != 0) /* the last bytes may be those that found the disk full */
        done = 0;
    if (done && rename(string_get(part), target) != 0)
        done = 0;
    if (!done) {
        fprintf(stderr, "%s was not downloaded\n", target);
        remove(string_get(part));
    }
    string_delete(part, 1);
    return done;
}

int main(int argc, char **argv)
{
    const char *ca_file = getenv("QUILLMERE_CA_FILE");
    FILE *log = fopen("/dev/null", "w");
    urls[1] = getenv("QUILLMERE_SERVICE");
    if (argc != 3 || !log || !ca_file || !urls[1]) {
        fputs("usage: download_file QUICK-KEY TARGET; its source tells of the environment\n",
              stderr);
        return 2;
    }
    set_output_file(log); /* it shows session tokens, so keep it from the terminal */
    api_global_init(ca_file);

    char *token = log_in();
    char *link = token ? link_of(token, argv[1]) : NULL;
    int done = link && download(link, ca_file, argv[2]);

    api_free(link);
    api_free(token);
    api_global_cleanup();
    fclose(log);
    return done ? EXIT_SUCCESS : EXIT_FAILURE;
}
