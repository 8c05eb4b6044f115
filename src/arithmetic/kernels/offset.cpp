#include "arithmetic/kernels/offset.h"

#include "arithmetic/kernels/compositing_levels.h"
#include "arithmetic/kernels/real_blocks.h"

#include <algorithm>
#include <cmath>

namespace Qor::Luxar::ZELT::Arithmetic {
namespace {

constexpr int32_t wrap = 2; // the rounding mode

/// Left to right or top to bottom, as far as two images lie on each other.
struct overlap {
    int64_t first;
    int64_t end;

    bool empty() const { return first >= end; }
};

overlap overlap_of(int64_t a_length, int64_t b_length, int64_t position)
{
    return {std::max<int64_t>(position, 0), std::min(a_length, position + b_length)};
}

rectangle make_rectangle(int64_t left, int64_t top, int64_t right, int64_t bottom)
{
    return {static_cast<int32_t>(left), static_cast<int32_t>(top), static_cast<int32_t>(right),
            static_cast<int32_t>(bottom)};
}

/// Weights that leave narrow integers in 32 bits. Not for NaN.
bool stays_narrow(sum_weights w) { return (std::fabs(w.fa) + std::fabs(w.fb * w.ratio)) * 65536.0 < 0x1p31; }

/// Weights with so few bits that products and sums of pixels of one or two bytes are exact in float: then they are
/// what double gives.
bool exact_in_float(sum_weights w, storage type)
{
    const double fb = w.fb * w.ratio, sum = std::fabs(w.fa) + std::fabs(fb);
    const double highest_bit = std::ldexp(1.0, static_cast<int>(24 - 8 * bytes_of(type)));
    if (!(sum > 0 && sum <= highest_bit)) return false;
    const double unit =
        std::ldexp(1.0, std::ilogb(highest_bit / sum)); // all values are multiples of 1 / unit
    return w.fa * unit == std::floor(w.fa * unit) && fb * unit == std::floor(fb * unit);
}

/// The loop for adjacent pixels of one storage, or null where these weights need a block by block look.
sum_function direct_sum(const compositing_table& loops, storage type, sum_weights w)
{
    if (is_float(type)) return loops.sum[static_cast<int>(type)];
    if (bytes_of(type) > 2) return nullptr;
    if (exact_in_float(w, type)) return loops.float_sum[narrow_index(type)];
    return stays_narrow(w) ? loops.sum[static_cast<int>(type)] : nullptr;
}

/// dst = fa * a + fb * (ratio * b) on images of one size.
void add_weighted(const image& a, const image& b, const image& dst, sum_weights w)
{
    const storage from = real_storage_of(a.layout), other = real_storage_of(b.layout);
    // Whole sums and differences are exact in double, so that their low bits are those of the operators; those of
    // Float are rounded once, with or without double between.
    if (from == other && w.fa == 1 && w.ratio == 1 && (w.fb == 1 || w.fb == -1)) {
        image first = a, second = b, out = dst;
        second.layout.bits = out.layout.bits = a.layout.bits;
        second.layout.encoding = out.layout.encoding = a.layout.encoding;
        combine(w.fb == 1 ? method::add : method::subtract, wrap, first, second, out);
        return;
    }
    const compositing_table& loops = compositing_level();
    const plane p = plane_of(a, from), q = plane_of(b, other), to = plane_of(dst, from);
    const size extent = extent_of(dst);
    const sum_function direct = direct_sum(loops, from, w);
    if (direct && from == other && p.adjacent() && q.adjacent() && to.adjacent()) {
        for (int64_t y = 0; y < extent.height; ++y)
            direct(p.at(0, y), q.at(0, y), to.at(0, y), extent.width, w);
        return;
    }
    const arithmetic_table& table = arithmetic_level();
    for_each_block(extent, [&](int64_t x, int64_t y, int32_t count) {
        real_block first, second;
        load_reals(table, p, x, y, count, first.values);
        load_reals(table, q, x, y, count, second.values);
        loops.sum_blocks(first.values, second.values, count, w, first.values);
        store_reals(table, first.values, count, to, x, y);
    });
}

/// dst = fa * a inside a rectangle.
void scale_part(const image& a, const image& dst, const rectangle& r, double fa)
{
    const image from = part_of(a, r), to = part_of(dst, r);
    if (fa != 1)
        combine(method::multiply, wrap, from, number{storage::f64, fa, 0}, to);
    else if (from.data != to.data)
        combine(method::assign, wrap, to, from, to);
}

/// The range of pixels of an integer image with its nominal bits.
double range_of(const image_layout& l) { return std::ldexp(1.0, l.bits); }

bool is_whole(storage s) { return !is_float(s) && !is_complex(s) && s != storage::none; }

/// Where an image between pixels begins, as whole pixels and what is left.
struct split {
    int64_t whole;
    double rest;
};

split split_position(double position)
{
    const double whole = std::floor(position);
    const double rest = position - whole;
    const auto number = static_cast<int64_t>(whole);
    return rest < 1 ? split{number, rest} : split{number + 1, 0}; // just below a whole number, rounded to it
}

/// Rows for the interpolation, as numbers with `reach` of them to a pixel.
struct number_rows {
    plane numbers;
    int64_t width;
    int64_t height;
};

/// Left of, above and below an image lie zeros that change no sum, not even its sign.
constexpr double nothing = -0.0;

/// Numbers of a row as doubles, from `first` on, which may lie outside.
void load_row(const arithmetic_table& table, const number_rows& rows, int64_t first, int64_t y, int32_t count,
              double* to)
{
    const bool inside = y >= 0 && y < rows.height;
    const int64_t begin = inside ? std::clamp<int64_t>(-first, 0, count) : count;
    const int64_t end = inside ? std::clamp<int64_t>(rows.width - first, begin, count) : count;
    std::fill(to, to + begin, nothing);
    if (end > begin)
        load_reals(table, rows.numbers, first + begin, y, static_cast<int32_t>(end - begin), to + begin);
    std::fill(to + end, to + count, nothing);
}

struct offset_job {
    number_rows a, b;
    int64_t reach; ///< numbers from a pixel to its neighbour
    split x, y;    ///< x counts numbers
    double fa, fb;
};

/// Neighbours without weight are not looked at.
void interpolate(const offset_job& job)
{
    const overlap columns =
        overlap_of(job.a.width, job.b.width + (job.x.rest > 0 ? job.reach : 0), job.x.whole);
    const overlap lines = overlap_of(job.a.height, job.b.height + (job.y.rest > 0 ? 1 : 0), job.y.whole);
    if (columns.empty() || lines.empty()) return;

    const double fx = job.x.rest, fy = job.y.rest;
    const bilinear_weights weights{
        (1 - fx) * (1 - fy), fx * (1 - fy), (1 - fx) * fy, fx * fy, job.fa, job.fb};
    const arithmetic_table& table = arithmetic_level();
    const compositing_table& loops = compositing_level();
    constexpr int64_t widest_reach = 3;
    alignas(64) double here[block_pixels + widest_reach], above[block_pixels + widest_reach];
    real_block target, zeros;
    std::fill(std::begin(zeros.values), std::end(zeros.values), nothing);

    for (int64_t y = lines.first; y < lines.end; ++y)
        for (int64_t x = columns.first; x < columns.end; x += block_pixels) {
            const auto count = static_cast<int32_t>(std::min<int64_t>(block_pixels, columns.end - x));
            const auto wide = static_cast<int32_t>(count + job.reach);
            const int64_t u = x - job.x.whole - job.reach, v = y - job.y.whole;
            bilinear_operands operands{target.values, here + job.reach, zeros.values, zeros.values,
                                       zeros.values};
            load_row(table, job.b, u, v, wide, here);
            if (fx > 0) operands.b10 = here;
            if (fy > 0) {
                load_row(table, job.b, u, v - 1, wide, above);
                operands.b01 = above + job.reach;
                if (fx > 0) operands.b11 = above;
            }
            load_reals(table, job.a.numbers, x, y, count, target.values);
            loops.bilinear_blocks(operands, count, weights, target.values);
            store_reals(table, target.values, count, job.a.numbers, x, y);
        }
}

bool is_colour_24(const image_layout& l)
{
    return (l.encoding == PixmatEncoding_RGB || l.encoding == PixmatEncoding_BGR) && l.bits == 24;
}

number_rows rows_of(const image& i, storage type)
{
    return {plane_of(i, type), i.layout.width, i.layout.height};
}

/// Each colour byte on its own; those of adjacent pixels as one long row.
void interpolate_colour(const image& a, const image& b, split x, split y, double fa, double fb)
{
    offset_job job{rows_of(a, storage::u8), rows_of(b, storage::u8), 1, x, y, fa, fb};
    if (a.layout.x_stride == 3 && b.layout.x_stride == 3) {
        for (number_rows* rows : {&job.a, &job.b}) {
            rows->numbers.x_stride = 1;
            rows->width *= 3;
        }
        job.reach = 3;
        job.x.whole *= 3;
        return interpolate(job);
    }
    for (int channel = 0; channel < 3; ++channel, ++job.a.numbers.first, ++job.b.numbers.first)
        interpolate(job);
}

} // namespace

bool takes_offset(const image_layout& a, const image_layout& b) noexcept
{
    if (is_colour_24(a)) return is_colour_24(b) && a.encoding == b.encoding;
    return real_storage_of(a) != storage::none && real_storage_of(b) != storage::none;
}

bool reaches(const image_layout& a, const image_layout& b, coordinate<double> position) noexcept
{
    return position.x < a.width && -position.x < b.width && position.y < a.height && -position.y < b.height;
}

void add_offset(const image& a, const image& b, coordinate<double> position, double fa, double fb)
{
    const bool colour = is_colour_24(a.layout);
    const storage to = real_storage_of(a.layout), from = real_storage_of(b.layout);
    const split x = split_position(position.x), y = split_position(position.y);
    const bool between = x.rest > 0 || y.rest > 0;
    const bool in_step = !between && x.whole == 0 && y.whole == 0;
    const stable_operand stable(b, colour ? 3 : bytes_of(from), a, colour ? 3 : bytes_of(to), in_step);
    if (colour) return interpolate_colour(a, stable.pixels(), x, y, fa, fb);
    if (between) return interpolate({rows_of(a, to), rows_of(stable.pixels(), from), 1, x, y, fa, fb});

    const overlap columns = overlap_of(a.layout.width, b.layout.width, x.whole);
    const overlap lines = overlap_of(a.layout.height, b.layout.height, y.whole);
    if (columns.empty() || lines.empty()) return;
    const image target = part_of(a, make_rectangle(columns.first, lines.first, columns.end, lines.end));
    const image source =
        part_of(stable.pixels(), make_rectangle(columns.first - x.whole, lines.first - y.whole,
                                                columns.end - x.whole, lines.end - y.whole));
    add_weighted(target, source, target, {fa, 1, fb});
}

outcome add_integer_offset(const image& a, const image& b, coordinate<int32_t> position, double fa, double fb,
                           const image& dst)
{
    const storage from = real_storage_of(a.layout), other = real_storage_of(b.layout);
    if (from == storage::none || other == storage::none) return outcome::unsupported;
    if (real_storage_of(dst.layout) != from) return outcome::no_type_fits;
    const int64_t width = a.layout.width, height = a.layout.height;
    if (width <= 0 || height <= 0) return outcome::done;

    const bool in_step = position.x == 0 && position.y == 0;
    const stable_operand first(a, bytes_of(from), dst, bytes_of(from));
    const stable_operand second(b, bytes_of(other), dst, bytes_of(from), in_step);
    const overlap columns = overlap_of(width, b.layout.width, position.x);
    const overlap lines = overlap_of(height, b.layout.height, position.y);
    const auto scale = [&](int64_t left, int64_t top, int64_t right, int64_t bottom) {
        if (left < right && top < bottom)
            scale_part(first.pixels(), dst, make_rectangle(left, top, right, bottom), fa);
    };
    if (columns.empty() || lines.empty()) {
        scale(0, 0, width, height);
        return outcome::done;
    }
    scale(0, 0, width, lines.first);
    scale(0, lines.first, columns.first, lines.end);
    scale(columns.end, lines.first, width, lines.end);
    scale(0, lines.end, width, height);
    const rectangle both = make_rectangle(columns.first, lines.first, columns.end, lines.end);
    const rectangle of_b = make_rectangle(columns.first - position.x, lines.first - position.y,
                                          columns.end - position.x, lines.end - position.y);
    const double ratio = is_whole(from) && is_whole(other) ? range_of(a.layout) / range_of(b.layout) : 1;
    add_weighted(part_of(first.pixels(), both), part_of(second.pixels(), of_b), part_of(dst, both),
                 {fa, ratio, fb});
    return outcome::done;
}

} // namespace Qor::Luxar::ZELT::Arithmetic
