#include "faults.h"

#include <algorithm>

namespace emulator {
namespace {

bool is_for_connections(const fault &rule) { return rule.kind == fault_kind::certificate; }

bool is_for(const fault &rule, std::string_view path)
{
    return !is_for_connections(rule) && path.substr(0, rule.path.size()) == rule.path;
}

// The same on every machine, other than what the standard library's distributions draw.
double draw(std::mt19937_64 &chance)
{
    constexpr int unused_bits = 11; // a double holds 53 of 64
    constexpr double scale = 1.0 / (std::uint64_t{1} << 53);
    return static_cast<double>(chance() >> unused_bits) * scale;
}

bool fires(placed_fault &placed)
{
    const fault &rule = placed.rule;
    ++placed.seen;
    if (placed.seen <= rule.after || (rule.count && placed.fired >= *rule.count))
        return false;
    if (draw(placed.chance) >= rule.probability)
        return false;
    ++placed.fired;
    return true;
}

} // namespace

std::optional<std::uint64_t> fault_list::place(fault rule)
{
    if (placed_.size() >= most)
        return std::nullopt;
    const std::uint64_t seed = rule.seed;
    placed_.push_back({++last_id_, std::move(rule), std::mt19937_64(seed)});
    return last_id_;
}

bool fault_list::remove(std::uint64_t id)
{
    const auto found = std::find_if(placed_.begin(), placed_.end(),
                                    [id](const placed_fault &each) { return each.id == id; });
    if (found == placed_.end())
        return false;
    placed_.erase(found);
    return true;
}

const placed_fault *fault_list::find(std::uint64_t id) const
{
    for (const placed_fault &each : placed_)
        if (each.id == id)
            return &each;
    return nullptr;
}

const fault *fault_list::strike_request(std::string_view path)
{
    for (placed_fault &each : placed_)
        if (is_for(each.rule, path) && fires(each))
            return &each.rule;
    return nullptr;
}

const fault *fault_list::strike_connection()
{
    for (placed_fault &each : placed_)
        if (is_for_connections(each.rule) && fires(each))
            return &each.rule;
    return nullptr;
}

} // namespace emulator
