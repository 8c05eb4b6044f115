// The table of the functions of a pixel, filled once for each instruction-set level.
#include "arithmetic/kernels/functions.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL {

extern const Arithmetic::functions_table function_loops;
constinit const Arithmetic::functions_table function_loops{
    .sine = functions::map_sine,
    .cosine = functions::map_cosine,
    .tangent = functions::map_tangent,
    .arc_sine = functions::map_arc_sine,
    .arc_cosine = functions::map_arc_cosine,
    .arc_tangent = functions::map_arc_tangent,
    .arc_tangent_2 = functions::map_arc_tangent_2,
    .exponential = {functions::map_exponential<float>, functions::map_exponential<double>},
    .logarithm = {functions::map_logarithm<float>, functions::map_logarithm<double>},
    .power = {functions::map_power<float>, functions::map_power<double>},
};

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL
