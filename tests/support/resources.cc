#include "support/resources.h"

#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <sstream>
#include <stdexcept>
#include <string>

namespace quillmere_test {
namespace {

std::string folder_of(pid_t process)
{
    return "/proc/" + (process == this_process ? "self" : std::to_string(process));
}

size_t entries(const std::string &folder)
{
    std::filesystem::directory_iterator first(folder);
    return static_cast<size_t>(std::distance(begin(first), end(first)));
}

// A thread that was joined may stay listed for a moment, on its way out of the kernel.
bool is_leaving(const std::filesystem::path &task)
{
    constexpr unsigned long exiting = 0x4; // PF_EXITING of the kernel
    std::ifstream file(task / "stat");
    std::string stat;
    if (!std::getline(file, stat))
        return true;
    // The name, which may contain anything, ends at the last parenthesis; six fields on are flags.
    std::istringstream fields(stat.substr(stat.rfind(')') + 1));
    std::string skipped;
    for (int i = 0; i < 6; ++i)
        fields >> skipped;
    unsigned long flags = 0;
    fields >> flags;
    return (flags & exiting) != 0;
}

// A line such as "VmRSS:     5120 kB".
size_t status_bytes(pid_t process, const std::string &field)
{
    std::ifstream status(folder_of(process) + "/status");
    for (std::string line; std::getline(status, line);)
        if (line.compare(0, field.size(), field) == 0)
            return std::stoul(line.substr(field.size())) * 1024;
    throw std::runtime_error("the system does not tell " + field);
}

} // namespace

size_t open_descriptors(pid_t process)
{
    size_t count = entries(folder_of(process) + "/fd");
    // Listing our own takes one more, which is among those listed.
    return process == this_process || process == ::getpid() ? count - 1 : count;
}

size_t threads(pid_t process)
{
    size_t count = 0;
    for (const auto &task : std::filesystem::directory_iterator(folder_of(process) + "/task"))
        if (!is_leaving(task.path()))
            ++count;
    return count;
}

size_t resident_bytes(pid_t process) { return status_bytes(process, "VmRSS:"); }

size_t peak_resident_bytes(pid_t process) { return status_bytes(process, "VmHWM:"); }

} // namespace quillmere_test
