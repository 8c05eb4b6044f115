#include "arithmetic/kernels/blend.h"

#include "arithmetic/kernels/compositing_levels.h"
#include "arithmetic/kernels/real_blocks.h"

namespace Qor::Luxar::ZELT::Arithmetic {

mask_range mask_range_of(storage mask) noexcept
{
    switch (mask) {
    case storage::u8: return {0, 1.0 / 255.0};
    case storage::u16: return {0, 1.0 / 65535.0};
    case storage::u32: return {0, 1.0 / 4294967295.0};
    case storage::i8: return {-128.0, 1.0 / 255.0};
    case storage::i16: return {-32768.0, 1.0 / 65535.0};
    case storage::i32: return {-2147483648.0, 1.0 / 4294967295.0};
    default: return {0, 1};
    }
}

outcome blend(const image& base, const image& other, const image& mask, const image& dst)
{
    const storage type = real_storage_of(base.layout);
    for (const image* i : {&base, &other, &mask, &dst})
        if (type == storage::none || real_storage_of(i->layout) != type) return outcome::unsupported;
    const size extent = extent_of(base);
    const int64_t bytes = bytes_of(type);
    const stable_operand stable_base(base, bytes, dst, bytes);
    const stable_operand stable_other(other, bytes, dst, bytes);
    const stable_operand stable_mask(mask, bytes, dst, bytes);
    const plane b = plane_of(stable_base.pixels(), type), o = plane_of(stable_other.pixels(), type);
    const plane m = plane_of(stable_mask.pixels(), type), to = plane_of(dst, type);
    const mask_range range = mask_range_of(type);

    const compositing_table& loops = compositing_level();
    const blend_function direct = loops.blend[static_cast<int>(type)];
    if (direct && b.adjacent() && o.adjacent() && m.adjacent() && to.adjacent()) {
        for (int64_t y = 0; y < extent.height; ++y)
            direct(b.at(0, y), o.at(0, y), m.at(0, y), to.at(0, y), extent.width, range);
        return outcome::done;
    }
    const arithmetic_table& table = arithmetic_level();
    for_each_block(extent, [&](int64_t x, int64_t y, int32_t count) {
        real_block first, second, weights;
        load_reals(table, b, x, y, count, first.values);
        load_reals(table, o, x, y, count, second.values);
        load_reals(table, m, x, y, count, weights.values);
        loops.blend_blocks(first.values, second.values, weights.values, count, range, first.values);
        store_reals(table, first.values, count, to, x, y);
    });
    return outcome::done;
}

} // namespace Qor::Luxar::ZELT::Arithmetic
