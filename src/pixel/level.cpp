#include "pixel/level.h"

#include <atomic>

namespace Qor::Luxar::ZELT {
namespace {

level best_level() noexcept
{
    if (machine_has(level::v4)) return level::v4;
    return machine_has(level::v3) ? level::v3 : level::v1;
}

std::atomic<level>& chosen() noexcept
{
    static std::atomic<level> l{best_level()};
    return l;
}

} // namespace

bool machine_has(level l) noexcept
{
#ifdef ZELT_LEVELS_X86
    __builtin_cpu_init();
    switch (l) {
    case level::v4: return __builtin_cpu_supports("x86-64-v4") != 0;
    case level::v3: return __builtin_cpu_supports("x86-64-v3") != 0;
    default: return true;
    }
#else
    return l == level::v1;
#endif
}

level current_level() noexcept
{
    return chosen().load(std::memory_order_relaxed);
}

void force_level(level l) noexcept
{
    chosen().store(l, std::memory_order_relaxed);
}

void use_best_level() noexcept
{
    force_level(best_level());
}

} // namespace Qor::Luxar::ZELT
