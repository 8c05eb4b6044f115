// The converter object.
#pragma once

#include "com/implements.h"
#include "zelt/pixmat/pixmat.h"

namespace Qor::Luxar {

class CPixmatConverter final : public implements<IPixmatConverter> {
public:
    HRESULT ConvertRecode(const image_layout& source_layout, const void* source,
                          const image_layout& target_layout, void* target, const rectangle* source_area,
                          const coordinate<int32_t>* target_point) noexcept override;
    HRESULT Reserved1() noexcept override { return E_NOTIMPL; }
    HRESULT ConvertCopy(const image_layout& source_layout, const image_layout& target_layout,
                        IPixmatTransfer** out) noexcept override;
    HRESULT Reserved2() noexcept override { return E_NOTIMPL; }
    HRESULT ConvertCast(const image_layout& source_layout, const void* source,
                        const image_layout& target_layout, void* target, const rectangle* source_area,
                        const coordinate<int32_t>* target_point) noexcept override;
};

} // namespace Qor::Luxar
