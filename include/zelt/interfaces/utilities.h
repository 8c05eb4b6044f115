// Noise and miscellaneous tools.
#pragma once

#include "zelt/com/dispatch.h"

namespace Qor::Luxar::ZELT {

struct INoise : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0390-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "INoise";
    using base = IDispatch;
};

struct INoise2 : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0391-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "INoise2";
    using base = IDispatch;
};

struct IMiscellaneous : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0392-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IMiscellaneous";
    using base = IDispatch;
};

} // namespace Qor::Luxar::ZELT
