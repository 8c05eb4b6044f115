// The facets of pixel-wise operations.
#pragma once

#include "frame/facet.h"
#include "zelt/interfaces/arithmetic.h"

namespace Qor::Luxar::ZELT {

class CBasic2 : public rounding_facet<IBasicOps2> {};
using CBasic2Disp = scripting<CBasic2>;

/// Works on a second-generation object of its own, whose rounding mode is its own.
class CBasic : public automation<IBasicOps> {
public:
    ZeltRoundable& roundable() noexcept { return second_->roundable(); }

private:
    com_ptr<CBasic2> second_ = make<CBasic2>();
};

class CMath : public rounding_facet<IMath> {};
using CMathDisp = scripting<CMath>;

} // namespace Qor::Luxar::ZELT
