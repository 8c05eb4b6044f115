// The frame of every facet method. There is one try block in the library's facets; it stands behind these templates.
#pragma once

#include "frame/image_access.h"
#include "frame/report.h"

namespace Qor::Luxar::ZELT {

namespace detail {
HRESULT run_frame(const GUID& interface_id, HRESULT (*body)(void*), void* context) noexcept;
}

/// Runs a body that answers a code; whatever it throws becomes a code with error information.
template <class Body>
HRESULT run_frame(const GUID& interface_id, Body&& body) noexcept
{
    return detail::run_frame(
        interface_id,
        [](void* context) -> HRESULT { return (*static_cast<std::remove_reference_t<Body>*>(context))(); },
        &body);
}

/// Ends the body of an image_method: the result is complete. Committed here, before the body's scope ends, because a
/// commit comes before the release of any lock, those of the inputs included.
com_ptr<IPixmat2> committed(ImageWriteAccess& dst);

/// A method whose result is an image. The body resolves the output, then the inputs, runs its kernel and returns
/// committed(output). The image is handed out with a reference added; a null result pointer is E_POINTER, but only after
/// the work is done.
template <class Interface, class Body>
HRESULT image_method(IPixmat2** result, Body&& body) noexcept
{
    static_assert(std::is_same_v<decltype(body()), com_ptr<IPixmat2>>,
                  "the body ends with: return committed(dst);");
    return run_frame(Interface::iid, [&]() -> HRESULT {
        com_ptr<IPixmat2> image = body();
        if (!result) return E_POINTER;
        *result = image.detach();
        return S_OK;
    });
}

/// A method whose result is a number. A null result pointer is E_POINTER at once.
template <class Interface, class T, class Body>
HRESULT value_method(T* result, Body&& body) noexcept
{
    if (!result) return E_POINTER;
    return run_frame(Interface::iid, [&] {
        *result = static_cast<T>(body());
        return S_OK;
    });
}

} // namespace Qor::Luxar::ZELT
