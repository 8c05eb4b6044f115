#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/filters.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {

constexpr auto filters_rows = std::tuple(
    method<&IFilters::Gauss>("Gauss", "smooth in place", in("pIImage"), in("sigma")),
    method<&IFilters::GaussEx>("GaussEx", "smooth", in("pIImage"), in("sigma"), result("ppIOut")),
    method<&IFilters::MedianEx>("MedianEx", "median of a window", in("pIImage"), in("kernelWidth"),
                                in("kernelHeight"), result("ppIOut")),
    method<&IFilters::MinEx>("MinEx", "least pixel of a window", in("pIImage"), in("kernelWidth"),
                             in("kernelHeight"), result("ppIOut")),
    method<&IFilters::MaxEx>("MaxEx", "greatest pixel of a window", in("pIImage"), in("kernelWidth"),
                             in("kernelHeight"), result("ppIOut")),
    method<&IFilters::AverageEx>("AverageEx", "mean of a window", in("pIImage"), in("kernelWidth"),
                                 in("kernelHeight"), result("ppIOut")),
    method<&IFilters::ConvolveEx>("ConvolveEx", "convolve with a kernel and its anchor", in("pIImage"),
                                  in("kernel"), in("kx"), in("ky"), result("ppIOut")),
    method<&IFilters::SobelEx>("SobelEx", "magnitude of the gradient, by Sobel's kernels", in("pIImage"),
                               result("ppIOut")));

} // namespace

template <>
const interface_info& table_of<IFilters>() noexcept
{
    return interface_table<IFilters, filters_rows>::info("first-generation filters");
}

} // namespace Qor
