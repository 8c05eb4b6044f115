// The loops of the functions of a pixel, on adjacent pixels.
//
// Single precision: elementary_floats.inl for exponentials, logarithms, sines and cosines and their arcs, else
// elementary.inl, with the plainest form for runs of ordinary values; the careful form gives those the same bits.
// Double precision: doubles.inl. Powers of both: powers.inl. Angles too large for a quick reduction: SLEEF's functions,
// whose results are the same on every processor, within one unit in the last place of a double.
#pragma once

#include "arithmetic/kernels/elementary.inl"
#include "arithmetic/kernels/elementary_floats.inl"
#include "arithmetic/kernels/functions_table.h"
#include "arithmetic/kernels/operators.inl"
#include "arithmetic/kernels/powers.inl"

#include <sleef.h>

namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions {

/// Values that are looked at before one form of a function is taken for all of them.
inline constexpr int64_t run_length = 256;

constexpr int lanes_of(const reals*) { return lanes; }
constexpr int lanes_of(const singles::floats*) { return singles::float_lanes; }

/// to[i] = f(from[i]...) for all pixels, a vector at a time. The last ones go through memory of a vector's size.
template <class T, class Vector = reals, class Function, class... From>
void map(uint8_t* to, int64_t count, Function f, From... from)
{
    constexpr int width = lanes_of(static_cast<const Vector*>(nullptr));
    constexpr int64_t step = width * static_cast<int64_t>(sizeof(T));
    const int64_t end = count / width * step, rest = count * static_cast<int64_t>(sizeof(T)) - end;
    const auto load_from = [](const T* p) {
        if constexpr (width == lanes)
            return load(p);
        else
            return singles::load(p);
    };
    const auto store_to = [](T* p, Vector v) {
        if constexpr (width == lanes)
            store(p, v);
        else
            singles::store(p, v);
    };
    for (int64_t i = 0; i < end; i += step)
        store_to(reinterpret_cast<T*>(to + i), f(load_from(reinterpret_cast<const T*>(from + i))...));
    if (rest == 0) return;
    const auto load_rest = [=](const uint8_t* p) {
        T values[width] = {};
        __builtin_memcpy(values, p + end, static_cast<size_t>(rest));
        return load_from(values);
    };
    T results[width];
    store_to(results, f(load_rest(from)...));
    __builtin_memcpy(to + end, results, static_cast<size_t>(rest));
}

/// The same of single-precision numbers in single precision.
template <class Function>
void map_floats(const uint8_t* from, uint8_t* to, int64_t count, Function f)
{
    map<float, singles::floats>(to, count, f, from);
}

template <class T>
T value_at(const uint8_t* p, int64_t i)
{
    T v;
    __builtin_memcpy(&v, p + i * static_cast<int64_t>(sizeof v), sizeof v);
    return v;
}

/// body(first byte, count) for runs of up to run_length pixels.
template <class T, class Body>
void each_run(int64_t count, Body body)
{
    for (int64_t i = 0; i < count; i += run_length)
        body(i * static_cast<int64_t>(sizeof(T)), count - i < run_length ? count - i : run_length);
}

/// True when some value is larger than the limit, NaN or -0.
inline bool holds_unusual_angle(const uint8_t* from, int64_t count, float limit)
{
    int32_t largest = 0, least = 0;
    for (int64_t i = 0; i < count; ++i) {
        const auto bits = value_at<int32_t>(from, i), size = bits & 0x7fffffff;
        largest = size > largest ? size : largest;
        least = bits < least ? bits : least;
    }
    return largest > __builtin_bit_cast(int32_t, limit) || least == -0x7fffffff - 1;
}

/// True when all values are positive, finite and of full precision.
inline bool are_ordinary(const uint8_t* from, int64_t count)
{
    int32_t outside = 0;
    for (int64_t i = 0; i < count; ++i) {
        const float v = value_at<float>(from, i);
        outside |= v >= __FLT_MIN__ ? 0 : 1;
        outside |= v < __builtin_inff() ? 0 : 1;
    }
    return outside == 0;
}

/// A function of angles; large ones take the function that reduces them with all of pi.
template <class Function, class Exact>
void map_angles(const uint8_t* from, uint8_t* to, int64_t count, Function f, Exact of_large)
{
    each_run<float>(count, [=](int64_t first, int64_t n) {
        const uint8_t* const angles = from + first;
        if (!holds_unusual_angle(angles, n, largest_angle)) return map<float>(to + first, n, f, angles);
        float results[run_length];
        map<float>(reinterpret_cast<uint8_t*>(results), n, f, angles);
        for (int64_t i = 0; i < n; ++i) {
            const float angle = value_at<float>(angles, i), size = __builtin_fabsf(angle);
            if (size > largest_angle)
                results[i] = size < __builtin_inff()
                                 ? static_cast<float>(of_large(static_cast<double>(angle)))
                                 : __builtin_nanf("");
        }
        __builtin_memcpy(to + first, results, static_cast<size_t>(n) * sizeof(float));
    });
}

/// The sine, or the cosine by its start. f computes the same of larger angles, and of -0.
template <class Function, class Exact>
void map_sine_from(const uint8_t* from, uint8_t* to, int64_t count, float start, Function f, Exact of_large)
{
    const auto quick = [=](singles::floats x) { return singles::sine_from(x, start); };
    each_run<float>(count, [=](int64_t first, int64_t n) {
        const uint8_t* const angles = from + first;
        if (!holds_unusual_angle(angles, n, singles::quick_angle))
            return map_floats(angles, to + first, n, quick);
        float results[run_length], others[run_length];
        map_floats(angles, reinterpret_cast<uint8_t*>(results), n, quick);
        map_angles(angles, reinterpret_cast<uint8_t*>(others), n, f, of_large);
        for (int64_t i = 0; i < n; ++i) {
            const float size = __builtin_fabsf(value_at<float>(angles, i));
            results[i] = size > 0 && size <= singles::quick_angle ? results[i] : others[i];
        }
        __builtin_memcpy(to + first, results, static_cast<size_t>(n) * sizeof(float));
    });
}

inline void map_sine(const uint8_t* from, uint8_t* to, int64_t count)
{
    map_sine_from(
        from, to, count, singles::sine_start, [](reals x) { return sine(x); },
        [](double x) { return Sleef_cinz_sind1_u10purec(x); });
}
inline void map_cosine(const uint8_t* from, uint8_t* to, int64_t count)
{
    map_sine_from(
        from, to, count, singles::cosine_start, [](reals x) { return cosine(x); },
        [](double x) { return Sleef_cinz_cosd1_u10purec(x); });
}
inline void map_tangent(const uint8_t* from, uint8_t* to, int64_t count)
{
    map_angles(
        from, to, count, [](reals x) { return tangent(x); },
        [](double x) { return Sleef_cinz_tand1_u10purec(x); });
}
inline void map_arc_sine(const uint8_t* from, uint8_t* to, int64_t count)
{
    map_floats(from, to, count, [](singles::floats x) { return singles::arc_sine(x); });
}
inline void map_arc_cosine(const uint8_t* from, uint8_t* to, int64_t count)
{
    map_floats(from, to, count, [](singles::floats x) { return singles::arc_cosine(x); });
}
inline void map_arc_tangent(const uint8_t* from, uint8_t* to, int64_t count)
{
    map<float>(
        to, count, [](reals x) { return arc_tangent(x); }, from);
}
inline void map_arc_tangent_2(const uint8_t* a, const uint8_t* b, uint8_t* to, int64_t count)
{
    map<float>(
        to, count, [](reals y, reals x) { return arc_tangent_2(y, x); }, a, b);
}

template <class T>
void map_exponential(const uint8_t* from, uint8_t* to, int64_t count)
{
    if constexpr (sizeof(T) == sizeof(double))
        map<T>(
            to, count, [](reals x) { return exponential_of_double(x); }, from);
    else
        map_floats(from, to, count, [](singles::floats x) { return singles::exponential(x); });
}

template <class T>
void map_logarithm(const uint8_t* from, uint8_t* to, int64_t count)
{
    if constexpr (sizeof(T) == sizeof(double)) {
        map<T>(
            to, count, [](reals x) { return logarithm_of_double(x); }, from);
    } else {
        each_run<T>(count, [=](int64_t first, int64_t n) {
            const uint8_t* const p = from + first;
            if (are_ordinary(p, n))
                map_floats(p, to + first, n,
                           [](singles::floats x) { return singles::logarithm_of_ordinary(x); });
            else
                map_floats(p, to + first, n, [](singles::floats x) { return singles::logarithm(x); });
        });
    }
}

/// x to an exponent that is 0, infinite or NaN. A power with exponent 0, or of 1, is 1 even with NaN.
inline reals unusual_power(reals x, double exponent)
{
    const reals size = magnitude(x);
    const double grown = exponent > 0 ? infinity : 0, shrunk = exponent > 0 ? 0 : infinity;
    if (exponent == 0) return all(1);
    if (exponent != exponent) return x == 1 ? all(1) : all(exponent);
    const reals of_number = size > 1 ? all(grown) : size < 1 ? all(shrunk) : all(1);
    return x == x ? of_number : x;
}

/// to[i] = power(logarithm(from[i])), or careful(from[i]) for vectors with other than ordinary values. The logarithms
/// of a run come first, so that the processor has the sums of several vectors to work at.
template <class T, class Logarithm, class Power, class Careful>
void map_by_logarithms(const uint8_t* from, uint8_t* to, int64_t count, Logarithm logarithm, Power power,
                       Careful careful)
{
    constexpr int64_t size = sizeof(T);
    const int64_t end = count / lanes * lanes;
    for (int64_t first = 0; first < end; first += run_length) {
        const int64_t n = end - first < run_length ? end - first : run_length;
        const auto* const in = reinterpret_cast<const T*>(from + first * size);
        auto* const out = reinterpret_cast<T*>(to + first * size);
        decltype(logarithm(reals{})) logarithms[run_length / lanes];
        for (int64_t i = 0; i < n; i += lanes) logarithms[i / lanes] = logarithm(load(in + i));
        for (int64_t i = 0; i < n; i += lanes) {
            const reals x = load(in + i);
            store(out + i, all_ordinary(x) ? power(logarithms[i / lanes]) : careful(x));
        }
    }
    map<T>(to + end * size, count - end, careful, from + end * size);
}

inline void map_power_of_doubles(const uint8_t* from, uint8_t* to, int64_t count, exponent_kind kind)
{
    const auto careful = [=](reals x) { return power_of_any(x, kind); };
    if (kind.exponent > largest_exponent || kind.exponent < -largest_exponent)
        return map<double>(to, count, careful, from);
    map_by_logarithms<double>(
        from, to, count, [](reals x) { return logarithm_in_parts(x); },
        [=](const sum_of_reals& log) { return power_by_logarithm(log, all(kind.exponent)); }, careful);
}

/// The same for floats, of which one number is the whole logarithm.
inline void map_power_of_floats(const uint8_t* from, uint8_t* to, int64_t count, exponent_kind kind)
{
    map_by_logarithms<float>(
        from, to, count, [=](reals x) { return logarithm_2(x) * kind.exponent; },
        [](reals log) { return power_of_2(log); }, [=](reals x) { return power_of_any_float(x, kind); });
}

/// A single product or root: exactly rounded from double precision or at once, to the same bits.
template <class Function>
void map_singles(const uint8_t* from, uint8_t* to, int64_t count, Function f)
{
    arithmetic::each(count, f, contiguous_row<float>{to}, contiguous_row<float>{const_cast<uint8_t*>(from)});
}

/// The pixels themselves, squares and roots are exactly rounded. The root of -0 is 0, that of negative infinity infinite.
template <class T>
void map_power(const uint8_t* from, uint8_t* to, int64_t count, double exponent)
{
    const auto map_all = [=](auto f) { map<T>(to, count, f, from); };
    if (exponent == 0 || !(exponent > -infinity && exponent < infinity))
        return map_all([=](reals x) { return unusual_power(x, exponent); });
    if (exponent == 1) return map_all([](reals x) { return x; });
    if constexpr (sizeof(T) == sizeof(float)) {
        if (exponent == 2) return map_singles(from, to, count, [](float x) { return x * x; });
        if (exponent == 0.5)
            return map_singles(from, to, count, [](float x) {
                return __builtin_sqrtf(x == -__builtin_inff() ? -x : x + 0.0f);
            });
    }
    if (exponent == 2) return map_all([](reals x) { return x * x; });
    if (exponent == 0.5) return map_all([](reals x) { return root(x == -infinity ? -x : x + 0.0); });
    const exponent_kind kind = kind_of(exponent);
    if constexpr (sizeof(T) == sizeof(double)) {
        map_power_of_doubles(from, to, count, kind);
    } else {
        map_power_of_floats(from, to, count, kind);
    }
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions
