#include "pixmat/factory.h"

#include "pixmat/descriptor.h"
#include "pixmat/image.h"

namespace Qor::Luxar {

HRESULT CPixmatFactory::Create(IPixmatDescriptor* descriptor, PixmatCreateMode mode, IPixmat2** out) noexcept
{
    if (!out) return E_POINTER;
    *out = nullptr;
    if (!descriptor) return E_INVALIDARG;
    if (mode != PixmatCreateMode_Layout && mode != PixmatCreateMode_Packed) return E_INVALIDARG;
    image_layout layout;
    if (const HRESULT hr = read_layout(descriptor, layout); failed(hr)) return hr;
    if (mode == PixmatCreateMode_Packed) return create_packed_image(layout, pixel_buffer::zeroed, out);
    return create_image(layout, pixel_buffer::zeroed, out);
}

} // namespace Qor::Luxar
