/*
 * How do I learn what changed since I last looked?
 *
 *     follow_changes [REVISION]
 *
 * Prints what changed in the account after that revision (after the beginning, without one), and
 * the revision to ask with the next time.
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

static const char *shown(const char *text) { return text ? text : ""; }

static void apply(const change_info *change)
{
    /* The feed names files alone: what else is to be known of an updated entry has to be asked for,
     * with get_folder_info() or get_file_info(). */
    printf("%s %s %s %s\n", change_info_get_changetype(change) ? "updated" : "deleted",
           change_info_get_is_folder(change) ? "folder" : "file",
           shown(change_info_get_key(change)), shown(change_info_get_filename(change)));
}

/* Applies a block in the service's order, in which a folder comes ahead of what it holds. */
static void apply_all(const change_list *changes, uint32_t count)
{
    const change_info **in_order = calloc((size_t)count + 1, sizeof *in_order);
    if (!in_order)
        abort();
    /* A list begins with a node that holds no record, and goes on with what stood last in
     * the reply. */
    uint32_t index = count;
    for (const change_list *node = changes->next; node; node = node->next)
        in_order[--index] = node->record;
    for (index = 0; index < count; ++index)
        apply(in_order[index]);
    free(in_order);
}

/* Applies what the service hands out at once and moves *revision on. */
static int follow_block(const char *token, uint64_t *revision)
{
    change_list *changes = NULL;
    uint64_t reached = 0;
    uint32_t count = 0;
    int32_t block_size = 0;
    char *message = NULL;
    int32_t status =
        get_device_changes(token, *revision, 0, &reached, &changes, &count, &block_size, &message);
    if (status != QM_OK) {
        /* No list is there now: after a malformed reply the pointer even leads to a deleted one. */
        complain("reading the changes", status, message);
        return 0;
    }
    apply_all(changes, count);
    delete_all_change_list(&changes);
    *revision = reached;
    return 1;
}

static int follow(const char *token, uint64_t revision)
{
    /* One reply holds the oldest changes alone when there are many. The feed has told everything
     * when the revision that it reached no longer grows. */
    uint64_t asked;
    do {
        asked = revision;
        if (!follow_block(token, &revision))
            return 0;
    } while (revision > asked);
    printf("revision %" PRIu64 "\n", revision);
    return 1;
}

int main(int argc, char **argv)
{
    const char *ca_file = getenv("QUILLMERE_CA_FILE");
    FILE *log = fopen("/dev/null", "w");
    urls[1] = getenv("QUILLMERE_SERVICE");
    if (argc > 2 || !log || !ca_file || !urls[1]) {
        fputs("usage: follow_changes [REVISION]; its source tells of the environment\n", stderr);
        return 2;
    }
    set_output_file(log); /* it shows session tokens, so keep it from the terminal */
    api_global_init(ca_file);

    /* Should the service refuse the revision, the account was reset since: forget everything and
     * begin with 0. */
    uint64_t revision = argc == 2 ? strtoull(argv[1], NULL, 10) : 0;
    char *token = log_in();
    int done = token && follow(token, revision);

    api_free(token);
    api_global_cleanup();
    fclose(log);
    return done ? EXIT_SUCCESS : EXIT_FAILURE;
}
