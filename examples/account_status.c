#include <quillmere.h>
#include <stdlib.h>

/* account_status CA-FILE SERVICE E-MAIL APPLICATION-ID APPLICATION-KEY,
 * and the password in QUILLMERE_PASSWORD, since everybody may see a program's arguments */
int main(int argc, char **argv)
{
    const char *password = getenv("QUILLMERE_PASSWORD");
    if (argc != 6 || !password)
        return 2;
    char *token = NULL, *error = NULL;
    uint64_t revision = 0;
    int32_t busy = 0;
    urls[1] = argv[2];
    set_output_file(stderr); /* the library's log */
    api_global_init(argv[1]);
    int32_t status = get_session_token(argv[3], password, NULL, argv[4], argv[5], &token);
    if (status == QM_OK)
        status = get_device_status(token, 0, &revision, &busy, &error);
    if (status == QM_OK)
        printf("revision %lu, %s\n", (unsigned long)revision, busy ? "busy" : "idle");
    api_free(token); /* or, had the login failed, the message */
    api_free(error);
    api_global_cleanup();
    return status != QM_OK;
}
