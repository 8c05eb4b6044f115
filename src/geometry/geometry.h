// The facets of geometric operations.
#pragma once

#include "frame/facet.h"
#include "zelt/interfaces/geometry.h"

namespace Qor::Luxar::ZELT {

class CGeometric : public rounding_facet<IGeometric> {};

class CGeometric2 : public rounding_facet<IGeometric2> {};
using CGeometric2Disp = scripting<CGeometric2>;

} // namespace Qor::Luxar::ZELT
