// The operators on one pair of values, and how a value becomes a pixel.
#pragma once

#include "arithmetic/kernels/arithmetic_table.h"
#include "pixel/rows.h"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic {

using Arithmetic::form;
using Arithmetic::operation;
using Arithmetic::range;
using Arithmetic::rounding;

template <class A, class B>
inline constexpr bool is_same = false;
template <class A>
inline constexpr bool is_same<A, A> = true;

template <class T>
inline constexpr bool is_real = is_same<T, float> || is_same<T, double>;
template <class T>
inline constexpr bool is_pair = is_same<T, complex_pixel<float>> || is_same<T, complex_pixel<double>>;
template <class T>
inline constexpr bool is_integer = !is_real<T> && !is_pair<T>;
template <class T>
inline constexpr bool is_signed = static_cast<T>(-1) < T{0};

/// Limits in the type that compares them.
template <class W>
struct bounds {
    W lower;
    W upper;

    explicit bounds(range r)
    {
        if constexpr (is_real<W>) {
            lower = static_cast<W>(r.lower);
            upper = static_cast<W>(r.upper);
        } else { // of a signed type, as an unsigned number: huge
            lower = static_cast<W>(static_cast<int64_t>(r.lower));
            upper = static_cast<W>(static_cast<int64_t>(r.upper));
        }
    }
};

/// In this order, deliberately: NaN becomes the lower limit, and a lower limit above the upper one (that of a signed
/// type among unsigned numbers) is not limited in its turn.
template <class W>
W clamp(W v, bounds<W> b)
{
    const W below_upper = v < b.upper ? v : b.upper;
    return v >= b.lower ? below_upper : b.lower;
}

/// A true division, so that zero is the processor's affair; a compiler that knew it would trap in another way. The one
/// quotient that does not fit wraps.
template <class W>
__attribute__((no_sanitize("integer-divide-by-zero"))) W divide_or_fault(W a, W b)
{
    if constexpr (is_signed<W>)
        if (b == -1) return static_cast<W>(0u - static_cast<uint32_t>(a));
    __asm__("" : "+r"(b)); // hides it
    return a / b;
}

/// a / b of integers, for b other than 0: the rounded quotient of real numbers that hold both exactly never
/// reaches the next whole number. Narrow quotients come as they are, wide ones wrap.
template <class T>
auto quotient(T a, T b)
{
    if constexpr (sizeof(T) < 4) {
        return static_cast<int32_t>(static_cast<float>(a) / static_cast<float>(b));
    } else if constexpr (is_signed<T>) {
        const double q = static_cast<double>(a) / static_cast<double>(b);
        return static_cast<int32_t>(q < 0x1p31 ? q : -0x1p31);
    } else {
        const double q = static_cast<double>(a) / static_cast<double>(b);
        const bool high = q >= 0x1p31;
        const auto low = static_cast<uint32_t>(static_cast<int32_t>(high ? q - 0x1p31 : q));
        return high ? low | 0x80000000u : low;
    }
}

/// The operator on a computing type: 32-bit integers wrap. Integer division is not among them.
template <operation Op, class W>
W operate(W a, W b)
{
    if constexpr (Op == operation::min) {
        return b < a ? b : a;
    } else if constexpr (Op == operation::max) {
        return a < b ? b : a;
    } else if constexpr (is_real<W>) {
        if constexpr (Op == operation::add) return a + b;
        if constexpr (Op == operation::subtract) return a - b;
        if constexpr (Op == operation::multiply) return a * b;
        if constexpr (Op == operation::divide) return a / b;
    } else {
        const auto x = static_cast<uint32_t>(a), y = static_cast<uint32_t>(b);
        if constexpr (Op == operation::add) return static_cast<W>(x + y);
        if constexpr (Op == operation::subtract) return static_cast<W>(x - y);
        if constexpr (Op == operation::multiply) return static_cast<W>(x * y);
    }
}

/// One after the other, the compiler may take several at once: reading stays ahead of writing.
template <class Function, class Dst, class... Sources>
void each(int64_t count, Function f, Dst dst, Sources... sources)
{
#ifdef __clang__
#pragma clang loop vectorize(assume_safety)
#else
#pragma GCC ivdep
#endif
    for (int64_t i = 0; i < count; ++i) dst[i] = f(sources[i]...);
}

/// The same value at each place.
template <class T>
struct constant_row {
    T value;
    T operator[](int64_t) const { return value; }
};

template <class T, class Row>
bool holds_zero(Row row, int64_t count)
{
    T any = 0;
    for (int64_t i = 0; i < count; ++i) any = static_cast<T>(any | (static_cast<T>(row[i]) == 0 ? 1 : 0));
    return any != 0;
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic
