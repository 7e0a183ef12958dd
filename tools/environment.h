// The environment variables, handed in, so that a test can give others.
#pragma once

#include <functional>
#include <optional>
#include <string>

namespace quillmere::tools {

class environment {
public:
    using lookup = std::function<const char *(const char *name)>;

    explicit environment(lookup find) : find_(std::move(find)) {}

    /** A variable's value; an empty one counts as not set. */
    std::optional<std::string> value(const char *name) const;

    /** The directory that a variable names, or one below the home directory. A relative one does
     * not count, as the convention for these variables demands. */
    std::string directory(const char *variable, const std::string &below_home) const;

private:
    lookup find_;
};

/** The environment of this process. */
environment process_environment();

} // namespace quillmere::tools
