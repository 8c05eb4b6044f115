#include "pixel/level.h"

#include <atomic>
#ifdef ZELT_LEVELS_X86
#include <cpuid.h>
#endif

namespace Qor::Luxar::ZELT {
namespace {

#ifdef ZELT_LEVELS_X86
// Feature by feature, because not every supported compiler can ask for a level as a whole. The builtin also
// looks at what the operating system saves; it lacks the names of three features that need no saved state.
bool has_v3() noexcept
{
    unsigned a = 0, b = 0, c = 0, d = 0, extended_c = 0;
    if (!__get_cpuid(1, &a, &b, &c, &d) || !__get_cpuid(0x80000001, &a, &b, &extended_c, &d)) return false;
    return (c & bit_MOVBE) != 0 && (c & bit_F16C) != 0 && (extended_c & bit_LZCNT) != 0 &&
           __builtin_cpu_supports("avx2") && __builtin_cpu_supports("fma") && __builtin_cpu_supports("bmi") &&
           __builtin_cpu_supports("bmi2") && __builtin_cpu_supports("popcnt");
}

bool has_v4() noexcept
{
    return has_v3() && __builtin_cpu_supports("avx512f") && __builtin_cpu_supports("avx512bw") &&
           __builtin_cpu_supports("avx512cd") && __builtin_cpu_supports("avx512dq") &&
           __builtin_cpu_supports("avx512vl");
}
#endif

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
    case level::v4: return has_v4();
    case level::v3: return has_v3();
    default: return true;
    }
#else
    return l == level::v1;
#endif
}

level current_level() noexcept { return chosen().load(std::memory_order_relaxed); }

void force_level(level l) noexcept { chosen().store(l, std::memory_order_relaxed); }

void use_best_level() noexcept { force_level(best_level()); }

} // namespace Qor::Luxar::ZELT
