// Pixels of one or two bytes with a number, in their own width or in 16 bits.
#pragma once

#include "arithmetic/kernels/direct.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic {

template <class T>
void plus_number(const uint8_t* src, uint8_t* dst, int64_t count, Arithmetic::narrow_sum s)
{
    const auto least = static_cast<T>(s.least), greatest = static_cast<T>(s.greatest);
    const auto whole = static_cast<T>(s.whole), below = static_cast<T>(s.below);
    const auto sign = static_cast<T>(s.negated ? -1 : 0);
    const auto f = [=](T v) {
        v = v < least ? least : v;
        v = v > greatest ? greatest : v;
        const auto sum = static_cast<T>(v + whole + (v < below ? 1 : 0));
        return static_cast<T>((sum ^ sign) - sign);
    };
    each(count, f, contiguous_row<T>{dst}, contiguous_row<T>{const_cast<uint8_t*>(src)});
}

/// The whole part of sizes times the factor, low bits kept.
template <class T>
words products(words sizes, Arithmetic::narrow_product p)
{
    const words whole = sizes * all_words(static_cast<uint16_t>(p.whole));
    const words low = upper_halves(sizes, all_words(static_cast<uint16_t>(p.fraction)));
    if constexpr (sizeof(T) == 1) return whole + low;
    const words factor = all_words(static_cast<uint16_t>(p.fraction >> 16));
    const words middle = sizes * factor, without_carry = whole + upper_halves(sizes, factor);
    return middle + low < middle ? without_carry + 1 : without_carry;
}

/// Pixels as 16-bit numbers. Only those of two bytes without sign need more than the signed ones.
template <class T>
struct narrow_numbers {
    using type = signed_words;
};
template <>
struct narrow_numbers<uint16_t> {
    using type = words;
};

template <class T>
words times_number(typename narrow_numbers<T>::type pixels, Arithmetic::narrow_product p)
{
    using numbers = typename narrow_numbers<T>::type;
    const auto all = [](int32_t value) { return all_words(static_cast<uint16_t>(value)); };
    const auto as_numbers = [](words w) { return __builtin_bit_cast(numbers, w); };
    const auto v = __builtin_bit_cast(words, pixels);
    if constexpr (is_signed<T>) {
        const auto sign = __builtin_bit_cast(words, pixels >> 15);
        const words turn = sign ^ all(p.negative ? -1 : 0);
        const words r = (products<T>((v ^ sign) - sign, p) ^ turn) - turn;
        const words limited = pixels > as_numbers(all(p.greatest)) ? all(p.over) : r;
        return pixels < as_numbers(all(p.least)) ? all(p.under) : limited;
    } else {
        return pixels > as_numbers(all(p.greatest)) ? all(p.over) : products<T>(v, p);
    }
}

/// A vector of pixels. Bytes: every second one, and the others.
template <class T>
words times_number_of_vector(words pixels, Arithmetic::narrow_product p)
{
    using numbers = typename narrow_numbers<T>::type;
    const auto as_numbers = [](words w) { return __builtin_bit_cast(numbers, w); };
    if constexpr (sizeof(T) == 2) return times_number<T>(as_numbers(pixels), p);
    const numbers even = is_signed<T> ? as_numbers(pixels << 8) >> 8 : as_numbers(pixels & 255);
    const numbers odd = is_signed<T> ? as_numbers(pixels) >> 8 : as_numbers(pixels >> 8);
    return (times_number<T>(even, p) & 255) | times_number<T>(odd, p) << 8;
}

template <class T>
void times_number(const uint8_t* src, uint8_t* dst, int64_t count, Arithmetic::narrow_product p)
{
    const auto f = [=](words pixels) { return times_number_of_vector<T>(pixels, p); };
    each_vector(count * static_cast<int64_t>(sizeof(T)), f, dst, src);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic
