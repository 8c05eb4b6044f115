// What the tests of the flat-field kernels share: operands, pools, and the conversions of the tables.
#pragma once

#include "flatfield/kernels/encoding_key.h"
#include "support/cases.h"
#include "threads/multi_threaded_pool.h"

namespace Qor::Luxar::ZELT::Test {

template <class T>
FlatField::image image_of(const test_image<T>& i)
{
    return {i.layout(), static_cast<uint8_t*>(i.data())};
}

/// body(pixel<T>) for each of the types.
template <class... Types, class Body>
void for_types(Body&& body)
{
    (step(std::string("type ") + typeid(Types).name(), [&] { body(pixel<Types>{}); }), ...);
}

/// Another pool at each turn: none, one worker, three workers.
inline Thread::ThreadPool* pool_at(int turn)
{
    static Thread::MultiThreadedPool one(1), three(3);
    Thread::ThreadPool* const pools[] = {nullptr, &one, &three};
    return pools[turn % 3];
}

/// Another scale factor at each turn: -2 to 34, and far ones.
inline int32_t scale_at(int turn)
{
    constexpr int32_t far[] = {-1000, 1000, std::numeric_limits<int32_t>::min(),
                               std::numeric_limits<int32_t>::max()};
    const int i = turn * 7 % 41; // 7 has no divisor in common with 41
    return i < 37 ? i - 2 : far[i - 37];
}

template <class T>
inline constexpr bool is_narrow = std::is_integral_v<T> && sizeof(T) < 4;

/// Low bits of a floored or truncated number; 0 when it has no place in 64 bits.
template <class T>
T low_bits(double whole)
{
    return whole >= -9223372036854775808.0 && whole < 9223372036854775808.0
               ? static_cast<T>(static_cast<int64_t>(whole))
               : T{0};
}

/// round(x) of the tables.
inline double rounded(float x)
{
    const float sum = x + 0.5f;
    return std::floor(static_cast<double>(sum));
}

/// A logical shift of the low 32 bits.
inline uint32_t shifted(int64_t value, int32_t scale)
{
    const int64_t count = ((16 - int64_t{scale}) % 32 + 32) % 32;
    return static_cast<uint32_t>(value) >> count;
}

// The tables of Flatten, a pixel at a time. Same: all images are of type T.

template <class T, class S, class D>
T without_gain(S s, D d)
{
    if constexpr (std::is_floating_point_v<S>)
        return s - d;
    else {
        const int64_t difference = int64_t{s} - int64_t{d};
        if constexpr (std::is_same_v<T, uint32_t> && !std::is_same_v<S, uint32_t>)
            return difference < 0 ? 0 : 0xFFFFFFFF;
        else if constexpr (is_narrow<T>)
            return static_cast<T>(std::clamp<int64_t>(difference, std::numeric_limits<T>::min(),
                                                      std::numeric_limits<T>::max()));
        else
            return static_cast<T>(difference);
    }
}

template <class T, class S, class D, class G>
T with_gain(S s, D d, G g, int32_t scale)
{
    if constexpr (std::is_floating_point_v<S>)
        return (s - d) * g;
    else {
        const int64_t difference = int64_t{s} - int64_t{d};
        if constexpr (std::is_floating_point_v<T>) {
            const T product = static_cast<T>(difference) * static_cast<T>(g);
            if constexpr (std::is_integral_v<G>)
                return static_cast<T>(shifted(static_cast<int64_t>(product), scale));
            else
                return product;
        } else if constexpr (std::is_floating_point_v<G>) {
            float factor = 0;
            if (is_narrow<T>) factor = static_cast<float>(static_cast<T>(difference));
            if (std::is_same_v<T, uint32_t>) factor = static_cast<float>(static_cast<uint32_t>(difference));
            if (std::is_same_v<T, int32_t>) factor = static_cast<float>(static_cast<int32_t>(difference));
            return low_bits<T>(rounded(factor * g));
        } else {
            const int64_t cut = static_cast<T>(difference);
            return static_cast<T>(
                shifted(static_cast<int64_t>(static_cast<uint64_t>(cut) * static_cast<uint64_t>(g)), scale));
        }
    }
}

} // namespace Qor::Luxar::ZELT::Test
