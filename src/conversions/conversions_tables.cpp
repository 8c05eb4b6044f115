#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/conversions.h"

namespace Qor {
using namespace Luxar;
using namespace Luxar::ZELT;
namespace {

constexpr auto conversions2_rows = std::tuple(
    method<&IConversions2::Recode>("Recode", "carry pixel values over to the format of another image",
                                   in("pIDstImage"), in("pISrcImage"), opt("pISrcArea"), opt("pIDstPoint")),
    method<&IConversions2::RecodeEx>("RecodeEx", "Recode into a new image", in("pIIn"), in("pIDescr"),
                                     opt("pISrcArea"), opt("pIDstPoint"), result("ppIOut")),
    method<&IConversions2::Cast>("Cast", "plain numeric conversion to the format of another image",
                                 in("pIDstImage"), in("pISrcImage"), opt("pISrcArea"), opt("pIDstPoint")),
    method<&IConversions2::CastEx>("CastEx", "Cast into a new image", in("pIIn"), in("pIDescr"),
                                   opt("pISrcArea"), opt("pIDstPoint"), result("ppIOut")),
    method<&IConversions2::Copy>("Copy", "cut an area out as a new image", in("pIIn"), in("pISrcArea"),
                                 result("ppIOut")),
    method<&IConversions2::Paste>("Paste", "put an image into another one at a point", in("pIIn"),
                                  in("pISelection"), in("pIDstPoint")),
    method<&IConversions2::ToGrey>("ToGrey", "an unsigned grey image", in("pIIn"), opt("bits", 8),
                                   result("ppIOut")),
    method<&IConversions2::ToSafeArray>("ToSafeArray", "the pixels as an array", in("pIIn"), opt("varType"),
                                        opt("layout"), opt("pISrcArea"), result("pArray")),
    method<&IConversions2::FromSafeArray>("FromSafeArray", "an image of an array's elements", in("array"),
                                          in("encoding"), opt("bits"), opt("layout"), opt("pIOut"),
                                          result("ppIOut")),
    method<&IConversions2::Reformat>("Reformat", "exchange and mirror axes into another image",
                                     in("pIDstImage"), in("pIIn"), opt("layout"), opt("pISrcArea")),
    method<&IConversions2::ReformatEx>("ReformatEx", "Reformat into a new image", in("pIIn"), opt("layout"),
                                       opt("bits"), opt("encoding"), opt("pISrcArea"), result("ppIOut")),
    method<&IConversions2::ApplyLUT>("ApplyLUT", "colour by a lookup table", in("pIIn"), in("pILUT"),
                                     opt("encoding", PixmatEncoding_RGB), result("ppIOut")),
    method<&IConversions2::ApplyLevels>("ApplyLevels", "contrast, brightness, gamma and sigma", in("pIIn"),
                                        opt("contrast", 1.0), opt("brightness"), opt("gamma", 1.0),
                                        opt("sigma", 1.0), opt("bits"), opt("encoding", PixmatEncoding_Data),
                                        result("ppIOut")),
    method<&IConversions2::Interleave>("Interleave", "put an image into every n-th row of another one",
                                       in("pIIn"), in("pIPartial"), in("offset"), in("skip")),
    method<&IConversions2::Split>("Split", "take every n-th row", in("pIIn"), in("offset"), in("skip"),
                                  result("ppIOut")),
    method<&IConversions2::ApplyLUTEx>("ApplyLUTEx", "ApplyLUT into a given image", in("pIIn"), in("pIOut"),
                                       in("pILUT")),
    method<&IConversions2::ApplyLevelsEx>("ApplyLevelsEx", "ApplyLevels into a given image", in("pIIn"),
                                          in("pIOut"), opt("contrast", 1.0), opt("brightness"),
                                          opt("gamma", 1.0), opt("sigma", 1.0)));

constexpr auto conversions_rows = std::tuple(
    method<&IConversions::Recode>("Recode", "carry pixel values over to the format of another image",
                                  in("pIDstImage"), in("pISrcImage"), opt("pISrcArea"), opt("pIDstPoint")),
    method<&IConversions::RecodeEx>("RecodeEx", "Recode into a new image", in("pIIn"), in("pIDescr"),
                                    opt("pISrcArea"), opt("pIDstPoint"), result("ppIOut")),
    method<&IConversions::Cast>("Cast", "has no implementation", in("pIA"), in("pIOutDescr")),
    method<&IConversions::Cut>("Cut", "cut an area out as a new image", in("pIIn"), in("pISrcArea"),
                               result("ppIOut")),
    method<&IConversions::Paste>("Paste", "put an image into another one at a point", in("pIIn"),
                                 in("pISelection"), in("pIDstPoint")),
    method<&IConversions::ToGrey>("ToGrey", "an unsigned grey image", in("pIIn"), opt("bits", 8),
                                  result("ppIOut")),
    method<&IConversions::ToSafeArray>("ToSafeArray", "the pixels as an array", in("pIIn"), opt("varType"),
                                       opt("layout"), opt("pISrcArea"), result("pArray")),
    method<&IConversions::FromSafeArray>("FromSafeArray", "an image of an array's elements", in("array"),
                                         in("encoding"), opt("bits"), opt("layout"), result("ppIOut")),
    method<&IConversions::Reformat>("Reformat", "exchange and mirror axes into a new image", in("pIIn"),
                                    opt("layout"), opt("bits"), opt("encoding"), opt("pISrcArea"),
                                    result("ppIOut")));

} // namespace

template <>
const interface_info& table_of<IConversions2>() noexcept
{
    return interface_table<IConversions2, conversions2_rows>::info("conversions between image formats");
}

template <>
const interface_info& table_of<IConversions>() noexcept
{
    return interface_table<IConversions, conversions_rows>::info("first-generation conversions");
}

} // namespace Qor
