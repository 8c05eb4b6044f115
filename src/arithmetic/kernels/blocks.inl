// Loads, operators and stores for any pair of types at any stride. Each works on a block that stays in the
// first-level cache.
#pragma once

#include "arithmetic/kernels/operators.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic {

/// body(row) with adjacent pixels, or with pixels at a distance.
template <class T, class Body>
void with_row(const uint8_t* first, int64_t stride, Body body)
{
    auto* const at = const_cast<uint8_t*>(first);
    if (stride == static_cast<int64_t>(sizeof(T)))
        body(contiguous_row<T>{at});
    else
        body(strided_row<T>{at, stride});
}

template <class W, class S>
W widened(S s)
{
    if constexpr (is_pair<S>)
        return {static_cast<decltype(W::real)>(s.real), static_cast<decltype(W::real)>(s.imaginary)};
    else if constexpr (is_pair<W>)
        return {static_cast<decltype(W::real)>(s), 0};
    else
        return static_cast<W>(s);
}

template <class W, class S>
void load(const uint8_t* from, int64_t stride, int32_t count, void* to)
{
    auto* const out = static_cast<W*>(to);
    with_row<S>(from, stride, [=](auto row) {
        each(
            count, [](S s) { return widened<W>(s); }, out, row);
    });
}

/// True when every value, truncated, fits into 32 bits. NaN does not.
template <class W>
bool fit_32_bits(const W* values, int32_t count)
{
    int32_t outside = 0;
    for (int32_t i = 0; i < count; ++i) {
        const W v = values[i];
        outside |= v >= static_cast<W>(-0x1p31) && v < static_cast<W>(0x1p31) ? 0 : 1;
    }
    return outside == 0;
}

/// Truncated to 64 bits, low bits kept; 0 for NaN and what lies beyond.
template <class T, class W>
T low_bits(W v)
{
    const bool inside = v >= static_cast<W>(-0x1p63) && v < static_cast<W>(0x1p63);
    return static_cast<T>(static_cast<int64_t>(inside ? v : W{0}));
}

/// Truncates real numbers into integers of T.
template <class T, class W, class Row>
void truncate(const W* values, int32_t count, Row dst)
{
    if (fit_32_bits(values, count))
        each(
            count, [](W v) { return static_cast<T>(static_cast<int32_t>(v)); }, dst, values);
    else
        each(
            count, [](W v) { return low_bits<T>(v); }, dst, values);
}

template <class S>
void load_byte(const uint8_t* from, int64_t stride, int32_t count, void* to)
{
    alignas(64) S values[Arithmetic::block_pixels] = {};
    alignas(64) uint8_t bytes[Arithmetic::block_pixels];
    load<S, S>(from, stride, count, values);
    truncate<uint8_t>(values, count, bytes);
    each(
        count, [](uint8_t b) { return uint32_t{b}; }, static_cast<uint32_t*>(to), bytes);
}

template <operation Op, class W>
void apply(const void* a, const void* b, int32_t count, void* result)
{
    const auto* const x = static_cast<const W*>(a);
    const auto* const y = static_cast<const W*>(b);
    auto* const out = static_cast<W*>(result);
    if constexpr (Op == operation::divide && is_integer<W>) {
        if (holds_zero<W>(y, count))
            for (int32_t i = 0; i < count; ++i) out[i] = divide_or_fault(x[i], y[i]);
        else
            each(
                count, [](W v, W w) { return static_cast<W>(quotient(v, w)); }, out, x, y);
    } else {
        each(
            count, [](W v, W w) { return operate<Op>(v, w); }, out, x, y);
    }
}

template <class W, class T, rounding Mode>
void store(const void* from, int32_t count, range limits, uint8_t* to, int64_t stride)
{
    const auto* const values = static_cast<const W*>(from);
    with_row<T>(to, stride, [=](auto dst) {
        if constexpr (is_real<W> && is_integer<T>) {
            if constexpr (Mode == rounding::saturate) {
                alignas(64) W clamped[Arithmetic::block_pixels];
                const bounds<W> b(limits);
                each(
                    count, [=](W v) { return clamp(v, b); }, static_cast<W*>(clamped), values);
                truncate<T>(clamped, count, dst);
            } else {
                truncate<T>(values, count, dst);
            }
        } else if constexpr (Mode == rounding::saturate && !is_pair<W>) {
            const bounds<W> b(limits);
            each(
                count, [=](W v) { return static_cast<T>(clamp(v, b)); }, dst, values);
        } else {
            each(
                count, [](W v) { return widened<T>(v); }, dst, values);
        }
    });
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic
