// Takes the steps of a plan. After each of them the copy is whole, and what was placed is known.
#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "../transfers/linked_content.h"
#include "local_copy.h"
#include "plan.h"
#include "report.h"
#include "state.h"

namespace quillmere::tools {

class applier {
public:
    /** @param keep called when what was placed should be kept; all others outlive the object */
    applier(const local_copy &copy, mirror_state &state, linked_content &contents,
            mirror_report &report, std::function<void()> keep)
        : copy_(copy), here_(state.here), folders_(copy, state.account.root, state.here),
          contents_(contents), report_(report), keep_(std::move(keep))
    {
    }

    void apply(const plan &steps, const layout &wanted);

private:
    using step = void (applier::*)(const std::string &key);

    void each_of(const std::vector<std::string> &keys, step taken);

    void rescue(const std::string &key);
    void let_go(const std::string &key);
    void set_aside(const std::string &key);
    void leave(const std::string &key);
    void place_folder(const std::string &key);
    void place_file(const std::string &key);
    void discard(const std::string &key);

    void bring_all(const std::vector<std::string> &keys);
    void find_reusable();
    bool is_at_hand(const std::string &key);
    void fetch_all(const std::vector<std::string> &keys);
    void fetch(const std::string &key);
    void put_into_place(const std::string &key, const local_folder &from, const std::string &name);
    void record_file(const std::string &key, const local_folder &folder);

    bool has_place_for(const std::string &key) const;
    bool is_set_aside(const std::string &key) const;
    void make_way(const local_folder &folder, const std::string &parent, const std::string &name);
    void keep_beside(const local_folder &from, const std::string &name, const std::string &former,
                     const local_folder &to, const std::string &parent,
                     const std::string &wanted_name);
    std::string local_path(const std::string &parent, const std::string &name) const;

    const local_copy &copy_;
    placements &here_;
    copy_folders folders_;
    linked_content &contents_;
    mirror_report &report_;
    std::function<void()> keep_;
    const layout *wanted_ = nullptr;
    std::map<std::string, std::string> former_paths_; // of what is set aside, by key
    std::map<std::string, std::string> reusable_;     // what is to be removed: keys by SHA-256
};

} // namespace quillmere::tools
