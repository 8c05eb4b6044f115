// Filters.
#pragma once

#include "zelt/com/dispatch.h"

namespace Qor::Luxar::ZELT {

struct IFilters : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0360-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IFilters";
    using base = IDispatch;
};

struct IFilters2 : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0361-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IFilters2";
    using base = IDispatch;
};

} // namespace Qor::Luxar::ZELT
