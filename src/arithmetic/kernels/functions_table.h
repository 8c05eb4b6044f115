// The functions of single pixels, as plain data shared by all instruction-set levels.
#pragma once

#include <cstdint>

namespace Qor::Luxar::ZELT::Arithmetic {

/// to[i] = f(from[i]) on adjacent pixels at any address. to may be from.
using map_function = void (*)(const uint8_t* from, uint8_t* to, int64_t count);
/// to[i] = f(a[i], b[i]). to may be either.
using map_2_function = void (*)(const uint8_t* a, const uint8_t* b, uint8_t* to, int64_t count);
/// to[i] = from[i] to a power.
using power_function = void (*)(const uint8_t* from, uint8_t* to, int64_t count, double exponent);

struct functions_table {
    map_function sine, cosine, tangent, arc_sine, arc_cosine, arc_tangent; ///< Float 32
    map_2_function arc_tangent_2;                                          ///< Float 32; a is y
    map_function exponential[2], logarithm[2];                             ///< Float 32 and 64
    power_function power[2];
};

} // namespace Qor::Luxar::ZELT::Arithmetic
