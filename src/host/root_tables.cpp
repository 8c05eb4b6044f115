#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/zelt.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {

constexpr auto zelt_rows =
    std::tuple(get<&IZELT::get_Rounding>("Rounding", "rounding mode of all facets", result("mode")),
               put<&IZELT::put_Rounding>("Rounding", "rounding mode of all facets", in("mode")),
               get<&IZELT::get_Basic>("Basic", "arithmetic", result("facet")),
               get<&IZELT::get_Conversions>("Conversions", "conversions between formats", result("facet")),
               get<&IZELT::get_Transforms>("Transforms", "Fourier transforms", result("facet")),
               get<&IZELT::get_Statistics>("Statistics", "measuring images", result("facet")),
               get<&IZELT::get_Math>("Math", "mathematical functions", result("facet")),
               get<&IZELT::get_Complex>("Complex", "complex images", result("facet")),
               get<&IZELT::get_Filters>("Filters", "filters", result("facet")),
               get<&IZELT::get_Geometric>("Geometric", "geometry", result("facet")),
               get<&IZELT::get_Noise>("Noise", "noise", result("facet")),
               get<&IZELT::get_Miscellaneous>("Miscellaneous", "miscellaneous tools", result("facet")),
               get<&IZELT::get_Morphology>("Morphology", "morphology", result("facet")),
               get<&IZELT::get_FlatFielding>("FlatFielding", "dark and gain correction of camera images",
                                             result("facet")));

constexpr auto zelt2_rows =
    std::tuple(get<&IZELT2::get_Rounding>("Rounding", "rounding mode of all facets", result("mode")),
               put<&IZELT2::put_Rounding>("Rounding", "rounding mode of all facets", in("mode")),
               get<&IZELT2::get_Basic>("Basic", "arithmetic", result("facet")),
               get<&IZELT2::get_Conversions>("Conversions", "conversions between formats", result("facet")),
               get<&IZELT2::get_Transforms>("Transforms", "Fourier transforms", result("facet")),
               get<&IZELT2::get_Statistics>("Statistics", "measuring images", result("facet")),
               get<&IZELT2::get_Math>("Math", "mathematical functions", result("facet")),
               get<&IZELT2::get_Complex>("Complex", "complex images", result("facet")),
               get<&IZELT2::get_Filters>("Filters", "filters", result("facet")),
               get<&IZELT2::get_Geometric>("Geometric", "geometry", result("facet")),
               get<&IZELT2::get_Noise>("Noise", "noise", result("facet")),
               get<&IZELT2::get_Miscellaneous>("Miscellaneous", "miscellaneous tools", result("facet")),
               get<&IZELT2::get_Morphology>("Morphology", "morphology", result("facet")),
               get<&IZELT2::get_FlatFielding>("FlatFielding", "dark and gain correction of camera images",
                                              result("facet")),
               method<&IZELT2::Cancel>("Cancel", "stop the cancellable operation that runs, or the next one"),
               get<&IZELT2::get_Fourier>("Fourier", "operators on spectra", result("facet")));

} // namespace

template <>
const interface_info& table_of<IZELT>() noexcept
{
    return interface_table<IZELT, zelt_rows>::info("the root of the first generation");
}

template <>
const interface_info& table_of<IZELT2>() noexcept
{
    return interface_table<IZELT2, zelt2_rows>::info("the root");
}

} // namespace Qor
