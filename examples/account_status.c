#include <quillmere.h>

int main(int argc,
         char **argv) /* the CA file, the service, e-mail, password, application id and key */
{
    if (argc != 7)
        return 2;
    urls[1] = argv[2];
    api_global_init(argv[1]);
    set_output_file(stderr); /* the library's log */
    char *token = NULL, *error = NULL;
    uint64_t revision = 0;
    int32_t busy = 0;
    int32_t status = get_session_token(argv[3], argv[4], NULL, argv[5], argv[6], &token);
    if (status == QM_OK && get_device_status(token, 0, &revision, &busy, &error) == QM_OK)
        printf("revision %lu, %s\n", (unsigned long)revision, busy ? "busy" : "idle");
    api_free(token);
    api_free(error);
    api_global_cleanup();
    return status != QM_OK;
}
