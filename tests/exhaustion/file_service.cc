#include "exhaustion/file_service.h"

#include <unistd.h>

#include "api/account_operations.h"
#include "api/operations.h"

namespace quillmere_test {
namespace {

constexpr const char *reply_file = "reply";
constexpr const char *reply_path = "/reply";

} // namespace

file_service::file_service(const char *ca_path)
    : base_("file://" + folder_.path()), library_(ca_path)
{
    set_connection_attempts(1);
    urls[0] = urls[1] = base_.c_str();
    for (const account_operation &each : account_operations)
        *each.path_variable = reply_path;
    for (const operation &each : operations)
        *each.path = reply_path;
    update_file_uri = reply_path;
}

void file_service::answer(const std::string &reply) { folder_.write(reply_file, reply); }

void file_service::answer_nothing() { ::unlink(folder_.path_of(reply_file).c_str()); }

} // namespace quillmere_test
