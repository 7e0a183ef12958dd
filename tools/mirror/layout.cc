#include "layout.h"

#include <algorithm>
#include <tuple>

#include "local_names.h"

namespace quillmere::tools {

namespace {

class builder {
public:
    explicit builder(const known_account &account) : account_(account)
    {
        for (const auto &[key, entry] : account.entries)
            if (key != account.root)
                inside_[entry.parent].push_back(key);
    }

    layout build()
    {
        made_.root = account_.root;
        std::vector<std::string> waiting = {account_.root};
        while (!waiting.empty()) {
            const std::string folder = std::move(waiting.back());
            waiting.pop_back();
            for (const std::string &key : ordered(inside_[folder]))
                if (place(key, folder) && account_.entries.at(key).is_folder())
                    waiting.push_back(key);
        }
        return std::move(made_);
    }

private:
    std::vector<std::string> ordered(std::vector<std::string> keys) const
    {
        const auto rank = [this](const std::string &key) {
            return std::make_tuple(account_.entries.at(key).is_folder() ? 0 : 1, std::cref(key));
        };
        std::sort(keys.begin(), keys.end(), [&](const std::string &left, const std::string &right) {
            return rank(left) < rank(right);
        });
        return keys;
    }

    bool place(const std::string &key, const std::string &folder)
    {
        const known_entry &entry = account_.entries.at(key);
        if (entry.name.empty() && !entry.described)
            return false;
        const auto where = folder == account_.root ? name_place::at_top : name_place::below;
        if (const auto complaint = complaint_about_local_name(entry.name, where))
            return leave_out(key, folder, entry.name, *complaint);
        const auto [taken, free] = made_.keys.emplace(std::pair(folder, entry.name), key);
        if (!free)
            return leave_out(key, folder, entry.name,
                             "its name is also that of key:" + taken->second);
        made_.order.push_back(key);
        made_.entries[key] = {entry.kind, folder, entry.name, entry.content};
        return true;
    }

    bool leave_out(const std::string &key, const std::string &folder, const std::string &name,
                   const std::string &why)
    {
        const std::string above = made_.path_of(folder);
        made_.left_out.push_back({key, above.empty() ? name : above + "/" + name, why});
        return false;
    }

    const known_account &account_;
    std::map<std::string, std::vector<std::string>> inside_;
    layout made_;
};

} // namespace

const wanted_entry *layout::find(const std::string &key) const
{
    const auto found = entries.find(key);
    return found == entries.end() ? nullptr : &found->second;
}

const std::string *layout::key_at(const std::string &parent, const std::string &name) const
{
    const auto found = keys.find(std::pair(parent, name));
    return found == keys.end() ? nullptr : &found->second;
}

std::string layout::path_of(const std::string &key) const
{
    const wanted_entry *const entry = find(key);
    if (entry == nullptr)
        return {};
    const std::string above = path_of(entry->parent);
    return above.empty() ? entry->name : above + "/" + entry->name;
}

layout lay_out(const known_account &account) { return builder(account).build(); }

} // namespace quillmere::tools
