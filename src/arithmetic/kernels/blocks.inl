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

/// Complex numbers in a block: all real parts, then all imaginary ones. Apart, since GCC 12 would fuse the products
/// and sums of neighbours (-ffp-contract=off or not) where the processor can, and change their bits.
template <class W>
struct parts_of {
    using part = decltype(W::real);
    part* real;
    part* imaginary;

    explicit parts_of(void* block)
        : real(static_cast<part*>(block)), imaginary(real + Arithmetic::block_pixels)
    {
    }
    explicit parts_of(const void* block) : parts_of(const_cast<void*>(block)) {}
};

/// Parts of adjacent pixels: what the compiler sees as two numbers of one pixel, and can take apart.
template <class Part, int Place>
struct contiguous_parts {
    uint8_t* first;
    pixel_reference<Part> operator[](int64_t x) const
    {
        return first + (2 * x + Place) * static_cast<int64_t>(sizeof(Part));
    }
};
template <class Part, class Real, class Imaginary>
struct row_of_parts {
    Real real;
    Imaginary imaginary;
};

template <class Part>
auto rows_of_parts(contiguous_row<complex_pixel<Part>> row)
{
    using real = contiguous_parts<Part, 0>;
    using imaginary = contiguous_parts<Part, 1>;
    return row_of_parts<Part, real, imaginary>{{row.first}, {row.first}};
}
template <class Part>
auto rows_of_parts(strided_row<complex_pixel<Part>> row)
{
    using part = strided_row<Part>;
    return row_of_parts<Part, part, part>{{row.first, row.stride},
                                          {row.first + static_cast<int64_t>(sizeof(Part)), row.stride}};
}

template <class W, class S>
void load(const uint8_t* from, int64_t stride, int32_t count, void* to)
{
    with_row<S>(from, stride, [=](auto row) {
        if constexpr (is_pair<W>) {
            using part = decltype(W::real);
            const parts_of<W> out(to);
            if constexpr (is_pair<S>) {
                using stored = decltype(S::real);
                const auto [real, imaginary] = rows_of_parts<stored>(row);
                for (int32_t i = 0; i < count; ++i) {
                    out.real[i] = static_cast<part>(static_cast<stored>(real[i]));
                    out.imaginary[i] = static_cast<part>(static_cast<stored>(imaginary[i]));
                }
            } else {
                each(
                    count, [](S s) { return static_cast<part>(s); }, out.real, row);
                for (int32_t i = 0; i < count; ++i) out.imaginary[i] = 0;
            }
        } else {
            each(
                count, [](S s) { return static_cast<W>(s); }, static_cast<W*>(to), row);
        }
    });
}

template <class W>
struct flag_of_width {
    using type = int32_t;
};
template <>
struct flag_of_width<double> {
    using type = int64_t;
};

/// True when every value, truncated, is a signed number of 32 bits above the least one. NaN is not.
template <class W>
bool fit_32_bits(const W* values, int32_t count)
{
    typename flag_of_width<W>::type outside =
        0; // one comparison at a time: the compiler takes several values then
    for (int32_t i = 0; i < count; ++i) {
        const W size = values[i] < 0 ? -values[i] : values[i];
        outside |= size < static_cast<W>(0x1p31) ? 0 : 1;
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

/// The limits lie within 32 bits.
template <class T, class W>
T truncated_within(W v, bounds<W> limits)
{
    return static_cast<T>(static_cast<int32_t>(clamp(v, limits)));
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
void apply_complex(parts_of<W> a, parts_of<W> b, int32_t count, parts_of<W> out)
{
    using P = typename parts_of<W>::part;
    if constexpr (Op == operation::add || Op == operation::subtract) {
        const auto combine = [](P v, P w) { return operate<Op>(v, w); };
        each(count, combine, out.real, a.real, b.real);
        each(count, combine, out.imaginary, a.imaginary, b.imaginary);
    } else if constexpr (Op == operation::multiply) {
        each(
            count, [](P ar, P ai, P br, P bi) { return ar * br - ai * bi; }, out.real, a.real, a.imaginary,
            b.real, b.imaginary);
        each(
            count, [](P ar, P ai, P br, P bi) { return ai * br + ar * bi; }, out.imaginary, a.real,
            a.imaginary, b.real, b.imaginary);
    } else {
        each(
            count, [](P ar, P ai, P br, P bi) { return (ar * br + ai * bi) / (br * br + bi * bi); }, out.real,
            a.real, a.imaginary, b.real, b.imaginary);
        each(
            count, [](P ar, P ai, P br, P bi) { return (ai * br - ar * bi) / (br * br + bi * bi); },
            out.imaginary, a.real, a.imaginary, b.real, b.imaginary);
    }
}

/// The result is a third block.
template <operation Op, class W>
void apply(const void* a, const void* b, int32_t count, void* result)
{
    if constexpr (is_pair<W>) {
        apply_complex<Op, W>(parts_of<W>(a), parts_of<W>(b), count, parts_of<W>(result));
    } else {
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
}

template <class W, class T, rounding Mode>
void store(const void* from, int32_t count, range limits, uint8_t* to, int64_t stride)
{
    const auto* const values = static_cast<const W*>(from);
    with_row<T>(to, stride, [=](auto dst) {
        if constexpr (is_pair<W>) {
            const parts_of<W> in(from);
            const auto [real, imaginary] = rows_of_parts<typename parts_of<W>::part>(dst);
#ifdef __clang__
#pragma clang loop vectorize(assume_safety)
#else
#pragma GCC ivdep
#endif
            for (int32_t i = 0; i < count; ++i) {
                real[i] = in.real[i];
                imaginary[i] = in.imaginary[i];
            }
        } else if constexpr (is_real<W> && is_integer<T>) {
            if constexpr (Mode == rounding::saturate && sizeof(T) < 4) {
                const bounds<W> b(limits);
                each(
                    count, [=](W v) { return truncated_within<T>(v, b); }, dst, values);
            } else if constexpr (Mode == rounding::saturate) {
                alignas(64) W clamped[Arithmetic::block_pixels];
                const bounds<W> b(limits);
                each(
                    count, [=](W v) { return clamp(v, b); }, static_cast<W*>(clamped), values);
                truncate<T>(clamped, count, dst);
            } else {
                truncate<T>(values, count, dst);
            }
        } else if constexpr (Mode == rounding::saturate) {
            const bounds<W> b(limits);
            each(
                count, [=](W v) { return static_cast<T>(clamp(v, b)); }, dst, values);
        } else {
            each(
                count, [](W v) { return static_cast<T>(v); }, dst, values);
        }
    });
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::arithmetic
