#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/arithmetic.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {

/// The type rules of the arithmetic engine, for whoever reads the help instead of the header.
constexpr const char* engine_types = "The result has the type and nominal depth of the output: that of pIA, "
                                     "unless pIOutImg is of the type of an image b. "
                                     "Integers of up to 32 bits are combined in 32 bits, unsigned if either "
                                     "operand is; with a float or double image or "
                                     "number they are combined in that type; float with double in double. "
                                     "Wrap and Fastest cut reals towards zero and keep "
                                     "the low bits; Saturate stops at the limits of the nominal depth, for "
                                     "real images at 0 and 1. Complex images take "
                                     "complex operands or numbers re,im; RGB images take a real image. Other "
                                     "types, 64-bit integers among them, are refused.";
constexpr const char* comparison_types =
    "Pairs of types as for Add, always with rounding Fastest; complex images are refused.";
constexpr const char* real_types =
    "Signed and unsigned integers of up to 32 bits, float, double; the result has the type of the image.";
constexpr const char* offset_types = "Any pair of signed and unsigned integers of up to 32 bits, float, "
                                     "double; computed in double, cut towards zero.";
constexpr const char* float_types = "Float and double; the result has the type of the image.";
constexpr const char* shade_types =
    "RGB, RGBA or BGR, shaded by a mask of integers of up to 32 bits, float or double; alpha is not written.";

constexpr auto basic2_rows = std::tuple(
    pixels(engine_types,
           method<&IBasicOps2::Add>("Add", "pIA + b", in("pIA"), in("b"), opt("pIOutImg"), result("ppIOut"))),
    pixels(engine_types, method<&IBasicOps2::Subtract>("Subtract", "pIA - b", in("pIA"), in("b"),
                                                       opt("pIOutImg"), result("ppIOut"))),
    pixels(engine_types, method<&IBasicOps2::ReverseSubtract>("ReverseSubtract", "b - pIA", in("pIA"),
                                                              in("b"), opt("pIOutImg"), result("ppIOut"))),
    pixels(engine_types, method<&IBasicOps2::Multiply>("Multiply", "pIA * b", in("pIA"), in("b"),
                                                       opt("pIOutImg"), result("ppIOut"))),
    pixels(engine_types,
           method<&IBasicOps2::Divide>("Divide", "pIA / b; integers must not be divided by zero", in("pIA"),
                                       in("b"), opt("pIOutImg"), result("ppIOut"))),
    pixels(engine_types, method<&IBasicOps2::ReverseDivide>(
                             "ReverseDivide", "b / pIA; integers must not be divided by zero", in("pIA"),
                             in("b"), opt("pIOutImg"), result("ppIOut"))),
    method<&IBasicOps2::SetTo>("SetTo", "fill an image, or a rectangle of it, with a number or an image",
                               in("pIImg"), in("b"), opt("pIRect")),
    pixels(offset_types,
           method<&IBasicOps2::AddOffset>("AddOffset", "blend an image in at a position between pixels",
                                          in("pIA"), in("pIB"), in("pIPos"), in("fa"), in("fb"))),
    pixels(offset_types, method<&IBasicOps2::AddIntegerOffset>(
                             "AddIntegerOffset", "weighted sum with an image at a whole position", in("pIA"),
                             in("pIB"), in("pIPos"), in("fa"), in("fb"), opt("pIOut"), result("ppIOut"))),
    pixels(comparison_types, method<&IBasicOps2::Min>("Min", "the lesser of pIA and b", in("pIA"), in("b"),
                                                      opt("pIOutImg"), result("ppIOut"))),
    pixels(comparison_types, method<&IBasicOps2::Max>("Max", "the greater of pIA and b", in("pIA"), in("b"),
                                                      opt("pIOutImg"), result("ppIOut"))),
    pixels(real_types, method<&IBasicOps2::Abs>("Abs", "absolute value", in("pIImage"), opt("pIOutImg"),
                                                result("ppIOut"))),
    pixels(real_types,
           method<&IBasicOps2::Threshold>("Threshold", "replace pixels below one limit and above another",
                                          in("pIImage"), in("lowLimit"), in("lowValue"), in("highLimit"),
                                          in("highValue"), opt("pIOutImg"), result("ppIOut"))),
    pixels(real_types,
           method<&IBasicOps2::Normalize>(
               "Normalize", "stretch contrast between two fractions of the histogram", in("pIImage"),
               opt("low", 0.0), opt("high", 1.0), opt("pIOutImg"), result("ppIOut"))),
    method<&IBasicOps2::Equals>("Equals", "whether two images have the same pixels", in("pIImgA"),
                                in("pIImgB"), result("pResult")),
    pixels(real_types,
           method<&IBasicOps2::AutoThreshold>("AutoThreshold", "split into two classes at a computed limit",
                                              in("pIImage"), in("belowValue"), in("aboveValue"),
                                              opt("method"), opt("pIOutImg"), result("ppIOut"))),
    pixels(real_types,
           method<&IBasicOps2::Margins>("Margins", "blank a frame around the image", in("pIImage"),
                                        opt("imgMargins"), opt("pIOutImg"), result("ppIOut"))),
    pixels(real_types, method<&IBasicOps2::Combine>("Combine", "blend two images by a mask",
                                                    in("pIBaseImage"), in("pICombineImage"),
                                                    in("pIWeightMask"), opt("pIOutImg"), result("ppIOut"))),
    pixels(float_types, method<&IBasicOps2::Exp>("Exp", "exponential function", in("pIImage"),
                                                 opt("pIOutImg"), result("ppIOut"))),
    pixels(float_types, method<&IBasicOps2::Log>("Log", "natural logarithm", in("pIImage"), opt("pIOutImg"),
                                                 result("ppIOut"))),
    pixels(shade_types,
           method<&IBasicOps2::Modulate>("Modulate", "shade a colour image by a mask", in("pIImage"),
                                         in("pIMask"), in("weight"), opt("pIOutImage"), result("ppIOut"))),
    pixels(real_types, method<&IBasicOps2::Extend>("Extend", "pad or cut to a rectangle", in("pIImage"),
                                                   in("pIExtendedImageDomain"), opt("boundaryCondition"),
                                                   opt("padValue"), opt("pIOut"), result("ppIPixmat"))),
    pixels(float_types, method<&IBasicOps2::Power>("Power", "pixels to a power", in("pIA"), in("exponent"),
                                                   opt("pIOutImg"), result("ppIOut"))));

} // namespace

template <>
const interface_info& table_of<IBasicOps2>() noexcept
{
    return interface_table<IBasicOps2, basic2_rows>::info("arithmetic on images");
}

} // namespace Qor
