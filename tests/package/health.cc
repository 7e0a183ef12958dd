// Prints the version of the library and the state of a service's database: health CA-FILE SERVICE
#include <quillmere.h>

#include <cstdio>
#include <memory>

namespace {

struct status_deleter {
    void operator()(system_status *status) const { system_status_delete(&status); }
};

std::unique_ptr<system_status, status_deleter> read_status()
{
    system_status *status = nullptr;
    char *message = nullptr;
    get_system_status(&status, &message);
    api_free(message);
    return std::unique_ptr<system_status, status_deleter>(status);
}

} // namespace

int main(int count, char **arguments)
{
    if (count != 3)
        return 2;
    urls[1] = arguments[2];
    set_output_file(stderr);
    api_global_init(arguments[1]);
    auto status = read_status();
    if (status)
        std::printf("%s %s\n", quillmere_version(), system_status_get_database(status.get()));
    api_global_cleanup();
    return status ? 0 : 1;
}
