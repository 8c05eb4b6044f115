#include "pixmat/image.h"

namespace Qor::Luxar {

HRESULT WrapPixmat(const image_layout& layout, void* data, bool read_only, pixmat_release release,
                   void* context, IPixmat2** out) noexcept
{
    if (!out) return E_POINTER;
    *out = nullptr;
    if (layout.width < 0 || layout.height < 0 || layout.bits < 1) return E_INVALIDARG;
    if (!data && layout.width > 0 && layout.height > 0) return E_POINTER;

    image_memory memory;
    memory.data = static_cast<uint8_t*>(data);
    memory.read_only = read_only;
    memory.release = release;
    memory.context = context;
    *out = try_make<CPixmat>(layout, std::move(memory)).detach();
    return *out ? S_OK : E_OUTOFMEMORY;
}

} // namespace Qor::Luxar
