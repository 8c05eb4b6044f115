// Every facet's interface.
#pragma once

#include "zelt/interfaces/arithmetic.h"
#include "zelt/interfaces/complex.h"
#include "zelt/interfaces/conversions.h"
#include "zelt/interfaces/filters.h"
#include "zelt/interfaces/flatfield.h"
#include "zelt/interfaces/fourier.h"
#include "zelt/interfaces/geometry.h"
#include "zelt/interfaces/morphology.h"
#if __has_include("zelt/interfaces/statistics.h") // TEMPORARY
#include "zelt/interfaces/statistics.h"
#else
namespace Qor::Luxar::ZELT {
struct IStatistics : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0310-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IStatistics";
    using base = IDispatch;
};
} // namespace Qor::Luxar::ZELT
#endif
#include "zelt/interfaces/utilities.h"
