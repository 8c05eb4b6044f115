// The facets of Fourier transforms and of operators on spectra.
#pragma once

#include "frame/facet.h"
#include "zelt/interfaces/fourier.h"

namespace Qor::Luxar::ZELT {

class CTransforms : public rounding_facet<ITransforms> {};

class CTransforms2 : public rounding_facet<ITransforms2> {};
using CTransforms2Disp = scripting<CTransforms2>;

class CFourier : public automation<IFourier> {};
using CFourierDisp = scripting<CFourier>;

} // namespace Qor::Luxar::ZELT
