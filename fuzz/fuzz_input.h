// What the fuzz targets share: numbers out of the bytes of an input, layouts that stay small, owners for a run.
#pragma once

#include "com/implements.h"
#include "zelt/com/class_registry.h"
#include "zelt/com/error_info.h"
#include "zelt/com/safe_array.h"
#include "zelt/interfaces/zelt.h"
#include "zelt/pixmat/pixmat.h"
#include "zelt/values.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <limits>

namespace fuzz {

using namespace Qor;
using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;

/// A claim about the library that holds for every input.
inline void require(bool holds)
{
    if (!holds) std::abort();
}

/// The bytes of an input, front to back; zeros when they are used up.
class input {
public:
    input(const uint8_t* data, size_t size) : data_(data), size_(size) {}

    bool empty() const { return size_ == 0; }

    template <class T>
    T take()
    {
        T value{};
        const size_t n = std::min(sizeof value, size_);
        if (n > 0) std::memcpy(&value, data_, n);
        data_ += n;
        size_ -= n;
        return value;
    }
    /// 0 to n - 1.
    size_t pick(size_t n) { return take<uint8_t>() % n; }
    bool chance() { return take<uint8_t>() & 1; }

    template <class T, size_t N>
    const T& one_of(const T (&values)[N])
    {
        return values[pick(N)];
    }

