/* Does what health.cc does, with a library that is loaded while the program runs. */
#include <quillmere.h>

#include <dlfcn.h>
#include <stdlib.h>

static void *library;

static void *symbol(const char *name)
{
    void *found = library ? dlsym(library, name) : NULL;
    if (!found) {
        fprintf(stderr, "%s\n", dlerror());
        exit(1);
    }
    return found;
}

/* C knows no conversion from a pointer to data to one to a function, but POSIX has both alike. */
#define FUNCTION(pointer, name) (*(void **)&(pointer) = symbol(name))

int main(int count, char **arguments)
{
    void (*start)(const char *ca_path);
    void (*stop)(void);
    void (*direct_log)(FILE * stream);
    const char *(*version)(void);
    int32_t (*read_status)(system_status * *status, char **message);
    const char *(*database_of)(const system_status *status);
    void (*delete_status)(system_status * *status);
    system_status *status = NULL;
    char *message = NULL;
    int32_t result;

    if (count != 3)
        return 2;
    library = dlopen("libquillmere.so.0", RTLD_NOW | RTLD_LOCAL);
    FUNCTION(start, "api_global_init");
    FUNCTION(stop, "api_global_cleanup");
    FUNCTION(direct_log, "set_output_file");
    FUNCTION(version, "quillmere_version");
    FUNCTION(read_status, "get_system_status");
    FUNCTION(database_of, "system_status_get_database");
    FUNCTION(delete_status, "system_status_delete");

    ((const char **)symbol("urls"))[1] = arguments[2];
    direct_log(stderr);
    start(arguments[1]);
    result = read_status(&status, &message);
    if (result == QM_OK)
        printf("%s %s\n", version(), database_of(status));
    delete_status(&status);
    free(message);
    stop();
    return result == QM_OK ? 0 : 1;
}
