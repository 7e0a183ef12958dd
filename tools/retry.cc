#include "retry.h"

#include <algorithm>
#include <random>
#include <thread>

namespace quillmere::tools {

namespace {

constexpr pause_length first_pause{500};
constexpr pause_length longest_pause{30000};

} // namespace

pause_length pause_before(int repetition, double chance)
{
    pause_length whole = first_pause;
    for (int i = 0; i < repetition && whole < longest_pause; ++i)
        whole *= 2;
    whole = std::min(whole, longest_pause);
    const double half = static_cast<double>(whole.count()) / 2;
    return pause_length(static_cast<pause_length::rep>(half + half * chance));
}

retry_world real_world()
{
    retry_world world;
    world.chance = [generator = std::minstd_rand(std::random_device()())]() mutable {
        return std::generate_canonical<double, 32>(generator);
    };
    world.sleep = [](pause_length pause) { std::this_thread::sleep_for(pause); };
    world.announce = [](const exchange &, pause_length) {};
    return world;
}

exchange with_repetitions(const std::function<exchange()> &attempt, int repetitions,
                          const retry_world &world)
{
    exchange ended = attempt();
    for (int i = 0; i < repetitions && worth_repeating(ended); ++i) {
        const pause_length pause = pause_before(i, world.chance());
        world.announce(ended, pause);
        world.sleep(pause);
        ended = attempt();
    }
    return ended;
}

} // namespace quillmere::tools
