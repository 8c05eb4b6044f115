// Pixel-wise operations.
#pragma once

#include "zelt/com/dispatch.h"

namespace Qor::Luxar::ZELT {

struct IBasicOps : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0340-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IBasicOps";
    using base = IDispatch;
};

struct IBasicOps2 : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0341-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IBasicOps2";
    using base = IDispatch;
};

struct IMath : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0342-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IMath";
    using base = IDispatch;
};

} // namespace Qor::Luxar::ZELT
