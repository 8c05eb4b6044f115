#include "arithmetic/kernels/modulate.h"

#include "arithmetic/kernels/blend.h"
#include "arithmetic/kernels/functions_levels.h"
#include "arithmetic/kernels/real_blocks.h"

#include <cstddef>

namespace Qor::Luxar::ZELT::Arithmetic {
namespace {

constexpr int byte_values = 256;

/// Each value to a power, with the same bits on every processor.
void raise(double* values, int32_t count, double exponent)
{
    auto* const bytes = reinterpret_cast<uint8_t*>(values);
    functions_level().power[1](bytes, bytes, count, exponent);
}

/// From mask pixels, given as numbers, to what colours are multiplied with.
void to_factors(double* values, int32_t count, mask_range range, double weight)
{
    for (int32_t i = 0; i < count; ++i) values[i] = (values[i] - range.lowest) * range.reciprocal;
    raise(values, count, weight);
}

/// Truncated, low bits kept; 0 for NaN and beyond 64 bits.
uint8_t low_byte(double v)
{
    const bool inside = v >= -0x1p63 && v < 0x1p63;
    return static_cast<uint8_t>(static_cast<int64_t>(inside ? v : 0.0));
}

struct job {
    plane colours, mask, dst;
    size extent;
    mask_range range;
    double weight;
    double shades[byte_values]; ///< of a colour byte, before the mask
};

/// set(from, factor, to) for each pixel, with from and to at its first byte.
template <class Factor, class Set>
void shade_row(const job& j, int64_t x, int64_t y, int32_t count, const Factor* factors, Set set)
{
    const uint8_t* from = j.colours.at(x, y);
    uint8_t* to = j.dst.at(x, y);
    const int64_t step_from = j.colours.x_stride, step_to = j.dst.x_stride;
    for (int32_t i = 0; i < count; ++i, from += step_from, to += step_to) set(from, factors[i], to);
}

void shade_by_factors(const job& j, int64_t x, int64_t y, int32_t count, const double* factors)
{
    const double* const shades = j.shades;
    shade_row(j, x, y, count, factors, [shades](const uint8_t* from, double factor, uint8_t* to) {
        const uint8_t bytes[] = {low_byte(shades[from[0]] * factor), low_byte(shades[from[1]] * factor),
                                 low_byte(shades[from[2]] * factor)};
        to[0] = bytes[0], to[1] = bytes[1], to[2] = bytes[2];
    });
}

/// A factor for each value that a mask of one or two bytes has, and where to look for that of a pixel.
class factor_table {
public:
    factor_table(storage mask, mask_range range, double weight)
        : first_(range.lowest), factors_(size_t{1} << (8 * bytes_of(mask)))
    {
        for (size_t i = 0; i < factors_.size(); ++i) factors_[i] = static_cast<double>(i) + first_;
        to_factors(factors_.data(), static_cast<int32_t>(factors_.size()), range, weight);
    }

    double operator[](size_t i) const { return factors_[i]; }

    /// Replaces mask pixels by their factors.
    void look_up(double* values, int32_t count) const
    {
        for (int32_t i = 0; i < count; ++i) values[i] = factors_[static_cast<size_t>(values[i] - first_)];
    }

private:
    double first_;
    std::vector<double> factors_;
};

/// All there is for a mask of one byte: the colour byte for each mask value and colour byte.
std::vector<uint8_t> all_bytes(const job& j, const factor_table& factors)
{
    static_assert(byte_values == block_pixels);
    std::vector<uint8_t> bytes(size_t{byte_values} * byte_values);
    const arithmetic_table& table = arithmetic_level();
    const plane rows{bytes.data(), 1, byte_values, storage::u8};
    for (int64_t value = 0; value < byte_values; ++value) {
        real_block shaded;
        const double factor = factors[static_cast<size_t>(value)];
        for (int c = 0; c < byte_values; ++c) shaded.values[c] = j.shades[c] * factor;
        store_reals(table, shaded.values, byte_values, rows, 0, value);
    }
    return bytes;
}

void shade_by_bytes(const job& j, const std::vector<uint8_t>& table)
{
    const uint8_t sign = j.mask.type == storage::i8 ? 0x80 : 0; // the lowest value comes first
    const uint8_t* const bytes = table.data();
    for_each_block(j.extent, [&](int64_t x, int64_t y, int32_t count) {
        uint8_t values[block_pixels];
        const uint8_t* const mask = j.mask.at(x, y);
        for (int32_t i = 0; i < count; ++i)
            values[i] = static_cast<uint8_t>(mask[i * j.mask.x_stride] ^ sign);
        shade_row(j, x, y, count, values, [bytes](const uint8_t* from, uint8_t value, uint8_t* to) {
            const uint8_t* const row = bytes + value * size_t{byte_values};
            const uint8_t b[] = {row[from[0]], row[from[1]], row[from[2]]};
            to[0] = b[0], to[1] = b[1], to[2] = b[2];
        });
    });
}

} // namespace

bool has_colour_bytes(const image_layout& l) noexcept
{
    const bool colour = l.encoding == PixmatEncoding_RGB || l.encoding == PixmatEncoding_RGBA ||
                        l.encoding == PixmatEncoding_BGR;
    return colour && (l.bits == 24 || l.bits == 32);
}

outcome modulate(const image& colours, const image& mask, double weight, const image& dst)
{
    const storage type = real_storage_of(mask.layout);
    if (!has_colour_bytes(colours.layout) || type == storage::none) return outcome::unsupported;
    const size extent = extent_of(dst);
    if (extent.width <= 0 || extent.height <= 0) return outcome::done;

    const int64_t colour_bytes = colours.layout.bits / 8;
    const stable_operand stable(colours, colour_bytes, dst, colour_bytes);
    const stable_operand stable_mask(mask, bytes_of(type), dst, colour_bytes, false);
    job j{plane_of(stable.pixels(), storage::u8),
          plane_of(stable_mask.pixels(), type),
          plane_of(dst, storage::u8),
          extent,
          mask_range_of(type),
          weight,
          {}};
    for (int c = 0; c < byte_values; ++c) j.shades[c] = c / 255.0;
    raise(j.shades, byte_values, 1.0 - weight);
    for (double& shade : j.shades) shade *= 255.0;

    // A table costs as much as so many pixels.
    const int64_t pixels = int64_t{extent.width} * extent.height;
    const bool narrow = bytes_of(type) <= 2 && type != storage::none;
    if (bytes_of(type) == 1 && pixels >= 16384) {
        shade_by_bytes(j, all_bytes(j, factor_table(type, j.range, weight)));
        return outcome::done;
    }
    const bool by_table = narrow && pixels > (int64_t{1} << (8 * bytes_of(type)));
    const factor_table factors(by_table ? type : storage::u8, j.range, weight);
    const arithmetic_table& table = arithmetic_level();
    for_each_block(extent, [&](int64_t x, int64_t y, int32_t count) {
        real_block values;
        load_reals(table, j.mask, x, y, count, values.values);
        if (by_table)
            factors.look_up(values.values, count);
        else
            to_factors(values.values, count, j.range, weight);
        shade_by_factors(j, x, y, count, values.values);
    });
    return outcome::done;
}

} // namespace Qor::Luxar::ZELT::Arithmetic
