#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/arithmetic.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {

constexpr const char* angle_types =
    "Signed and unsigned integers of up to 32 bits, float, double; the result is float.";
constexpr const char* two_types = "Two images of one type: signed or unsigned integers of up to 32 bits, "
                                  "float, double; the result is float.";

constexpr auto math_rows = std::tuple(
    pixels(angle_types, method<&IMath::Sin>("Sin", "sine of angles in radians", in("pIImage"),
                                            opt("pIOutImg"), result("ppIOut"))),
    pixels(angle_types, method<&IMath::Cos>("Cos", "cosine of angles in radians", in("pIImage"),
                                            opt("pIOutImg"), result("ppIOut"))),
    pixels(angle_types, method<&IMath::Tan>("Tan", "tangent of angles in radians", in("pIImage"),
                                            opt("pIOutImg"), result("ppIOut"))),
    pixels(angle_types, method<&IMath::Asin>("Asin", "the angle with this sine, from -pi/2 to pi/2",
                                             in("pIImage"), opt("pIOutImg"), result("ppIOut"))),
    pixels(angle_types, method<&IMath::Acos>("Acos", "the angle with this cosine, from 0 to pi",
                                             in("pIImage"), opt("pIOutImg"), result("ppIOut"))),
    pixels(angle_types, method<&IMath::Atan>("Atan", "the angle with this tangent, from -pi/2 to pi/2",
                                             in("pIImage"), opt("pIOutImg"), result("ppIOut"))),
    pixels(two_types, method<&IMath::Atan2>(
                          "Atan2", "the direction of the point (x, y) = (pIImageB, pIImageA), from -pi to pi",
                          in("pIImageA"), in("pIImageB"), opt("pIOutImg"), result("ppIOut"))));

} // namespace

template <>
const interface_info& table_of<IMath>() noexcept
{
    return interface_table<IMath, math_rows>::info("mathematical functions of pixels");
}

} // namespace Qor
