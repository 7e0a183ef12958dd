#include "support/temporary_folder.h"

#include <fcntl.h>
#include <stdlib.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <system_error>

#include "support/descriptor.h"
#include "support/failure.h"

namespace quillmere_test {

temporary_folder::temporary_folder()
    : path_((std::filesystem::temp_directory_path() / "quillmere-test-XXXXXX").string()),
      owner_(::getpid())
{
    require(::mkdtemp(path_.data()) != nullptr, "mkdtemp " + path_);
}

temporary_folder::~temporary_folder()
{
    // A forked child, such as that of a death test, must not take its parent's files away.
    if (::getpid() != owner_)
        return;
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
}

std::string temporary_folder::write(const std::string &name, std::string_view content) const
{
    std::string path = path_of(name);
    descriptor file(::open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600));
    require(bool(file), "open " + path);
    while (!content.empty()) {
        ssize_t count = ::write(file.number(), content.data(), content.size());
        require(count > 0, "write " + path);
        content.remove_prefix(static_cast<size_t>(count));
    }
    return path;
}

std::string content_of(const std::string &path)
{
    std::ifstream file(path, std::ios::binary);
    require(file.is_open(), "open " + path);
    std::ostringstream content;
    content << file.rdbuf();
    return content.str();
}

} // namespace quillmere_test
