#include "canaries.h"

#include <cctype>
#include <filesystem>
#include <fstream>
#include <sstream>

#include <quillmere.h>

namespace quillmere_test {

namespace fs = std::filesystem;

namespace {

std::string percent_encoded(const std::string &text, const char *digits)
{
    std::string encoded;
    for (const char each : text) {
        const auto byte = static_cast<unsigned char>(each);
        if (std::isalnum(byte) != 0)
            encoded += each;
        else
            encoded.append({'%', digits[byte >> 4], digits[byte & 0xf]});
    }
    return encoded;
}

/** What a file holds; nothing when it cannot be read, as one of a process that has just ended. */
std::string bytes_of(const fs::path &path)
{
    const std::ifstream file(path, std::ios::binary);
    std::ostringstream bytes;
    bytes << file.rdbuf(); // which takes a failure for the end
    return bytes.str();
}

std::vector<pid_t> all_processes()
{
    std::vector<pid_t> processes;
    for (const auto &each : fs::directory_iterator("/proc")) {
        const std::string name = each.path().filename();
        if (std::isdigit(static_cast<unsigned char>(name[0])) != 0)
            processes.push_back(std::stoi(name));
    }
    return processes;
}

fs::path file_of(pid_t process, const char *name)
{
    return fs::path("/proc") / std::to_string(process) / name;
}

pid_t parent_of(pid_t process)
{
    const std::string facts = bytes_of(file_of(process, "stat"));
    // The program's name, in parentheses, may hold anything.
    std::istringstream behind_name(facts.substr(facts.rfind(')') + 1));
    char state = 0;
    pid_t parent = 0;
    behind_name >> state >> parent;
    return parent;
}

} // namespace

void canaries::add(const std::string &name, const std::string &text)
{
    for (const std::string &bytes : {text, percent_encoded(text, "0123456789abcdef"),
                                     percent_encoded(text, "0123456789ABCDEF")})
        forms_.push_back({name, bytes});
}

canaries::names canaries::in(std::string_view bytes) const
{
    names found;
    for (const form &each : forms_)
        if (bytes.find(each.bytes) != std::string_view::npos)
            found.insert(each.name);
    return found;
}

std::map<std::string, canaries::names> canaries::in_files_of(const std::string &folder) const
{
    std::map<std::string, names> files;
    for (const auto &each : fs::recursive_directory_iterator(folder)) {
        if (!each.is_regular_file())
            continue;
        const names found = in(bytes_of(each.path()));
        if (!found.empty())
            files[each.path().lexically_relative(folder)] = found;
    }
    return files;
}

canaries::names canaries::in_arguments() const
{
    names found;
    for (const pid_t each : all_processes())
        found.merge(in(bytes_of(file_of(each, "cmdline"))));
    return found;
}

canaries::names canaries::in_environment_of(pid_t process) const
{
    return in(bytes_of(file_of(process, "environ")));
}

std::vector<pid_t> children_of(pid_t process)
{
    std::vector<pid_t> children;
    for (const pid_t each : all_processes())
        if (parent_of(each) == process)
            children.push_back(each);
    return children;
}

std::string login_signature(const std::string &credentials, const std::string &application_id,
                            const std::string &application_key)
{
    const std::string signed_text = credentials + application_id + application_key;
    char digest[41] = {};
    simple_sha1(signed_text.data(), signed_text.size(), digest, sizeof digest);
    return digest;
}

} // namespace quillmere_test
