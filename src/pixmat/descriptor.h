// The property bag for a layout.
#pragma once

#include "com/implements.h"
#include "zelt/pixmat/pixmat.h"

namespace Qor::Luxar {

class CPixmatDescriptor final : public automation<IPixmatDescriptor> {
public:
    CPixmatDescriptor() noexcept = default;
    explicit CPixmatDescriptor(const image_layout& layout) noexcept : layout_(layout) {}

    HRESULT get_Width(LONG* value) noexcept override { return get(layout_.width, value); }
    HRESULT put_Width(LONG value) noexcept override { return put(layout_.width, value); }
    HRESULT get_Height(LONG* value) noexcept override { return get(layout_.height, value); }
    HRESULT put_Height(LONG value) noexcept override { return put(layout_.height, value); }
    HRESULT get_Bits(LONG* value) noexcept override { return get(layout_.bits, value); }
    HRESULT put_Bits(LONG value) noexcept override { return put(layout_.bits, value); }
    HRESULT get_Encoding(PixmatEncoding* value) noexcept override { return get(layout_.encoding, value); }
    HRESULT put_Encoding(PixmatEncoding value) noexcept override { return put(layout_.encoding, value); }
    HRESULT get_Offset(LONG* value) noexcept override { return get(layout_.offset, value); }
    HRESULT put_Offset(LONG value) noexcept override { return put(layout_.offset, value); }
    HRESULT get_XStride(LONG* value) noexcept override { return get(layout_.x_stride, value); }
    HRESULT put_XStride(LONG value) noexcept override { return put(layout_.x_stride, value); }
    HRESULT get_YStride(LONG* value) noexcept override { return get(layout_.y_stride, value); }
    HRESULT put_YStride(LONG value) noexcept override { return put(layout_.y_stride, value); }

private:
    template <class T>
    static HRESULT get(T field, T* value) noexcept
    {
        if (!value) return E_POINTER;
        *value = field;
        return S_OK;
    }
    template <class T>
    static HRESULT put(T& field, T value) noexcept
    {
        field = value;
        return S_OK;
    }

    image_layout layout_;
};

/// Reads the properties of any descriptor; stops at the first failure.
HRESULT read_layout(IPixmatDescriptor* descriptor, image_layout& layout) noexcept;
/// The same for any rectangle.
HRESULT read_rectangle(IRectangle* area, rectangle& r) noexcept;

} // namespace Qor::Luxar
