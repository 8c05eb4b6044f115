#include "pixmat/image.h"

#include "pixel/memory_2d.h"
#include "pixmat/descriptor.h"
#include "pixmat/lock.h"

#include <algorithm>
#include <cstring>

namespace Qor::Luxar {
namespace {

using namespace ZELT;

// Some operations access an odd depth with the next larger element, up to this far beside the pixels.
constexpr int64_t slack = 16;

int64_t pixel_bytes(const image_layout& layout) noexcept { return (int64_t{layout.bits} + 7) / 8; }

/// Rows that are longer than a stride can say, as packed_layout describes them: with the low bits of their length.
bool has_wrapped_stride(const image_layout& layout) noexcept
{
    const int64_t row = int64_t{layout.x_stride} * layout.width;
    return row > INT32_MAX && layout.y_stride == static_cast<int32_t>(static_cast<uint32_t>(row));
}

/// Copies whole pixels of any kind, those without a pixel type included.
void copy_any_pixels(const image_layout& target_layout, uint8_t* target, const image_layout& source_layout,
                     const uint8_t* source)
{
    const auto bytes = static_cast<size_t>(pixel_bytes(source_layout));
    for (int64_t y = 0; y < source_layout.height; ++y) {
        const uint8_t* from = source + source_layout.offset + y * source_layout.y_stride;
        uint8_t* to = target + target_layout.offset + y * target_layout.y_stride;
        for (int32_t x = 0; x < source_layout.width; ++x) {
            std::memcpy(to, from, bytes);
            from += source_layout.x_stride;
            to += target_layout.x_stride;
        }
    }
}

bool has_pixel_type(const image_layout& layout)
{
    try {
        return GetPixmatBits(GetPixelType(layout.encoding, layout.bits)) == 8 * pixel_bytes(layout);
    } catch (const std::invalid_argument&) {
        return false;
    }
}

} // namespace

CPixmat::CPixmat(const image_layout& layout, image_memory&& memory) noexcept
    : layout_(layout), memory_(std::move(memory))
{
}

CPixmat::~CPixmat()
{
    if (memory_.release) memory_.release(memory_.context);
}

HRESULT CPixmat::GetDescriptor(IPixmatDescriptor** out) noexcept
{
    if (!out) return E_POINTER;
    *out = try_make<CPixmatDescriptor>(layout_).detach();
    return *out ? S_OK : E_OUTOFMEMORY;
}

HRESULT CPixmat::OpenRead(IRectangle* area, double scale, IPixmatLock** out) noexcept
{
    if (!out) return E_POINTER;
    *out = nullptr;
    if (scale != 1.0) return E_INVALIDARG;
    if (area) {
        rectangle r;
        if (const HRESULT hr = read_rectangle(area, r); failed(hr)) return hr;
        if (!fits(r, {layout_.width, layout_.height})) return E_INVALIDARG;
    }
    *out = try_make<read_lock>(com_ptr(this)).detach();
    return *out ? S_OK : E_OUTOFMEMORY;
}

HRESULT CPixmat::OpenWrite(IPixmatLock** out) noexcept
{
    if (!out) return E_POINTER;
    *out = nullptr;
    if (memory_.read_only) return E_ACCESSDENIED;
    *out = try_make<write_lock>(com_ptr(this)).detach();
    return *out ? S_OK : E_OUTOFMEMORY;
}

HRESULT CPixmat::Clone(IPixmat2** out) noexcept
{
    if (!out) return E_POINTER;
    *out = nullptr;
    com_ptr<IPixmat2> copy;
    if (const HRESULT hr = create_packed_image(layout_, pixel_buffer::uninitialised, copy.put()); failed(hr))
        return hr;
    const image_layout packed = packed_layout(layout_.width, layout_.height, layout_.bits, layout_.encoding);
    uint8_t* const target = static_cast<CPixmat*>(copy.get())->data();
    try {
        if (has_pixel_type(layout_))
            copy_pixels(packed, target, layout_, data());
        else
            copy_any_pixels(packed, target, layout_, data());
    } catch (...) {
        return E_OUTOFMEMORY; // nothing else can fail here
    }
    *out = copy.detach();
    return S_OK;
}

HRESULT CPixmat::StartNotifications(IPixmatEvents* sink, PixmatEventMode mode) noexcept
{
    return sinks_.add(sink, mode);
}

HRESULT CPixmat::StopNotifications(IPixmatEvents* sink) noexcept { return sinks_.remove(sink); }

HRESULT CPixmat::SetValue(BSTR key, const VARIANT* value) noexcept { return store_.set(key, value); }

HRESULT CPixmat::GetValue(BSTR key, VARIANT* value) noexcept { return store_.get(key, value); }

void CPixmat::tell_of_change(const rectangle* changed) noexcept
{
    forget_statistics();
    if (sinks_.empty()) return;
    const com_ptr keep(this); // whatever the sinks let go
    sinks_.notify(this, changed);
}

byte_span span_of(const image_layout& layout) noexcept
{
    byte_span span;
    if (layout.width <= 0 || layout.height <= 0) return span;
    // Two products below 2^62 - 2^32 and what is added stay within 64 bits.
    const int64_t x_reach = (int64_t{layout.width} - 1) * layout.x_stride;
    const int64_t y_reach = (int64_t{layout.height} - 1) * layout.y_stride;
    span.first = layout.offset + std::min<int64_t>(x_reach, 0) + std::min<int64_t>(y_reach, 0);
    span.end =
        layout.offset + std::max<int64_t>(x_reach, 0) + std::max<int64_t>(y_reach, 0) + pixel_bytes(layout);
    span.first = std::min<int64_t>(span.first, 0);
    span.end = std::max<int64_t>(span.end, 0);
    return span;
}

HRESULT create_image(const image_layout& layout, pixel_buffer::fill content, IPixmat2** out) noexcept
{
    *out = nullptr;
    if (layout.width < 0 || layout.height < 0 || layout.bits < 1) return E_INVALIDARG;
    if (has_wrapped_stride(layout)) return E_INVALIDARG;
    const byte_span span = span_of(layout);
    constexpr auto line = static_cast<int64_t>(pixel_buffer::alignment);
    const int64_t lead = (slack - span.first + line - 1) / line * line;
    const int64_t end = lead + span.end;

    image_memory memory;
    memory.own = pixel_buffer::allocate(static_cast<size_t>(end + slack), content);
    if (!memory.own) return E_OUTOFMEMORY;
    memory.data = memory.own.data() + lead;
    if (content == pixel_buffer::uninitialised) {
        std::memset(memory.own.data(), 0, static_cast<size_t>(lead + span.first));
        std::memset(memory.own.data() + end, 0, static_cast<size_t>(slack));
    }
    *out = try_make<CPixmat>(layout, std::move(memory)).detach();
    return *out ? S_OK : E_OUTOFMEMORY;
}

HRESULT create_packed_image(const image_layout& layout, pixel_buffer::fill content, IPixmat2** out) noexcept
{
    *out = nullptr;
    if (layout.width < 0 || layout.height < 0 || layout.bits < 1) return E_INVALIDARG;
    if (pixel_bytes(layout) * layout.width > INT32_MAX) return E_OUTOFMEMORY;
    return create_image(packed_layout(layout.width, layout.height, layout.bits, layout.encoding), content,
                        out);
}

} // namespace Qor::Luxar
