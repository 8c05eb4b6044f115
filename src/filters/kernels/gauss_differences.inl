// What is made of the differences of a smoothed image. Its rows have two clamped pixels before and behind them; the
// rows above and below are clamped here.
#pragma once

#include "filters/kernels/gauss_recursion.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::gauss {

using Filters::gauss_differences;

inline constexpr int64_t columns_at_once = 512;

/// The rows of a smoothed image around one of them.
template <class S>
struct rows_around {
    const S* row[5];

    rows_around(const gauss_differences& d, int64_t y)
    {
        for (int64_t i = 0; i < 5; ++i) {
            const int64_t wanted = y + i - 2, last = d.height - 1;
            const int64_t inside = wanted < 0 ? 0 : wanted > last ? last : wanted;
            row[i] = reinterpret_cast<const S*>(d.smooth.first + inside * d.smooth.y_stride);
        }
    }
    S operator()(int64_t x, int64_t dx, int64_t dy) const { return row[2 + dy][x + dx]; }
};

inline uint64_t bits_of(double v)
{
    uint64_t bits;
    __builtin_memcpy(&bits, &v, sizeof bits);
    return bits;
}

/// The hypotenuse in single precision: in double, where the squares are exact, and rounded once. It is infinite with an
/// infinite side, whatever the other is. A mask chooses: compilers would put the root into a branch, one at a time.
inline float hypotenuse(float a, float b)
{
    constexpr uint64_t infinity = 0x7FF0000000000000;
    const double x = a, y = b;
    const uint64_t length = bits_of(__builtin_sqrt(x * x + y * y));
    const uint64_t x_infinite = bits_of(__builtin_fabs(x)) == infinity;
    const uint64_t y_infinite = bits_of(__builtin_fabs(y)) == infinity;
    const uint64_t mask = 0 - (x_infinite | y_infinite);
    const uint64_t chosen = (length & ~mask) | (infinity & mask);
    double result;
    __builtin_memcpy(&result, &chosen, sizeof result);
    return static_cast<float>(result);
}

/// sqrt(2) |v|, correctly rounded: the product and the rest of the constant are added with what the product lost.
inline double times_sqrt_2(double v)
{
    constexpr double sqrt_2 = 0x1.6a09e667f3bcdp0, rest = -0x1.bdd3413b26456p-54;
    constexpr double split = 0x1p27 + 1; // halves a number into two of 26 bits
    constexpr double high = sqrt_2 * split - (sqrt_2 * split - sqrt_2), low = sqrt_2 - high;
    const double a = __builtin_fabs(v);
    const double shifted = a * split;
    const double a_high = shifted - (shifted - a), a_low = a - a_high;
    const double product = a * sqrt_2;
    const double lost = ((a_high * high - product) + a_high * low + a_low * high) + a_low * low;
    const double sum = product + (lost + a * rest);
    return sum == sum ? sum : product; // infinite, NaN, or too large to be split
}

/// Two differences, in single precision, whose hypotenuse is wanted.
struct sides {
    float x, y;
};

struct of_gradient {
    template <class S>
    static sides at(const rows_around<S>& s, int64_t x)
    {
        return {static_cast<float>(s(x, 1, 0) - s(x, -1, 0)), static_cast<float>(s(x, 0, 1) - s(x, 0, -1))};
    }
};

template <class S>
inline S second_x(const rows_around<S>& s, int64_t x)
{
    return S(0.25) * (s(x, -2, 0) + s(x, 2, 0) - 2 * s(x, 0, 0));
}
template <class S>
inline S second_y(const rows_around<S>& s, int64_t x)
{
    return S(0.25) * (s(x, 0, -2) + s(x, 0, 2) - 2 * s(x, 0, 0));
}
template <class S>
inline S first_x(const rows_around<S>& s, int64_t x)
{
    return (s(x, 1, 0) - s(x, -1, 0)) * S(0.5);
}
template <class S>
inline S first_y(const rows_around<S>& s, int64_t x)
{
    return (s(x, 0, 1) - s(x, 0, -1)) * S(0.5);
}

struct of_laplacian {
    template <class S>
    static sides at(const rows_around<S>& s, int64_t x)
    {
        return {static_cast<float>(second_x(s, x)), static_cast<float>(second_y(s, x))};
    }
};

struct of_sdgd {
    template <class S>
    static double at(const rows_around<S>& s, int64_t x)
    {
        const double gx = first_x(s, x), gy = first_y(s, x);
        const double gxx = second_x(s, x), gyy = second_y(s, x);
        const double gxy = (first_y(s, x + 1) - first_y(s, x - 1)) * S(0.5);
        const double v = (gx * gx * gxx + 2 * gx * gy * gxy + gy * gy * gyy) / (gx * gx + gy * gy + 0.1);
        return times_sqrt_2(v);
    }
};

template <class Operation, class T, class S>
void store_differences(const rows_around<S>& around, int64_t left, int64_t count, uint8_t* to, int64_t stride)
{
    using result = decltype(Operation::at(around, 0));
    if constexpr (requires(result r) { r.x; }) {
        // In memory in between: GCC 12 takes a float between two doubles for a double in the rest of some loops.
        float x[columns_at_once], y[columns_at_once], lengths[columns_at_once];
        for (int64_t i = 0; i < count; ++i) {
            const sides s = Operation::at(around, left + i);
            x[i] = s.x;
            y[i] = s.y;
        }
        for (int64_t i = 0; i < count; ++i) lengths[i] = hypotenuse(x[i], y[i]);
        store<limited<T>>(lengths, count, to, stride);
    } else {
        result results[columns_at_once];
        for (int64_t i = 0; i < count; ++i) results[i] = Operation::at(around, left + i);
        store<limited<T>>(results, count, to, stride);
    }
}

/// Operation is of each pixel; the results are limited to the type T.
template <class Operation, class T, class S>
void each_difference(const gauss_differences& d)
{
    const int64_t width = d.width, height = d.height;
    for (int64_t y = 0; y < height; ++y) {
        const rows_around<S> around(d, y);
        for (int64_t left = 0; left < width; left += columns_at_once) {
            const int64_t count = width - left < columns_at_once ? width - left : columns_at_once;
            uint8_t* const to = d.dst.first + y * d.dst.y_stride + left * d.dst.x_stride;
            store_differences<Operation, T>(around, left, count, to, d.dst.x_stride);
        }
    }
}

template <class T>
void gradient(const gauss_differences& d)
{
    each_difference<of_gradient, T, typename scratch_of<T>::type>(d);
}
template <class T>
void laplacian(const gauss_differences& d)
{
    each_difference<of_laplacian, T, typename scratch_of<T>::type>(d);
}
template <class T>
void sdgd(const gauss_differences& d)
{
    each_difference<of_sdgd, T, typename scratch_of<T>::type>(d);
}

struct of_first_x {
    template <class S>
    static S at(const rows_around<S>& s, int64_t x)
    {
        return first_x(s, x);
    }
};
struct of_first_y {
    template <class S>
    static S at(const rows_around<S>& s, int64_t x)
    {
        return first_y(s, x);
    }
};

template <class S>
void xy(const gauss_differences& d)
{
    each_difference<of_first_x, float, S>(d);
    gauss_differences in_y = d;
    in_y.dst = d.dst_y;
    each_difference<of_first_y, float, S>(in_y);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::gauss
