#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/arithmetic.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {

constexpr auto basic_rows = std::tuple(
    method<&IBasicOps::Add>("Add", "pIA + b, in place", in("pIA"), in("b"), opt("r")),
    method<&IBasicOps::AddEx>("AddEx", "pIA + b into a new image", in("pIA"), in("b"), opt("r"),
                              opt("pIOutDescr"), result("ppIOut")),
    method<&IBasicOps::Subtract>("Subtract", "pIA - b, in place", in("pIA"), in("b"), opt("r")),
    method<&IBasicOps::SubtractEx>("SubtractEx", "pIA - b into a new image", in("pIA"), in("b"), opt("r"),
                                   opt("pIOutDescr"), result("ppIOut")),
    method<&IBasicOps::ReverseSubtract>("ReverseSubtract", "b - pIA, in place", in("pIA"), in("b"), opt("r")),
    method<&IBasicOps::ReverseSubtractEx>("ReverseSubtractEx", "b - pIA into a new image", in("pIA"), in("b"),
                                          opt("r"), opt("pIOutDescr"), result("ppIOut")),
    method<&IBasicOps::Multiply>("Multiply", "pIA * b, in place", in("pIA"), in("b"), opt("r")),
    method<&IBasicOps::MultiplyEx>("MultiplyEx", "pIA * b into a new image", in("pIA"), in("b"), opt("r"),
                                   opt("pIOutDescr"), result("ppIOut")),
    method<&IBasicOps::Divide>("Divide", "pIA / b, in place; integers must not be divided by zero", in("pIA"),
                               in("b"), opt("r")),
    method<&IBasicOps::DivideEx>("DivideEx", "pIA / b into a new image", in("pIA"), in("b"), opt("r"),
                                 opt("pIOutDescr"), result("ppIOut")),
    method<&IBasicOps::ReverseDivide>("ReverseDivide",
                                      "b / pIA, in place; integers must not be divided by zero", in("pIA"),
                                      in("b"), opt("r")),
    method<&IBasicOps::ReverseDivideEx>("ReverseDivideEx", "b / pIA into a new image", in("pIA"), in("b"),
                                        opt("r"), opt("pIOutDescr"), result("ppIOut")),
    method<&IBasicOps::SetTo>("SetTo", "fill an image, or a rectangle of it, with a number or an image",
                              in("pIImg"), in("b"), opt("pIRect")),
    method<&IBasicOps::AddOffset>("AddOffset", "add an image at a position", in("pIA"), in("pIB"),
                                  in("pIPos"), opt("mode")),
    method<&IBasicOps::Min>("Min", "the lesser of pIA and b, in place", in("pIA"), in("b")),
    method<&IBasicOps::MinEx>("MinEx", "the lesser of pIA and b into a new image", in("pIA"), in("b"),
                              opt("pIOutDescr"), result("ppIOut")),
    method<&IBasicOps::Max>("Max", "the greater of pIA and b, in place", in("pIA"), in("b")),
    method<&IBasicOps::MaxEx>("MaxEx", "the greater of pIA and b into a new image", in("pIA"), in("b"),
                              opt("pIOutDescr"), result("ppIOut")),
    method<&IBasicOps::Abs>("Abs", "absolute value, in place", in("pIImage")),
    method<&IBasicOps::AbsEx>("AbsEx", "absolute value into a new image", in("pIImage"), opt("pIOutDescr"),
                              result("ppIOut")),
    method<&IBasicOps::Threshold>("Threshold", "replace pixels below one limit and above another, in place",
                                  in("pIImage"), in("lowLimit"), in("lowValue"), in("highLimit"),
                                  in("highValue")),
    method<&IBasicOps::ThresholdEx>("ThresholdEx", "Threshold into a new image", in("pIImage"),
                                    in("lowLimit"), in("lowValue"), in("highLimit"), in("highValue"),
                                    opt("pIOutDescr"), result("ppIOut")));

} // namespace

template <>
const interface_info& table_of<IBasicOps>() noexcept
{
    return interface_table<IBasicOps, basic_rows>::info("first-generation arithmetic on images");
}

} // namespace Qor
