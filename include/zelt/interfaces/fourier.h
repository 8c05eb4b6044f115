// Fourier transforms and operators on spectra.
#pragma once

#include "zelt/com/dispatch.h"

namespace Qor::Luxar::ZELT {

struct ITransforms : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0350-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "ITransforms";
    using base = IDispatch;
};

struct ITransforms2 : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0351-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "ITransforms2";
    using base = IDispatch;
};

struct IFourier : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0352-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IFourier";
    using base = IDispatch;
};

} // namespace Qor::Luxar::ZELT
