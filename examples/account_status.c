#include <quillmere.h>

/* account_status CA-FILE SERVICE E-MAIL PASSWORD APPLICATION-ID APPLICATION-KEY */
int main(int argc, char **argv)
{
    if (argc != 7)
        return 2;
    char *token = NULL, *error = NULL;
    uint64_t revision = 0;
    int32_t busy = 0;
    urls[1] = argv[2];
    set_output_file(stderr); /* the library's log */
    api_global_init(argv[1]);
    int32_t status = get_session_token(argv[3], argv[4], NULL, argv[5], argv[6], &token);
    if (status == QM_OK)
        status = get_device_status(token, 0, &revision, &busy, &error);
    if (status == QM_OK)
        printf("revision %lu, %s\n", (unsigned long)revision, busy ? "busy" : "idle");
    api_free(token); /* or, had the login failed, the message */
    api_free(error);
    api_global_cleanup();
    return status != QM_OK;
}
