// The facet of mathematical functions of pixels.
#pragma once

#include "frame/facet.h"
#include "zelt/interfaces/arithmetic.h"

namespace Qor::Luxar::ZELT {

class CMath : public rounding_facet<IMath> {};
using CMathDisp = scripting<CMath>;

} // namespace Qor::Luxar::ZELT
