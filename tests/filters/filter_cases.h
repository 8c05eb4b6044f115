// What the tests of filters share.
#pragma once

#include "support/cases.h"
#include "threads/multi_threaded_pool.h"

namespace Qor::Luxar::ZELT::Test {

/// A computed value as a pixel: limited and cut for integers, NaN is the lowest value; floats take the value itself.
template <class T>
T saturated(double v)
{
    if constexpr (std::is_integral_v<T>) {
        using limits = std::numeric_limits<T>;
        if (!(v >= limits::min())) return limits::min();
        if (v >= limits::max()) return limits::max();
    }
    return static_cast<T>(v);
}

/// f(channel) for each number of a pixel, where channel(pixel) picks it.
template <class T, class F>
T each_channel(F&& f)
{
    if constexpr (std::is_same_v<T, colour_24>) {
        T t;
        for (size_t c = 0; c < 3; ++c) t.channel[c] = f([c](const T& pixel) { return pixel.channel[c]; });
        return t;
    } else {
        return f([](T pixel) { return pixel; });
    }
}

/// Pools of none, one, two and three workers, by number.
inline Thread::ThreadPool* pool_of(int workers)
{
    static Thread::MultiThreadedPool one(1), two(2), three(3);
    Thread::ThreadPool* const pools[] = {nullptr, &one, &two, &three};
    return pools[workers % 4];
}

} // namespace Qor::Luxar::ZELT::Test
