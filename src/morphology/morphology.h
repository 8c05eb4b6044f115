// The facet of morphology.
#pragma once

#include "com/implements.h"
#include "zelt/interfaces/morphology.h"

namespace Qor::Luxar::ZELT {

class CMorphology : public automation<IMorphology> {};
using CMorphologyDisp = scripting<CMorphology>;

} // namespace Qor::Luxar::ZELT
