// Geometric operations.
#pragma once

#include "zelt/com/dispatch.h"

namespace Qor::Luxar::ZELT {

struct IGeometric : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0370-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IGeometric";
    using base = IDispatch;
};

struct IGeometric2 : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0371-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IGeometric2";
    using base = IDispatch;
};

} // namespace Qor::Luxar::ZELT