    /// Mostly small, sometimes at a limit, sometimes anything.
    int32_t number()
    {
        constexpr int32_t low = std::numeric_limits<int32_t>::min(),
                          high = std::numeric_limits<int32_t>::max();
        constexpr int32_t edges[] = {low, low + 1, -65536, -1, 0, 1, 255, 65535, 65536, high - 1, high};
        switch (pick(8)) {
        case 0: return one_of(edges);
        case 1: return take<int32_t>();
        case 2: return take<int16_t>();
        default: return take<int8_t>();
        }
    }
    double real()
    {
        using limits = std::numeric_limits<double>;
        constexpr double edges[] = {0.0,
                                    -0.0,
                                    1.0,
                                    0.5,
                                    1e300,
                                    4294967296.0,
                                    -2147483649.0,
                                    9.3e18,
                                    limits::max(),
                                    limits::denorm_min(),
                                    limits::infinity(),
                                    -limits::infinity(),
                                    limits::quiet_NaN()};
        switch (pick(4)) {
        case 0: return one_of(edges);
        case 1: return take<double>();
        case 2: return take<float>();
        default: return number() / 16.0;
        }
    }

private:
    const uint8_t* data_;
    size_t size_;
};

inline constexpr int64_t most_pixels = 4096;
inline constexpr int64_t most_bytes = 1 << 20;

/// What a pixel occupies at most: odd depths are accessed as the next whole element.
inline int64_t element_bytes(const image_layout& layout)
{
    const int64_t bytes = (int64_t{layout.bits} + 7) / 8;
    const bool colour = layout.encoding == PixmatEncoding_RGB || layout.encoding == PixmatEncoding_BGR;
    if (colour && bytes == 3) return 3;
    for (const int64_t whole : {1, 2, 4, 8, 16})
        if (bytes <= whole) return whole;
    return bytes;
}

/// The bytes from the lowest to the highest that a layout reaches, counted from its data; both are 0 without pixels.
struct reach {
    __int128 low = 0, high = 0;
};
inline reach reach_of(const image_layout& layout)
{
    reach r;
    if (layout.width <= 0 || layout.height <= 0) return r;
    const __int128 x = (__int128{layout.width} - 1) * layout.x_stride;
    const __int128 y = (__int128{layout.height} - 1) * layout.y_stride;
    r.low = layout.offset + std::min<__int128>(x, 0) + std::min<__int128>(y, 0);
    r.high = layout.offset + std::max<__int128>(x, 0) + std::max<__int128>(y, 0) + element_bytes(layout);
    return r;
}

/// An image of this layout can be made and walked in no time.
inline bool is_small(const image_layout& layout)
{
    const reach r = reach_of(layout);
    const bool few = layout.width <= most_pixels && layout.height <= most_pixels &&
                     int64_t{layout.width} * std::max(layout.height, 0) <= most_pixels;
    return few && layout.bits <= 8 * 4096 && r.low >= -most_bytes && r.high <= most_bytes;
}

/// Formats with a pixel type for the most part; sizes and strides of any kind.
inline image_layout any_layout(input& in)
{
    struct format {
        int8_t encoding;
        int16_t bits;
    };
    constexpr format formats[] = {{0, 8},    {0, 12},  {0, 16},  {0, 32},   {0, 64},  {1, 8},   {1, 10},
                                  {1, 16},   {1, 32},  {1, 64},  {2, 32},   {2, 64},  {3, 24},  {4, 32},
                                  {5, 24},   {13, 32}, {10, 64}, {10, 128}, {12, 64}, {17, 64}, {12, 128},
                                  {17, 128}, {0, 20},  {0, 1},   {8, 8},    {14, 64}};
    image_layout layout;
    const size_t form = in.pick(std::size(formats) + 1);
    if (form < std::size(formats)) {
        layout.bits = formats[form].bits;
        layout.encoding = static_cast<PixmatEncoding>(formats[form].encoding);
    } else {
        layout.bits = in.number();
        layout.encoding = static_cast<PixmatEncoding>(in.number());
    }
    const bool wild = in.pick(16) == 0;
    layout.width = wild ? in.number() : static_cast<int32_t>(in.pick(40));
    layout.height = wild ? in.number() : static_cast<int32_t>(in.pick(20));
    const auto tight = static_cast<int32_t>(std::clamp<int64_t>(element_bytes(layout), 1, 4096));
    switch (in.pick(5)) {
    case 0: // packed
        return packed_layout(layout.width, layout.height, layout.bits, layout.encoding);
    case 1: // padded
        layout.offset = static_cast<int32_t>(in.pick(64));
        layout.x_stride = tight + static_cast<int32_t>(in.pick(4));
        layout.y_stride = layout.x_stride * (static_cast<int32_t>(in.pick(8)) + layout.width % 64);
        return layout;
    case 2: // one or both axes backwards
        layout.x_stride = in.chance() ? tight : -tight;
        layout.y_stride = -tight * (layout.width % 64);
        layout.offset = tight * (layout.width % 64) * (layout.height % 64 + 1);
        return layout;
    case 3: // axes exchanged
        layout.x_stride = tight * (layout.height % 64);
        layout.y_stride = tight;
        return layout;
    default:
        layout.offset = in.number();
        layout.x_stride = in.number();
        layout.y_stride = in.number();
        return layout;
    }
}

template <class I>
com_ptr<I> create(const GUID& class_id)
{
    com_ptr<I> object;
    require(CoCreateInstance(class_id, nullptr, CLSCTX_ALL, I::iid, object.put_void()) == S_OK);
    return object;
}

inline com_ptr<IPixmatDescriptor> descriptor_of(const image_layout& layout)
{
    const auto descriptor = create<IPixmatDescriptor>(CLSID_PixmatDescriptor);
    descriptor->put_Width(layout.width);
    descriptor->put_Height(layout.height);
    descriptor->put_Bits(layout.bits);
    descriptor->put_Encoding(layout.encoding);
    descriptor->put_Offset(layout.offset);
    descriptor->put_XStride(layout.x_stride);
    descriptor->put_YStride(layout.y_stride);
    return descriptor;
}

inline image_layout layout_of(IPixmatDescriptor* descriptor)
{
    image_layout layout;
    descriptor->get_Width(&layout.width);
    descriptor->get_Height(&layout.height);
    descriptor->get_Bits(&layout.bits);
    descriptor->get_Encoding(&layout.encoding);
    descriptor->get_Offset(&layout.offset);
    descriptor->get_XStride(&layout.x_stride);
    descriptor->get_YStride(&layout.y_stride);
    return layout;
}

/// An area, often null, often inside an image of ordinary size.
inline com_ptr<IRectangle> any_area(input& in)
{
    com_ptr<IRectangle> area;
    const size_t kind = in.pick(4);
    if (kind == 0) return area;
    int32_t side[4];
    for (int32_t& s : side) s = kind == 1 ? in.number() : static_cast<int32_t>(in.pick(24));
    if (kind == 3) {
        side[2] = side[0] + side[2] % 16;
        side[3] = side[1] + side[3] % 16;
    }
    require(Common::MakeRectangle(side[0], side[1], side[2], side[3], area.put()) == S_OK);
    return area;
}

inline com_ptr<ICoordinateInt> any_point(input& in)
{
    com_ptr<ICoordinateInt> point;
    if (in.chance()) return point;
    const int32_t x = in.number();
    require(Common::MakeCoordinateInt(x, in.number(), point.put()) == S_OK);
    return point;
}

} // namespace fuzz
