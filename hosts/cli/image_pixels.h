// Pixels of image objects for readers and writers of files.
#pragma once

#include "common/layout_of.h"

#include <memory>
#include <string>

namespace cli {

using Qor::com_ptr;
using Qor::Luxar::image_layout;
using Qor::Luxar::IPixmat2;
using Qor::Luxar::IPixmatLock;

/// Bytes that one pixel takes: nominal 12 bits take 2.
constexpr int pixel_bytes(const image_layout& layout) noexcept { return (layout.bits + 7) / 8; }

/// "Unsigned 16", with the nominal depth.
std::string format_name(const image_layout& layout);

/// The encoding of a name such as "Unsigned" or "complex_float"; false for an unknown one.
bool find_encoding(const std::string& name, Qor::Luxar::PixmatEncoding* encoding);

/// What a failed call of the library has to say: its description, or what the code means.
std::string message_of(const zelt::error& e);

using host::layout_of;

/// A packed image of the library, open for the reader that fills it. `data` is null only for an image without pixels.
struct new_image {
    new_image(int64_t width, int64_t height, int bits, Qor::Luxar::PixmatEncoding encoding);

    image_layout layout;
    com_ptr<IPixmat2> image;
    com_ptr<IPixmatLock> lock;
    uint8_t* data = nullptr;
    size_t row_bytes = 0;
};

/// The same pixels under another nominal depth; the given image is kept alive by the new one.
com_ptr<IPixmat2> with_bits(IPixmat2* image, int bits);

/// Rows of an image, packed, whatever its strides are.
class pixel_rows {
public:
    explicit pixel_rows(IPixmat2* image);

    const image_layout& layout() const noexcept { return layout_; }
    size_t row_bytes() const noexcept { return row_bytes_; }
    /// Stays as it is until the next call.
    const uint8_t* row(int y);

private:
    image_layout layout_;
    com_ptr<IPixmatLock> lock_;
    const uint8_t* data_ = nullptr;
    size_t row_bytes_ = 0;
    std::unique_ptr<uint8_t[]> packed_;
};

} // namespace cli
