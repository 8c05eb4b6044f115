// Loops over adjacent pixels of one storage, for what users run on big images. Narrow integers stay in their own
// width, so that a vector holds as many as it can; the results are those of 32 bits.
#pragma once

#include "arithmetic/kernels/operators.inl"
#include "arithmetic/kernels/words.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic {

template <class T>
inline constexpr T highest = is_signed<T> ? static_cast<T>((1u << (8 * sizeof(T) - 1)) - 1u)
                                          : static_cast<T>(-1);

/// The upper half of a product; the lower half is the wrapped product.
inline int16_t upper_half(int16_t a, int16_t b)
{
    return static_cast<int16_t>((int32_t{a} * int32_t{b}) >> 16);
}

/// One and two bytes under Saturate: first limited to the type, then to the nominal range, which lies inside.
/// A negative difference of unsigned numbers is huge in 32 bits.
template <operation Op, class T>
T saturated(T a, T b, bounds<T> limits)
{
    static_assert(is_signed<T> || Op != operation::multiply, "done by multiply_limited");
    const T wrapped = operate<Op>(a, b);
    bool beyond = false;
    T limit = highest<T>;
    if constexpr (!is_signed<T>) {
        if constexpr (Op == operation::add) beyond = wrapped < a;
        if constexpr (Op == operation::subtract) beyond = a < b;
        const T v = beyond ? limit : wrapped;
        return v < limits.upper ? v : limits.upper;
    } else {
        constexpr int sign = 8 * sizeof(T) - 1;
        T towards = a; // the sign of the true result
        if constexpr (Op == operation::add) beyond = static_cast<T>((a ^ wrapped) & (b ^ wrapped)) < 0;
        if constexpr (Op == operation::subtract) beyond = static_cast<T>((a ^ b) & (a ^ wrapped)) < 0;
        if constexpr (Op == operation::multiply) {
            towards = static_cast<T>(a ^ b);
            if constexpr (sizeof(T) == 1)
                beyond = static_cast<int16_t>(a * b) != wrapped;
            else
                beyond = upper_half(a, b) != static_cast<T>(wrapped >> sign);
        }
        limit = static_cast<T>((towards >> sign) ^ limit);
        return clamp(beyond ? limit : wrapped, limits);
    }
}

template <operation Op, rounding Mode, class T>
T combined(T a, T b, bounds<T> limits)
{
    if constexpr (Mode == rounding::wrap)
        return static_cast<T>(operate<Op>(a, b));
    else if constexpr (is_integer<T> && sizeof(T) < 4)
        return saturated<Op>(a, b, limits);
    else
        return clamp(operate<Op>(a, b), limits);
}

template <rounding Mode, class T>
T divided(T a, T b, range limits)
{
    auto q = quotient(a, b);
    if constexpr (Mode == rounding::saturate) q = clamp(q, bounds<decltype(q)>(limits));
    return static_cast<T>(q);
}

template <bool Signed>
struct computed_in {
    using type = uint32_t;
};
template <>
struct computed_in<true> {
    using type = int32_t;
};

template <form Form, form Value, class T>
auto operand(const uint8_t* at)
{
    if constexpr (Form == Value) {
        constant_row<T> row;
        __builtin_memcpy(&row.value, at, sizeof row.value);
        return row;
    } else {
        return contiguous_row<T>{const_cast<uint8_t*>(at)};
    }
}

template <class T>
constant_row<T> advanced(constant_row<T> row, int64_t)
{
    return row;
}
template <class T>
contiguous_row<T> advanced(contiguous_row<T> row, int64_t pixels)
{
    return {row.first + pixels * static_cast<int64_t>(sizeof(T))};
}

/// A piece without zeros takes the fast way through real numbers.
template <rounding Mode, class T, class A, class B>
void divide_integers(A a, B b, contiguous_row<T> dst, int64_t count, range limits)
{
    using computing = typename computed_in<is_signed<T>>::type;
    constexpr int64_t piece = 2048;
    for (int64_t first = 0; first < count; first += piece) {
        const int64_t n = first + piece < count ? piece : count - first;
        const auto x = advanced(a, first);
        const auto y = advanced(b, first);
        const auto out = advanced(dst, first);
        if (holds_zero<T>(y, n)) {
            const bounds<computing> limit(limits);
            for (int64_t i = 0; i < n; ++i) {
                const auto q = divide_or_fault<computing>(static_cast<T>(x[i]), static_cast<T>(y[i]));
                out[i] = static_cast<T>(Mode == rounding::saturate ? clamp(q, limit) : q);
            }
        } else {
            each(
                n, [=](T v, T w) { return divided<Mode>(v, w, limits); }, out, x, y);
        }
    }
}

/// Products without sign, no larger than a limit. Bytes: those of every second one, and of the others.
template <class T>
words limited_products(words v, words w, words upper)
{
    const auto limited = [=](words product) { return product < upper ? product : upper; };
    if constexpr (sizeof(T) == 1)
        return limited((v & 255) * (w & 255)) | limited((v >> 8) * (w >> 8)) << 8;
    else
        return upper_halves(v, w) != 0 ? upper : limited(v * w);
}

template <form Form, class T>
void multiply_limited(const uint8_t* a, const uint8_t* b, uint8_t* dst, int64_t count, range limits)
{
    const words upper = all_words(static_cast<uint16_t>(limits.upper));
    const int64_t bytes = count * static_cast<int64_t>(sizeof(T));
    if constexpr (Form == form::images) {
        each_vector(
            bytes, [=](words v, words w) { return limited_products<T>(v, w, upper); }, dst, a, b);
    } else {
        T number;
        __builtin_memcpy(&number, b, sizeof number);
        const words w = all_words(static_cast<uint16_t>(sizeof(T) == 1 ? number * 0x101 : number));
        each_vector(
            bytes, [=](words v) { return limited_products<T>(v, w, upper); }, dst, a);
    }
}

template <operation Op, form Form, rounding Mode, class T>
void direct(const uint8_t* a, const uint8_t* b, uint8_t* dst, int64_t count, range limits)
{
    const auto x = operand<Form, form::value_left, T>(a);
    const auto y = operand<Form, form::value_right, T>(b);
    const contiguous_row<T> out{dst};
    constexpr bool narrow_unsigned = is_integer<T> && !is_signed<T> && sizeof(T) < 4;
    if constexpr (Op == operation::multiply && Mode == rounding::saturate && narrow_unsigned) {
        multiply_limited<Form, T>(a, b, dst, count, limits);
    } else if constexpr (Op == operation::divide && is_integer<T>) {
        divide_integers<Mode>(x, y, out, count, limits);
    } else if constexpr (is_pair<T>) {
        each(
            count, [](T v, T w) { return operate<Op>(v, w); }, out, x, y);
    } else {
        const bounds<T> limit(limits);
        each(
            count, [=](T v, T w) { return combined<Op, Mode>(v, w, limit); }, out, x, y);
    }
}

/// Sums and differences of complex pixels are those of their parts.
template <operation Op, class Part>
void direct_parts(const uint8_t* a, const uint8_t* b, uint8_t* dst, int64_t count, range limits)
{
    direct<Op, form::images, rounding::wrap, Part>(a, b, dst, 2 * count, limits);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic
