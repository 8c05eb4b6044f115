#include "pixmat/descriptor.h"

namespace Qor::Luxar {

HRESULT read_layout(IPixmatDescriptor* descriptor, image_layout& layout) noexcept
{
    HRESULT hr = descriptor->get_Width(&layout.width);
    if (succeeded(hr)) hr = descriptor->get_Height(&layout.height);
    if (succeeded(hr)) hr = descriptor->get_Bits(&layout.bits);
    if (succeeded(hr)) hr = descriptor->get_Encoding(&layout.encoding);
    if (succeeded(hr)) hr = descriptor->get_Offset(&layout.offset);
    if (succeeded(hr)) hr = descriptor->get_XStride(&layout.x_stride);
    if (succeeded(hr)) hr = descriptor->get_YStride(&layout.y_stride);
    return hr;
}

HRESULT read_rectangle(IRectangle* area, rectangle& r) noexcept
{
    HRESULT hr = area->get_Left(&r.left);
    if (succeeded(hr)) hr = area->get_Top(&r.top);
    if (succeeded(hr)) hr = area->get_Right(&r.right);
    if (succeeded(hr)) hr = area->get_Bottom(&r.bottom);
    return hr;
}

} // namespace Qor::Luxar
