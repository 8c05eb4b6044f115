// The facets of noise and of miscellaneous tools.
#pragma once

#include "frame/facet.h"
#include "zelt/interfaces/utilities.h"

namespace Qor::Luxar::ZELT {

class CNoise : public rounding_facet<INoise> {};

class CNoise2 : public rounding_facet<INoise2> {};
using CNoise2Disp = scripting<CNoise2>;

class CMiscellaneous : public rounding_facet<IMiscellaneous> {};

} // namespace Qor::Luxar::ZELT
