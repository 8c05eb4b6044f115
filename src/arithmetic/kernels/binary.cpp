#include "arithmetic/kernels/binary.h"

#include "arithmetic/kernels/arithmetic_levels.h"
#include "arithmetic/kernels/narrow_numbers.h"
#include "arithmetic/kernels/plane.h"

#include <cstring>
#include <utility>

namespace Qor::Luxar::ZELT::Arithmetic {
namespace {

constexpr int index(auto e) { return static_cast<int>(e); }

bool same_type(const image_layout& a, const image_layout& b)
{
    return a.encoding == b.encoding && a.bits == b.bits;
}

bool is_colour(const image_layout& l)
{
    switch (l.encoding) {
    case PixmatEncoding_RGB:
    case PixmatEncoding_BGR: return l.bits == 24;
    case PixmatEncoding_RGBA: return l.bits == 32;
    default: return false;
    }
}

/// The operation behind a method. Reversed methods exchange their operands.
struct operator_choice {
    bool assigns = false;
    bool reversed = false;
    operation op = operation::add;
};

operator_choice choose(method m)
{
    switch (m) {
    case method::add: return {};
    case method::subtract: return {false, false, operation::subtract};
    case method::reverse_subtract: return {false, true, operation::subtract};
    case method::multiply: return {false, false, operation::multiply};
    case method::divide: return {false, false, operation::divide};
    case method::reverse_divide: return {false, true, operation::divide};
    case method::min: return {false, false, operation::min};
    case method::max: return {false, false, operation::max};
    case method::assign: break;
    }
    return {true, false, operation::add};
}

/// Fastest is Wrap. False for what no kernel knows.
bool read_rounding(int32_t given, rounding* mode)
{
    *mode = given == 3 ? rounding::saturate : rounding::wrap;
    return given >= 1 && given <= 3;
}

/// What two real operands are computed in.
computing computing_of(storage a, storage b)
{
    if (a == storage::f64 || b == storage::f64) return computing::f64;
    if (a == storage::f32 || b == storage::f32) return computing::f32;
    return is_unsigned(a) || is_unsigned(b) ? computing::u32 : computing::i32;
}

range range_of(const image_layout& dst)
{
    switch (dst.encoding) {
    case PixmatEncoding_Unsigned: return {0, static_cast<double>((int64_t{1} << dst.bits) - 1)};
    case PixmatEncoding_Signed: {
        const int64_t half = int64_t{1} << (dst.bits - 1);
        return {static_cast<double>(-half), static_cast<double>(half - 1)};
    }
    default: return {0, 1};
    }
}

struct alignas(64) block {
    uint8_t bytes[block_pixels * sizeof(double) * 2];
};

/// Pixels that lie as a block does: adjacent, aligned, of the computing type. For 32-bit integers its sign is no matter.
bool is_like_block(const plane& p, computing c)
{
    const auto address = reinterpret_cast<uintptr_t>(p.first) | static_cast<uintptr_t>(p.y_stride);
    if (!p.adjacent() || address % static_cast<uintptr_t>(bytes_of(p.type)) != 0) return false;
    switch (c) {
    case computing::u32:
    case computing::i32: return p.type == storage::u32 || p.type == storage::i32;
    case computing::f32: return p.type == storage::f32;
    case computing::f64: return p.type == storage::f64;
    default: return false;
    }
}

/// One operand of the block walk: pixels to load, pixels to use where they lie, or a block that stays.
struct source {
    plane pixels;
    load_function load = nullptr;
    bool in_place = false;

