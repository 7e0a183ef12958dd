// Takes the steps of a plan. After each of them the copy is whole, and what was placed is known.
#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "disk.h"
#include "plan.h"
#include "report.h"
#include "state.h"

namespace quillmere::tools {

class applier {
public:
    /** @param keep called when what was placed should be kept; all others outlive the object */
    applier(disk &where, placements &here, mirror_report &report, std::function<void()> keep)
        : disk_(where), here_(here), report_(report), keep_(std::move(keep))
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
    void put_into_place(const std::string &key, const location &from);
    void record_file(const std::string &key);

    bool has_place_for(const std::string &key) const;
    bool is_set_aside(const std::string &key) const;
    void move(const location &from, const location &to);
    void make_way(const location &at);
    void keep_beside(const location &from, const std::string &former, const location &wanted);
    std::string local_path(const std::string &parent, const std::string &name) const;

    disk &disk_;
    placements &here_;
    mirror_report &report_;
    std::function<void()> keep_;
    const layout *wanted_ = nullptr;
    std::map<std::string, std::string> former_paths_; // of what is set aside, by key
    std::map<std::string, std::string> reusable_;     // what is to be removed: keys by SHA-256
};

} // namespace quillmere::tools
