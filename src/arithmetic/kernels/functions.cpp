#include "arithmetic/kernels/functions.h"

#include "arithmetic/kernels/arithmetic_levels.h"
#include "arithmetic/kernels/functions_levels.h"

#include <cmath>

namespace Qor::Luxar::ZELT::Arithmetic {
namespace {

void require(bool holds, const char* text)
{
    if (!holds) throw std::invalid_argument(text);
}

bool same_size(const memory_2d& a, const memory_2d& b) { return a.width == b.width && a.height == b.height; }

/// The storage of the eight real types; none for any other.
storage storage_of(pixel_type type)
{
    switch (type) {
    case pixel_type::unsigned_8: return storage::u8;
    case pixel_type::unsigned_16: return storage::u16;
    case pixel_type::unsigned_32: return storage::u32;
    case pixel_type::signed_8: return storage::i8;
    case pixel_type::signed_16: return storage::i16;
    case pixel_type::signed_32: return storage::i32;
    case pixel_type::float_32: return storage::f32;
    case pixel_type::float_64: return storage::f64;
    default: return storage::none;
    }
}

struct alignas(64) block {
    uint8_t bytes[block_pixels * sizeof(double)];
};

/// Pixels as a loop wants them: where they lie, when they are adjacent and of the computing type, else in a block.
template <class Computing>
class pixels {
public:
    explicit pixels(const memory_2d& m)
        : first_(m.data + m.offset), x_stride_(m.x_stride), y_stride_(m.y_stride), width_(m.width)
    {
        constexpr bool wide = sizeof(Computing) == sizeof(double);
        constexpr computing to = wide ? computing::f64 : computing::f32;
        constexpr storage own = wide ? storage::f64 : storage::f32;
        const storage stored = storage_of(m.type);
        if (stored == own && m.x_stride == static_cast<int64_t>(sizeof(Computing))) return;
        const auto& loops = arithmetic_level();
        load_ = loops.load[static_cast<int>(to)][static_cast<int>(stored)];
        store_ = loops.store[static_cast<int>(to)][static_cast<int>(own)][static_cast<int>(rounding::wrap)];
    }

    bool direct() const { return !load_; }
    /// Rows follow each other without a gap.
    bool in_one_row() const { return direct() && y_stride_ == x_stride_ * width_; }
    uint8_t* at(int64_t x, int64_t y) const { return first_ + y * y_stride_ + x * x_stride_; }

    const uint8_t* get(int64_t x, int64_t y, int32_t count, block& b) const
    {
        if (direct()) return at(x, y);
        load_(at(x, y), x_stride_, count, b.bytes);
        return b.bytes;
    }
    uint8_t* target(int64_t x, int64_t y, block& b) const { return direct() ? at(x, y) : b.bytes; }
    void put(int64_t x, int64_t y, int32_t count, const block& b) const
    {
        if (!direct()) store_(b.bytes, count, {0, 1}, at(x, y), x_stride_);
    }

private:
    uint8_t* first_;
    int64_t x_stride_, y_stride_;
    int32_t width_;
    load_function load_ = nullptr;
    store_function store_ = nullptr;
};

/// loop(from..., to, count) for all pixels: on whole rows, or all at once, where they lie ready, else in blocks.
template <class Computing, class Loop, class... Source>
void for_pixels(Loop loop, const memory_2d& dst, const Source&... sources)
{
    const pixels<Computing> out(dst);
    const auto walk = [&](const auto&... in) {
        if ((out.direct() && ... && in.direct())) {
            const bool one_row = (out.in_one_row() && ... && in.in_one_row());
            const int64_t rows = one_row ? 1 : dst.height;
            const int64_t count = one_row ? int64_t{dst.width} * dst.height : dst.width;
            for (int64_t y = 0; y < rows; ++y) loop(in.at(0, y)..., out.at(0, y), count);
            return;
        }
        block taken[sizeof...(in)], result;
        for (int64_t y = 0; y < dst.height; ++y)
            for (int64_t x = 0; x < dst.width; x += block_pixels) {
                const auto count =
                    static_cast<int32_t>(dst.width - x < block_pixels ? dst.width - x : block_pixels);
                int place = 0;
                const uint8_t* const from[] = {in.get(x, y, count, taken[place++])...};
                if constexpr (sizeof...(in) == 2)
                    loop(from[0], from[1], out.target(x, y, result), count);
                else
                    loop(from[0], out.target(x, y, result), count);
                out.put(x, y, count, result);
            }
    };
    walk(pixels<Computing>(sources)...);
}

map_function loop_of(angle_function f)
{
    const functions_table& loops = functions_level();
    switch (f) {
    case angle_function::sine: return loops.sine;
    case angle_function::cosine: return loops.cosine;
    case angle_function::tangent: return loops.tangent;
    case angle_function::arc_sine: return loops.arc_sine;
    case angle_function::arc_cosine: return loops.arc_cosine;
    case angle_function::arc_tangent: break;
    }
    return loops.arc_tangent;
}

/// One of a pair of loops for Float 32 and 64.
void map_in_own_type(const map_function (&loops)[2], const memory_2d& src, const memory_2d& dst)
{
    if (src.type == pixel_type::float_32)
        for_pixels<float>(loops[0], dst, src);
    else
        for_pixels<double>(loops[1], dst, src);
}

} // namespace

void map(angle_function f, const memory_2d& src, const memory_2d& dst)
{
    require(same_size(src, dst), "ZELT::Math images must have the same size");
    require(dst.type == pixel_type::float_32, "Math result image must be float");
    require(storage_of(src.type) != storage::none, "ZELT::Math: unsupported pixel type");
    for_pixels<float>(loop_of(f), dst, src);
}

void arc_tangent_2(const memory_2d& y, const memory_2d& x, const memory_2d& dst)
{
    require(y.type == x.type, "ZELT::Math images must have the same pixel type");
    require(same_size(y, x) && same_size(y, dst), "ZELT::Math images must have the same size");
    require(dst.type == pixel_type::float_32, "ZELT::Math result image must be float");
    require(storage_of(y.type) != storage::none, "ZELT::Math: unsupported pixel type");
    for_pixels<float>(functions_level().arc_tangent_2, dst, y, x);
}

void exponential(const memory_2d& src, const memory_2d& dst)
{
    map_in_own_type(functions_level().exponential, src, dst);
}

void logarithm(const memory_2d& src, const memory_2d& dst)
{
    map_in_own_type(functions_level().logarithm, src, dst);
}

void power(const memory_2d& src, double exponent, const memory_2d& dst)
{
    require(src.type == dst.type, "Power: src and dst pixel types must be identical");
    require(src.type == pixel_type::float_32 || src.type == pixel_type::float_64,
            "Power: unsupported pixel type");
    require(same_size(src, dst), "Power: src and dst must have the same size");
    const auto& loops = functions_level().power;
    if (src.type == pixel_type::float_32) {
        const auto narrowed = static_cast<double>(static_cast<float>(exponent));
        for_pixels<float>(
            [=](const uint8_t* from, uint8_t* to, int64_t count) { loops[0](from, to, count, narrowed); },
            dst, src);
    } else {
        for_pixels<double>(
            [=](const uint8_t* from, uint8_t* to, int64_t count) { loops[1](from, to, count, exponent); },
            dst, src);
    }
}

} // namespace Qor::Luxar::ZELT::Arithmetic
