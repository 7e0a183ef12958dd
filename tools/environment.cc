#include "environment.h"

#include <cstdlib>

#include "failure.h"

namespace quillmere::tools {

std::optional<std::string> environment::value(const char *name) const
{
    const char *const found = find_(name);
    if (found == nullptr || *found == '\0')
        return std::nullopt;
    return found;
}

std::string environment::directory(const char *variable, const std::string &below_home) const
{
    const auto named = value(variable);
    if (named && named->front() == '/')
        return *named;
    const auto home = value("HOME");
    if (!home)
        throw failure(exit_code::local_file,
                      std::string("cannot tell where files belong: neither ") + variable +
                          " nor HOME is set",
                      "set HOME to your folder");
    return *home + "/" + below_home;
}

environment process_environment()
{
    return environment([](const char *name) { return std::getenv(name); });
}

} // namespace quillmere::tools
