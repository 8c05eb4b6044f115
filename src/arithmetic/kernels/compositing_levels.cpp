// The table of compositing, filled once for each instruction-set level.
#include "arithmetic/kernels/compositing.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL {
namespace arithmetic {

using Arithmetic::compositing_table;
using Arithmetic::storage;

template <class T>
constexpr void fill(compositing_table& t, storage s)
{
    t.sum[static_cast<int>(s)] = sum<T>;
    t.blend[static_cast<int>(s)] = blend<T>;
}

constexpr compositing_table make_compositing_table()
{
    compositing_table t{};
    fill<uint8_t>(t, storage::u8);
    fill<uint16_t>(t, storage::u16);
    fill<int8_t>(t, storage::i8);
    fill<int16_t>(t, storage::i16);
    fill<float>(t, storage::f32);
    fill<double>(t, storage::f64);
    t.float_sum[Arithmetic::narrow_index(storage::u8)] = float_sum<uint8_t>;
    t.float_sum[Arithmetic::narrow_index(storage::u16)] = float_sum<uint16_t>;
    t.float_sum[Arithmetic::narrow_index(storage::i8)] = float_sum<int8_t>;
    t.float_sum[Arithmetic::narrow_index(storage::i16)] = float_sum<int16_t>;
    t.blend[static_cast<int>(storage::u8)] = blend_bytes;
    t.equal[static_cast<int>(storage::f32)] = equal<float>;
    t.equal[static_cast<int>(storage::f64)] = equal<double>;
    t.sum_blocks = sum_blocks;
    t.blend_blocks = blend_blocks;
    t.bilinear_blocks = bilinear_blocks;
    return t;
}

} // namespace arithmetic

extern const Arithmetic::compositing_table compositing_loops;
constinit const Arithmetic::compositing_table compositing_loops = arithmetic::make_compositing_table();

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL
