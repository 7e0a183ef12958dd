/*
 * How do I list a folder, however much it holds?
 *
 *     list_folder [FOLDER-KEY]
 *
 * Prints key, size and name of each entry of the folder, or of the account's root.
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

typedef struct entry {
    const char *key, *size, *name; /* borrowed; NULL for what the reply lacked */
} entry;

static const char *shown(const char *text) { return text ? text : "?"; }

/* Prints a chunk in the service's order. Either list may be NULL. */
static void print_chunk(const folder_list *folders, const file_list *files, size_t count)
{
    entry *entries = calloc(count + 1, sizeof *entries);
    if (!entries)
        abort();
    /* A list begins with a node that holds no record, and goes on with what stood last in the
     * reply: so the entries are filled in from the end. */
    entry *next = entries + count;
    for (const folder_list *node = folders ? folders->next : NULL; node; node = node->next)
        *--next = (entry){folder_info_get_folderkey(node->record), "-",
                          folder_info_get_foldername(node->record)};
    for (const file_list *node = files ? files->next : NULL; node; node = node->next)
        *--next = (entry){file_info_get_quickkey(node->record), file_info_get_size(node->record),
                          file_info_get_filename(node->record)};
    for (; next < entries + count; ++next)
        printf("%s %s %s\n", shown(next->key), shown(next->size), shown(next->name));
    free(entries);
}

/* Returns whether the chunk was had; is_full tells whether there may be another. */
static int list_chunk(const char *token, const char *folder_key, const char *content_type,
                      int chunk, int *is_full)
{
    folder_list *folders = NULL;
    file_list *files = NULL;
    int32_t folder_count = 0, file_count = 0, chunk_size = 0;
    char *message = NULL, number[16];
    snprintf(number, sizeof number, "%d", chunk);
    int32_t status = get_folder_content(token, folder_key, NULL, number, content_type, &message,
                                        &folders, &folder_count, &files, &file_count, &chunk_size);
    int32_t count = folder_count + file_count;
    *is_full = count > 0 && count >= chunk_size;
    if (status == QM_OK)
        print_chunk(folders, files, (size_t)count);
    else
        complain("listing", status, message);
    delete_all_folder_list(&folders);
    delete_all_file_list(&files);
    return status == QM_OK;
}

static int list_all(const char *token, const char *folder_key, const char *content_type)
{
    int is_full = 1; /* the last full chunk may be followed by an empty one */
    for (int chunk = 1; is_full; ++chunk)
        if (!list_chunk(token, folder_key, content_type, chunk, &is_full))
            return 0;
    return 1;
}

int main(int argc, char **argv)
{
    const char *ca_file = getenv("QUILLMERE_CA_FILE");
    FILE *log = fopen("/dev/null", "w");
    urls[1] = getenv("QUILLMERE_SERVICE");
    if (argc > 2 || !log || !ca_file || !urls[1]) {
        fputs("usage: list_folder [FOLDER-KEY]; its source tells of the environment\n", stderr);
        return 2;
    }
    set_output_file(log); /* it shows session tokens, so keep it from the terminal */
    api_global_init(ca_file);

    const char *folder_key = argc == 2 ? argv[1] : NULL; /* none: the root */
    char *token = log_in();
    /* Each kind of entry has chunks of its own. */
    int done =
        token && list_all(token, folder_key, "folders") && list_all(token, folder_key, "files");

    api_free(token);
    api_global_cleanup();
    fclose(log);
    return done ? EXIT_SUCCESS : EXIT_FAILURE;
}
