// The table of thresholds, normalisation and absolute values, filled once for each instruction-set level.
#include "arithmetic/kernels/thresholds.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL {
namespace arithmetic {

using Arithmetic::threshold_table;

template <class T>
constexpr void fill(threshold_table& t)
{
    constexpr pixel_type types[] = {pixel_type::unsigned_8, pixel_type::unsigned_16, pixel_type::unsigned_32,
                                    pixel_type::signed_8,   pixel_type::signed_16,   pixel_type::signed_32,
                                    pixel_type::float_32,   pixel_type::float_64};
    constexpr int place = is_integer<T> ? (is_signed<T> ? 3 : 0) + static_cast<int>(sizeof(T) / 2)
                                        : 5 + static_cast<int>(sizeof(T) / 4);
    constexpr int i = static_cast<int>(types[place]);
    t.threshold[i] = threshold<T>;
    t.stretched[i] = stretched<T>;
    t.find_extremes[i] = find_extremes<T>;
    t.bins[static_cast<int>(difference::real)][i] = bins<difference::real, T>;
    t.bins[static_cast<int>(difference::of_type)][i] = bins<difference::of_type, T>;
    if constexpr (is_signed<T>) t.absolute[i] = absolute<T>;
}

constexpr threshold_table make_threshold_table()
{
    threshold_table t{};
    fill<uint8_t>(t);
    fill<uint16_t>(t);
    fill<uint32_t>(t);
    fill<int8_t>(t);
    fill<int16_t>(t);
    fill<int32_t>(t);
    fill<float>(t);
    fill<double>(t);
    return t;
}

} // namespace arithmetic

extern const Arithmetic::threshold_table threshold_loops;
constinit const Arithmetic::threshold_table threshold_loops = arithmetic::make_threshold_table();

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL
