#include "plan.h"

#include <algorithm>

namespace quillmere::tools {

namespace {

class planner {
public:
    planner(const layout &wanted, const placements &here, const std::set<std::string> &unknown)
        : wanted_(wanted), here_(here), unknown_(unknown)
    {
    }

    plan make()
    {
        for (const auto &[key, placed] : here_)
            consider_placed(key, placed);
        std::sort(made_.left.begin(), made_.left.end(),
                  [this](const std::string &left, const std::string &right) {
                      return depth_of(left) > depth_of(right);
                  });
        for (const std::string &key : wanted_.order)
            consider_wanted(key, wanted_.entries.at(key));
        return std::move(made_);
    }

private:
    void consider_placed(const std::string &key, const placement &placed)
    {
        if (placed.changed_here) {
            (placed.set_aside ? made_.rescued : made_.let_go).push_back(key);
            return;
        }
        const wanted_entry *const wanted = wanted_.find(key);
        if (wanted == nullptr && is_below_unknown(placed))
            return;
        if (wanted == nullptr && placed.is_folder()) {
            made_.left.push_back(key);
            return;
        }
        const bool in_place = wanted != nullptr && placed.is_at(wanted->parent, wanted->name);
        if (!in_place && !placed.set_aside)
            made_.set_aside.push_back(key);
    }

    void consider_wanted(const std::string &key, const wanted_entry &wanted)
    {
        const auto found = here_.find(key);
        const bool is_here = found != here_.end() && !found->second.changed_here;
        const bool in_place = is_here && found->second.is_at(wanted.parent, wanted.name);
        if (wanted.is_folder()) {
            if (!in_place)
                made_.folders.push_back(key);
            return;
        }
        if (is_here && !in_place)
            made_.moved.push_back(key);
        if (!is_here || found->second.content.sha256 != wanted.content.sha256)
            made_.missing.push_back(key);
    }

    std::size_t depth_of(const std::string &key) const
    {
        const auto found = here_.find(key);
        if (found == here_.end() || found->second.set_aside)
            return 0;
        return 1 + depth_of(found->second.parent);
    }

    bool is_below_unknown(const placement &placed) const
    {
        if (unknown_.count(placed.parent) != 0)
            return true;
        const auto above = here_.find(placed.parent);
        return above != here_.end() && is_below_unknown(above->second);
    }

    const layout &wanted_;
    const placements &here_;
    const std::set<std::string> &unknown_;
    plan made_;
};

} // namespace

bool plan::is_empty() const
{
    for (const auto *each : {&rescued, &let_go, &set_aside, &left, &folders, &moved, &missing})
        if (!each->empty())
            return false;
    return true;
}

plan make_plan(const layout &wanted, const placements &here, const std::set<std::string> &unknown)
{
    return planner(wanted, here, unknown).make();
}

} // namespace quillmere::tools
