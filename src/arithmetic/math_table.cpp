#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/arithmetic.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {

constexpr auto math_rows = std::tuple(
    method<&IMath::Sin>("Sin", "sine of angles in radians", in("pIImage"), opt("pIOutImg"), result("ppIOut")),
    method<&IMath::Cos>("Cos", "cosine of angles in radians", in("pIImage"), opt("pIOutImg"),
                        result("ppIOut")),
    method<&IMath::Tan>("Tan", "tangent of angles in radians", in("pIImage"), opt("pIOutImg"),
                        result("ppIOut")),
    method<&IMath::Asin>("Asin", "the angle with this sine, from -pi/2 to pi/2", in("pIImage"),
                         opt("pIOutImg"), result("ppIOut")),
    method<&IMath::Acos>("Acos", "the angle with this cosine, from 0 to pi", in("pIImage"), opt("pIOutImg"),
                         result("ppIOut")),
    method<&IMath::Atan>("Atan", "the angle with this tangent, from -pi/2 to pi/2", in("pIImage"),
                         opt("pIOutImg"), result("ppIOut")),
    method<&IMath::Atan2>("Atan2", "the direction of the point (x, y) = (pIImageB, pIImageA), from -pi to pi",
                          in("pIImageA"), in("pIImageB"), opt("pIOutImg"), result("ppIOut")));

} // namespace

template <>
const interface_info& table_of<IMath>() noexcept
{
    return interface_table<IMath, math_rows>::info("mathematical functions of pixels");
}

} // namespace Qor
