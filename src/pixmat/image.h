// The image object, and how images are made.
#pragma once

#include "com/implements.h"
#include "pixel/pixel_buffer.h"
#include "pixmat/event_sinks.h"
#include "pixmat/statistics_store.h"
#include "zelt/pixmat/pixmat.h"

namespace Qor::Luxar {

/// Where an image's pixels are: in a buffer of its own or in memory of the caller.
struct image_memory {
    uint8_t* data = nullptr; ///< what the layout's offset counts from
    pixel_buffer own;
    bool read_only = false;
    pixmat_release release = nullptr;
    void* context = nullptr;
};

class CPixmat final : public automation<IPixmat2, IPixmatStatisticsStore> {
public:
    CPixmat(const image_layout& layout, image_memory&& memory) noexcept;
    ~CPixmat() override;

    HRESULT GetDescriptor(IPixmatDescriptor** out) noexcept override;
    HRESULT OpenRead(IRectangle* area, double scale, IPixmatLock** out) noexcept override;
    HRESULT OpenWrite(IPixmatLock** out) noexcept override;
    HRESULT Clone(IPixmat2** out) noexcept override;
    HRESULT StartNotifications(IPixmatEvents* sink, PixmatEventMode mode) noexcept override;
    HRESULT StopNotifications(IPixmatEvents* sink) noexcept override;

    HRESULT SetValue(BSTR key, const VARIANT* value) noexcept override;
    HRESULT GetValue(BSTR key, VARIANT* value) noexcept override;

    /// What the locks use.
    uint8_t* data() const noexcept { return memory_.data; }
    void forget_statistics() noexcept { store_.drop(); }
    void tell_of_change(const rectangle* changed) noexcept;

private:
    const image_layout layout_;
    image_memory memory_;
    statistics_store store_;
    event_sinks sinks_;
};

/// The bytes that a layout's pixels occupy, counted from the data pointer, whose own place is included. Exact for
/// every layout without negative sizes.
struct byte_span {
    int64_t first = 0;
    int64_t end = 0;
};
byte_span span_of(const image_layout& layout) noexcept;

/// A new image with exactly this layout. E_INVALIDARG for negative sizes, bits below 1 and a packed layout whose y
/// stride does not fit 32 bits; E_OUTOFMEMORY. `content` may be pixel_buffer::uninitialised when every byte of the
/// layout's span will be written.
HRESULT create_image(const image_layout& layout, pixel_buffer::fill content, IPixmat2** out) noexcept;
/// The same, packed: offset and strides do not matter. E_OUTOFMEMORY, too, when a row is longer than 2^31 - 1 bytes.
HRESULT create_packed_image(const image_layout& layout, pixel_buffer::fill content, IPixmat2** out) noexcept;

} // namespace Qor::Luxar
