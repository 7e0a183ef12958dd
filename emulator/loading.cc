#include "loading.h"

#include <algorithm>
#include <stdexcept>
#include <string_view>
#include <system_error>
#include <vector>

#include <fcntl.h>
#include <sys/stat.h>

#include "errors.h"
#include "store/content.h"
#include "store/database.h"
#include "store/file_entries.h"
#include "store/folders.h"
#include "store/names.h"
#include "store/usage.h"
#include "text.h"

namespace emulator {
namespace {

/** A file of the account that is to be, its bytes in the content store already. An empty folder has
 * no last name and no content. */
struct prepared {
    std::vector<std::string> folders;
    std::string name;
    content_id content;
    std::int64_t modified = 0;
};

std::vector<std::string> steps_of(std::string_view path)
{
    std::vector<std::string> steps;
    while (!path.empty()) {
        const std::size_t slash = std::min(path.find('/'), path.size());
        if (slash > 0)
            steps.emplace_back(path.substr(0, slash));
        path.remove_prefix(std::min(slash + 1, path.size()));
    }
    return steps;
}

void check_step(const std::string &step, const std::string &path)
{
    try {
        if (!is_xml_text(step))
            throw refusal(error::parameter_invalid, "not UTF-8");
        check_name(step, "name");
    } catch (const refusal &) {
        throw std::runtime_error("no name for a file or folder: " + path);
    }
}

folder make_folders(const loading &into, const std::vector<std::string> &steps)
{
    folder at = root_of(into.store, into.account);
    for (const std::string &step : steps) {
        const std::optional<folder> found = find_folder_in(into.store, at.id, step);
        at = found ? *found : create_folder(into.store, at, {step, into.now, into.now});
    }
    return at;
}

std::string put(const loading &into, const prepared &made)
{
    const folder in = make_folders(into, made.folders);
    if (made.name.empty())
        return {};
    std::optional<file> target = find_file_in(into.store, in.id, made.name);
    if (target && target->content.hash == made.content.hash)
        return target->key;
    if (!target)
        target = create_file(into.store, in, {made.name, into.now, made.modified});
    put_content(into.store, *target, made.content, made.modified);
    // A reset may have removed the bytes since they were written; under the lock it cannot.
    if (!into.content.holds(made.content))
        throw std::runtime_error("the content was removed meanwhile");
    return target->key;
}

/** Walks a folder of the machine, and keeps the bytes of what it finds. */
class tree_reader {
public:
    explicit tree_reader(const loading &into) : into_(into) {}

    void read(const std::filesystem::path &from, const std::vector<std::string> &steps)
    {
        const auto type = std::filesystem::symlink_status(from).type();
        if (type == std::filesystem::file_type::directory)
            read_folder(from, steps);
        else if (type == std::filesystem::file_type::regular)
            read_file(from, steps);
        else
            throw std::runtime_error("neither a file nor a folder: " + from.string());
    }

    const std::vector<prepared> &found() const { return found_; }

private:
    void read_folder(const std::filesystem::path &from, const std::vector<std::string> &steps)
    {
        found_.push_back({steps, {}, {}});
        std::vector<std::filesystem::path> inside;
        for (const auto &each : std::filesystem::directory_iterator(from))
            inside.push_back(each.path());
        std::sort(inside.begin(), inside.end()); // the same order on every machine
        for (const std::filesystem::path &each : inside) {
            std::vector<std::string> deeper = steps;
            deeper.push_back(each.filename());
            check_step(deeper.back(), each);
            read(each, deeper);
        }
    }

    void read_file(const std::filesystem::path &from, std::vector<std::string> steps)
    {
        if (steps.empty())
            throw std::runtime_error("a file cannot take the place of the root: " + from.string());
        const descriptor opened(::open(from.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW));
        struct stat status {};
        if (opened.number() < 0 || ::fstat(opened.number(), &status) != 0)
            throw std::system_error(errno, std::generic_category(), from.string());
        std::string name = std::move(steps.back());
        steps.pop_back();
        found_.push_back({std::move(steps), std::move(name),
                          into_.content.keep(opened.number(), upload_size_limit),
                          std::int64_t{status.st_mtime}});
    }

    const loading &into_;
    std::vector<prepared> found_;
};

std::vector<std::string> checked_steps(const std::string &path)
{
    std::vector<std::string> steps = steps_of(path);
    for (const std::string &step : steps)
        check_step(step, path);
    return steps;
}

} // namespace

std::string load_bytes(const loading &into, int from, const std::string &path)
{
    std::vector<std::string> steps = checked_steps(path);
    if (steps.empty())
        throw std::runtime_error("the path names no file: " + path);
    std::string name = std::move(steps.back());
    steps.pop_back();
    const content_id content = into.content.keep(from, upload_size_limit);
    transaction change(into.store);
    std::string key = put(into, {std::move(steps), std::move(name), content, into.now});
    change.commit();
    return key;
}

void load_tree(const loading &into, const std::filesystem::path &from, const std::string &path)
{
    tree_reader reader(into);
    reader.read(from, checked_steps(path));
    transaction change(into.store);
    for (const prepared &each : reader.found())
        put(into, each);
    change.commit();
}

} // namespace emulator
