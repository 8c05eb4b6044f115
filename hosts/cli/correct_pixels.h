// Pixels of grey images of any real type: by their type, or as rows of doubles.
#pragma once

#include "failure.h"
#include "image_pixels.h"

#include <cstring>
#include <vector>

namespace cli {

/// Calls body(T{}) with the type that a pixel is stored as; failure for colour, complex and the like.
template <class Body>
decltype(auto) with_pixel_type(const image_layout& layout, Body&& body)
{
    using namespace Qor::Luxar;
    const int bytes = pixel_bytes(layout);
    switch (layout.encoding) {
    case PixmatEncoding_Unsigned:
        if (bytes == 1) return body(uint8_t{});
        if (bytes == 2) return body(uint16_t{});
        if (bytes == 4) return body(uint32_t{});
        break;
    case PixmatEncoding_Signed:
        if (bytes == 1) return body(int8_t{});
        if (bytes == 2) return body(int16_t{});
        if (bytes == 4) return body(int32_t{});
        break;
    case PixmatEncoding_Float:
        if (bytes == 4) return body(float{});
        if (bytes == 8) return body(double{});
        break;
    default: break;
    }
    throw failure("grey frames are wanted, not " + format_name(layout));
}

/// body(x, value) for each pixel of a row as pixel_rows hands it out.
template <class T, class Body>
void for_pixels(const uint8_t* row, int width, Body&& body)
{
    for (int x = 0; x < width; ++x) {
        T value;
        std::memcpy(&value, row + sizeof(T) * static_cast<size_t>(x), sizeof value);
        body(x, value);
    }
}

/// Rows of a grey image as doubles.
class real_rows {
public:
    explicit real_rows(IPixmat2* image);

    int width() const noexcept { return rows_.layout().width; }
    int height() const noexcept { return rows_.layout().height; }
    size_t pixels() const noexcept { return static_cast<size_t>(width()) * static_cast<size_t>(height()); }
    /// Stays as it is until the next call.
    const double* row(int y);

private:
    pixel_rows rows_;
    std::vector<double> row_;
};

/// The values that shares of the finite pixels do not exceed; of large images a part of the pixels is asked. `chosen`
/// has a flag for each pixel, row after row; null means all.
std::vector<double> quantiles(IPixmat2* image, const std::vector<double>& shares,
                              const uint8_t* chosen = nullptr);

} // namespace cli
