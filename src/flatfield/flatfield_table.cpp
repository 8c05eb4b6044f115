#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/flatfield.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {

constexpr auto flatfield_rows = std::tuple(
    method<&IFlatFielding::ToDarkRef>("ToDarkRef", "dark reference of a recorded dark frame",
                                      in("pIDstImage"), in("pISrcImage"), opt("offset")),
    method<&IFlatFielding::ToDarkRefEx>("ToDarkRefEx", "ToDarkRef into a new image", in("pIIn"),
                                        in("encoding"), opt("offset"), result("ppIOut")),
    method<&IFlatFielding::ToGainRef>("ToGainRef", "gain reference of a recorded flat frame",
                                      in("pIDstImage"), in("pISrcImage"), opt("Norm", -1.0),
                                      opt("scaleFactor", 1)),
    method<&IFlatFielding::ToGainRefEx>("ToGainRefEx", "ToGainRef into a new image", in("pIIn"),
                                        in("encoding"), opt("Norm", -1.0), opt("scaleFactor", 1),
                                        result("ppIOut")),
    method<&IFlatFielding::Flatten>("Flatten", "subtract the dark reference, multiply by the gain reference",
                                    in("pIDstImage"), in("pISrcImage"), in("pIDarkRefImage"),
                                    opt("pIGainRefImage"), opt("scaleFactor", 1)),
    method<&IFlatFielding::FlattenEx>("FlattenEx", "Flatten into a new image", in("pIIn"), in("encoding"),
                                      in("pIDarkRefImage"), opt("pIGainRefImage"), opt("scaleFactor", 1),
                                      result("ppIOut")),
    method<&IFlatFielding::FlattenDouble>("FlattenDouble", "correct and merge a long and a short exposure",
                                          in("pIDstImage"), in("pISrcImageLong"), in("pISrcImageShort"),
                                          in("scaleFactorShortExposure"), in("pIDarkRefImage"),
                                          in("pIGainRefImage"), in("scaleFactor")));

} // namespace

template <>
const interface_info& table_of<IFlatFielding>() noexcept
{
    return interface_table<IFlatFielding, flatfield_rows>::info(
        "corrects camera images with dark and gain references");
}

} // namespace Qor
