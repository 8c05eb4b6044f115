// The base of a facet whose arithmetic depends on the rounding mode.
#pragma once

#include "com/implements.h"
#include "frame/roundable.h"

namespace Qor::Luxar::ZELT {

template <class Interface>
class rounding_facet : public automation<Interface> {
public:
    ZeltRoundable& roundable() noexcept { return roundable_; }

private:
    ZeltRoundable roundable_;
};

} // namespace Qor::Luxar::ZELT
