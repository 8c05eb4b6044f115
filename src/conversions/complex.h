// The facets of operations on complex images.
#pragma once

#include "com/implements.h"
#include "zelt/interfaces/complex.h"

namespace Qor::Luxar::ZELT {

class CComplexOps : public automation<IComplexOps> {};

class CComplexOps2 : public automation<IComplexOps2> {};
using CComplexOps2Disp = scripting<CComplexOps2>;

} // namespace Qor::Luxar::ZELT