    const void* get(int64_t x, int64_t y, int32_t count, block& to) const
    {
        if (in_place) return pixels.at(x, y);
        if (load) load(pixels.at(x, y), pixels.x_stride, count, to.bytes);
        return to.bytes;
    }
};

source source_of(const plane& p, computing c, const arithmetic_table& table)
{
    return {p, table.load[index(c)][index(p.type)], is_like_block(p, c)};
}

/// How results become pixels of the output; null where they are pixels as they come.
store_function store_of(const plane& out, computing c, apply_function apply, rounding mode,
                        const arithmetic_table& table)
{
    if (apply && mode == rounding::wrap && is_like_block(out, c)) return nullptr;
    return table.store[index(c)][index(out.type)][index(mode)];
}

/// A null apply stores the second operand. A null store: apply writes into the output itself.
struct block_job {
    source a, b;
    apply_function apply;
    store_function store;
    plane dst;
    range limits;
    size extent;
};

/// `first` and `second` hold the operands that are no images.
void run_blocks(const block_job& job, block& first, block& second)
{
    block result;
    for (int64_t y = 0; y < job.extent.height; ++y)
        for (int64_t x = 0; x < job.extent.width; x += block_pixels) {
            const auto count = static_cast<int32_t>(job.extent.width - x < block_pixels ? job.extent.width - x
                                                                                        : block_pixels);
            const void* const a = job.a.get(x, y, count, first);
            const void* value = job.b.get(x, y, count, second);
            uint8_t* const to = job.dst.at(x, y);
            if (job.apply) {
                job.apply(a, value, count, job.store ? result.bytes : to);
                value = result.bytes;
            }
            if (job.store) job.store(value, count, job.limits, to, job.dst.x_stride);
        }
}

/// dst = a op b on adjacent pixels. A y stride of 0 is that of a single value.
void run_direct(direct_function loop, plane a, plane b, const plane& dst, range limits, size extent,
                bool in_one_row)
{
    const int64_t rows = in_one_row ? 1 : extent.height;
    const int64_t count = in_one_row ? int64_t{extent.width} * extent.height : extent.width;
    for (int64_t y = 0; y < rows; ++y) loop(a.at(0, y), b.at(0, y), dst.at(0, y), count, limits);
}

/// The direct loop for an integer and a Float 32 image, if there is one. The output has the type of the integer one.
direct_function mixed_loop(const arithmetic_table& table, operation op, rounding mode, const plane& a,
                           const plane& b, const plane& dst)
{
    if (!a.adjacent() || !b.adjacent() || !dst.adjacent()) return nullptr;
    if (dst.type == a.type && b.type == storage::f32)
        return table.mixed[index(op)][index(mixed_form::real_right)][index(a.type)][index(mode)];
    if (dst.type == b.type && a.type == storage::f32)
        return table.mixed[index(op)][index(mixed_form::real_left)][index(b.type)][index(mode)];
    return nullptr;
}

void copy_rows(const plane& src, const plane& dst, size extent, bool in_one_row)
{
    const int64_t rows = in_one_row ? 1 : extent.height;
    const auto bytes = static_cast<size_t>(src.x_stride * extent.width * (in_one_row ? extent.height : 1));
    for (int64_t y = 0; y < rows; ++y) std::memmove(dst.at(0, y), src.at(0, y), bytes);
}

/// Colour: each colour byte with the other operand as a byte. `colour_first` says which operand is first.
outcome combine_colour(operator_choice chosen, const image& colour, const image& other, const image& dst,
                       bool colour_first)
{
    const storage real = storage_of(other.layout);
    if (!is_float(real)) return outcome::unsupported;
    const size extent{colour.layout.width, colour.layout.height};
    if (extent.width <= 0 || extent.height <= 0) return outcome::done;
    const arithmetic_table& table = arithmetic_level();
    if (!colour_first) chosen.reversed = !chosen.reversed;

    const source value{plane_of(other, real), table.load_byte[real == storage::f64 ? 1 : 0]};
    plane bytes = plane_of(colour, storage::u8);
    plane out = plane_of(dst, storage::u8);
    const load_function load_colour = table.load[index(computing::u32)][index(storage::u8)];
    for (int channel = 0; channel < 3; ++channel, ++bytes.first, ++out.first) {
        source a{bytes, load_colour};
        source b = value;
        if (chosen.reversed) std::swap(a, b);
        if (chosen.assigns) a.load = nullptr;
        block first, second;
        run_blocks({a,
                    b,
                    chosen.assigns ? nullptr : table.apply[index(chosen.op)][index(computing::u32)],
                    table.store[index(computing::u32)][index(storage::u8)][index(rounding::wrap)],
                    out,
                    {},
                    extent},
                   first, second);
    }
    return outcome::done;
}

/// The computing type of a complex destination; its second operand may also be Float.
bool complex_computing(storage dst, storage other, computing* c)
{
    *c = dst == storage::c32 ? computing::c32 : computing::c64;
    return is_complex(other) || is_float(other);
}

} // namespace

storage storage_of(const image_layout& l) noexcept
{
    storage s = storage::none;
    switch (l.encoding) {
    case PixmatEncoding_Unsigned:
        if (l.bits >= 1 && l.bits <= 32)
            s = l.bits <= 8 ? storage::u8 : l.bits <= 16 ? storage::u16 : storage::u32;
        break;
    case PixmatEncoding_Signed:
        if (l.bits >= 1 && l.bits <= 32)
            s = l.bits <= 8 ? storage::i8 : l.bits <= 16 ? storage::i16 : storage::i32;
        break;
    case PixmatEncoding_Float:
        s = l.bits == 32 ? storage::f32 : l.bits == 64 ? storage::f64 : storage::none;
        break;
    case PixmatEncoding_Complex_Float:
    case PixmatEncoding_Complex_Float_Half_Even:
    case PixmatEncoding_Complex_Float_Half_Odd:
        s = l.bits == 64 ? storage::c32 : l.bits == 128 ? storage::c64 : storage::none;
        break;
    default: break;
    }
    // A depth of 17 to 24 bits is packed in three bytes; nothing here writes into the neighbour.
    const int64_t distance = l.x_stride < 0 ? -int64_t{l.x_stride} : l.x_stride;
    const bool overlaps = (l.bits + 7) / 8 < bytes_of(s) && distance < bytes_of(s);
    return overlaps ? storage::none : s;
}

outcome combine(method m, int32_t given_rounding, const image& a, const image& b, const image& dst) noexcept
{
    if (a.layout.width != dst.layout.width || a.layout.height != dst.layout.height)
        return outcome::other_size;
    const bool follows_a = same_type(a.layout, dst.layout);
    if (!follows_a && !same_type(b.layout, dst.layout)) return outcome::no_type_fits;

    const operator_choice chosen = choose(m);
    rounding mode;
    const bool known = read_rounding(given_rounding, &mode);
    const image& other = follows_a ? b : a;
    if (is_colour(dst.layout)) {
        if (!is_float(storage_of(other.layout))) return outcome::unsupported;
        if (!known) return outcome::unknown_rounding;
        return combine_colour(chosen, follows_a ? a : b, other, dst, follows_a);
    }

    const storage to = storage_of(dst.layout);
    const storage from = storage_of(other.layout);
    if (to == storage::none || from == storage::none) return outcome::unsupported;
    computing c;
    if (is_complex(to)) {
        if (!complex_computing(to, from, &c)) return outcome::unsupported;
    } else {
        if (is_complex(from)) return outcome::unsupported;
        c = computing_of(to, from);
    }
    const arithmetic_table& table = arithmetic_level();
    const apply_function apply = chosen.assigns ? nullptr : table.apply[index(chosen.op)][index(c)];
    if (!chosen.assigns && !apply) return outcome::unsupported;
    if (!known) return outcome::unknown_rounding;
    if (chosen.op == operation::min || chosen.op == operation::max || chosen.assigns) mode = rounding::wrap;

    const size extent{a.layout.width, a.layout.height};
    if (extent.width <= 0 || extent.height <= 0) return outcome::done;
    plane first = plane_of(a, storage_of(a.layout));
    plane second = plane_of(b, storage_of(b.layout));
    const plane out = plane_of(dst, to);
    const range limits = range_of(dst.layout);
    if (chosen.reversed) std::swap(first, second);

    const direct_function direct =
        table.direct[index(chosen.op)][index(form::images)][index(to)][index(mode)];
    if (first.type == to && second.type == to && first.adjacent() && second.adjacent() && out.adjacent() &&
        (chosen.assigns || direct)) {
        const bool in_one_row = is_packed(out, extent) && is_packed(second, extent) &&
                                (chosen.assigns || is_packed(first, extent));
        if (chosen.assigns)
            copy_rows(second, out, extent, in_one_row);
        else
            run_direct(direct, first, second, out, limits, extent, in_one_row);
        return outcome::done;
    }
    const bool commutes = chosen.op == operation::add || chosen.op == operation::multiply;
    if (commutes && !chosen.assigns && is_float(first.type) && !is_float(to))
        std::swap(first, second); // the form that is there
    const direct_function mixed = mixed_loop(table, chosen.op, mode, first, second, out);
    if (mixed && !chosen.assigns) {
        const bool in_one_row =
            is_packed(out, extent) && is_packed(first, extent) && is_packed(second, extent);
        run_direct(mixed, first, second, out, limits, extent, in_one_row);
        return outcome::done;
    }
    block x, y;
    run_blocks({chosen.assigns ? source{} : source_of(first, c, table), source_of(second, c, table), apply,
                store_of(out, c, apply, mode, table), out, limits, extent},
               x, y);
    return outcome::done;
}

outcome check_number_form(const image& a, const image& dst) noexcept
{
    if (a.layout.width > dst.layout.width || a.layout.height > dst.layout.height) return outcome::too_small;
    const storage from = storage_of(a.layout);
    const storage to = storage_of(dst.layout);
    if (from == storage::none || to == storage::none) return outcome::unsupported;
    if (same_type(a.layout, dst.layout)) return outcome::done;
    const bool changes_type = is_unsigned(from) || is_float(from);
    return changes_type && !is_complex(to) ? outcome::done : outcome::unsupported;
}

namespace {

/// The number as one value of a storage type, for direct loops: only if every computation with it gives the bits
/// that the number's own type would give.
bool as_pixel(const number& b, storage type, operation op, rounding mode, void* value)
{
    const auto put = [&]<class T>(T v) {
        std::memcpy(value, &v, sizeof v);
        return true;
    };
    if (type == storage::f64) return put(b.real);
    if (type == storage::f32) {
        if (b.type != storage::f64) return put(static_cast<float>(b.real));
        // Rounded once to double and once to float is rounded once, for the four operations; but a product or
        // quotient that vanishes keeps its sign only in float, where the limits of Saturate see it.
        const bool exact = static_cast<double>(static_cast<float>(b.real)) == b.real;
        const bool linear = op != operation::multiply && op != operation::divide;
        return exact && (linear || mode == rounding::wrap) && put(static_cast<float>(b.real));
    }
    if (is_float(b.type)) return false;
    const auto whole = static_cast<int64_t>(b.real);
    const auto fits = [&]<class T>(T v) {
        const bool same_rules = !is_unsigned(b.type) || is_unsigned(type);
        const bool low_bits_only =
            mode == rounding::wrap && op != operation::divide && op != operation::min && op != operation::max;
        return ((static_cast<int64_t>(v) == whole && same_rules) || low_bits_only) && put(v);
    };
    switch (type) {
    case storage::u8: return fits(static_cast<uint8_t>(whole));
    case storage::u16: return fits(static_cast<uint16_t>(whole));
    case storage::u32: return fits(static_cast<uint32_t>(whole));
    case storage::i8: return fits(static_cast<int8_t>(whole));
    case storage::i16: return fits(static_cast<int16_t>(whole));
    case storage::i32: return fits(static_cast<int32_t>(whole));
    default: return false;
    }
}

/// A packed image, or one of its rows, at a time.
template <class Loop>
void for_each_run(const plane& src, const plane& dst, size extent, Loop loop)
{
    const bool in_one_row = is_packed(dst, extent) && is_packed(src, extent);
    const int64_t rows = in_one_row ? 1 : extent.height;
    const int64_t count = in_one_row ? int64_t{extent.width} * extent.height : extent.width;
    for (int64_t y = 0; y < rows; ++y) loop(src.at(0, y), dst.at(0, y), count);
}

/// Narrow integers with a number, in their own width; false if they can not.
bool combine_narrow(operator_choice chosen, rounding mode, const plane& src, const number& b,
                    const plane& dst, range limits, size extent, const arithmetic_table& table)
{
    const auto plus = table.plus_number[index(dst.type)];
    const auto times = table.times_number[index(dst.type)];
    if (!plus) return false;
    if (chosen.op == operation::add || chosen.op == operation::subtract) {
        narrow_sum sum;
        if (!is_float(b.type) || !plan_sum(chosen.op, chosen.reversed, b, dst.type, mode, limits, &sum))
            return false;
        for_each_run(src, dst, extent, [&](auto from, auto to, int64_t n) { plus(from, to, n, sum); });
        return true;
    }
    const bool divides = chosen.op == operation::divide && !chosen.reversed;
    alignas(16) uint8_t value[16];
    if (b.type == storage::f64 ? chosen.op != operation::multiply && !divides
                               : !divides || !as_pixel(b, dst.type, chosen.op, mode, value))
        return false;
    narrow_product product;
    if (!plan_product(chosen.op, b, dst.type, mode, limits, &product)) return false;
    for_each_run(src, dst, extent, [&](auto from, auto to, int64_t n) { times(from, to, n, product); });
    return true;
}

/// The number throughout a block, in the computing type.
void fill_block(const number& b, computing c, block& to)
{
    const auto fill = [&]<class W>(W value, int32_t first = 0) {
        for (int32_t i = first; i < first + block_pixels; ++i)
            std::memcpy(to.bytes + static_cast<size_t>(i) * sizeof value, &value, sizeof value);
    };
    switch (c) {
    case computing::u32:
    case computing::i32: fill(static_cast<uint32_t>(static_cast<int64_t>(b.real))); break;
    case computing::f32: fill(static_cast<float>(b.real)); break;
    case computing::f64: fill(b.real); break;
    case computing::c32:
        fill(static_cast<float>(b.real));
        fill(static_cast<float>(b.imaginary), block_pixels);
        break;
    case computing::c64:
        fill(b.real);
        fill(b.imaginary, block_pixels);
        break;
    }
}

} // namespace

outcome combine(method m, int32_t given_rounding, const image& a, const number& b, const image& dst) noexcept
{
    const storage from = storage_of(a.layout);
    const storage to = storage_of(dst.layout);
    computing c = to == storage::c32 ? computing::c32 : computing::c64;
    if (!is_complex(to)) c = computing_of(from, b.type);

    const operator_choice chosen = choose(m);
    const arithmetic_table& table = arithmetic_level();
    const apply_function apply = chosen.assigns ? nullptr : table.apply[index(chosen.op)][index(c)];
    rounding mode;
    if (!chosen.assigns && !apply) return outcome::unsupported;
    if (!read_rounding(given_rounding, &mode)) return outcome::unknown_rounding;
    if (chosen.op == operation::min || chosen.op == operation::max || chosen.assigns) mode = rounding::wrap;

    const size extent{a.layout.width, a.layout.height};
    if (extent.width <= 0 || extent.height <= 0) return outcome::done;
    const plane image_pixels = plane_of(a, from);
    const plane out = plane_of(dst, to);
    const range limits = range_of(dst.layout);

    if (!chosen.assigns && from == to && !is_complex(to) && image_pixels.adjacent() && out.adjacent()) {
        if (combine_narrow(chosen, mode, image_pixels, b, out, limits, extent, table)) return outcome::done;
        alignas(16) uint8_t value[16];
        direct_function loop = nullptr;
        if (as_pixel(b, to, chosen.op, mode, value)) {
            const form f = chosen.reversed ? form::value_left : form::value_right;
            loop = table.direct[index(chosen.op)][index(f)][index(to)][index(mode)];
        } else if (b.type == storage::f64) {
            const mixed_form f = chosen.reversed ? mixed_form::number_left : mixed_form::number_right;
            loop = table.mixed[index(chosen.op)][index(f)][index(to)][index(mode)];
            std::memcpy(value, &b.real, sizeof b.real);
        }
        if (loop) {
            for_each_run(image_pixels, out, extent, [&](auto from_row, auto to_row, int64_t n) {
                loop(chosen.reversed ? value : from_row, chosen.reversed ? from_row : value, to_row, n,
                     limits);
            });
            return outcome::done;
        }
    }
    block x, y;
    fill_block(b, c, chosen.reversed ? x : y);
    if (chosen.assigns && out.adjacent()) {
        table.store[index(c)][index(to)][index(mode)](y.bytes, block_pixels, limits, x.bytes, out.x_stride);
        const pixel_fill fill(x.bytes, to);
        const bool in_one_row = is_packed(out, extent);
        const int64_t row = out.x_stride * extent.width;
        for (int64_t i = 0; i < (in_one_row ? 1 : extent.height); ++i)
            fill(out.at(0, i), in_one_row ? row * extent.height : row);
        return outcome::done;
    }
    const source pixels = chosen.assigns ? source{} : source_of(image_pixels, c, table);
    run_blocks({chosen.reversed ? source{} : pixels, chosen.reversed ? pixels : source{}, apply,
                store_of(out, c, apply, mode, table), out, limits, extent},
               x, y);
    return outcome::done;
}

} // namespace Qor::Luxar::ZELT::Arithmetic
