// Morphology.
#pragma once

#include "zelt/com/dispatch.h"

namespace Qor::Luxar::ZELT {

struct IMorphology : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0380-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IMorphology";
    using base = IDispatch;
};

} // namespace Qor::Luxar::ZELT
