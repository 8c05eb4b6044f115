#include "image_pixels.h"

#include "failure.h"

#include <algorithm>
#include <climits>
#include <cstring>
#include <strings.h>

using namespace Qor;
using namespace Qor::Luxar;

namespace cli {
namespace {

constexpr std::pair<PixmatEncoding, const char*> encodings[] = {
    {PixmatEncoding_Unsigned, "Unsigned"},
    {PixmatEncoding_Signed, "Signed"},
    {PixmatEncoding_Float, "Float"},
    {PixmatEncoding_RGB, "RGB"},
    {PixmatEncoding_RGBA, "RGBA"},
    {PixmatEncoding_BGR, "BGR"},
    {PixmatEncoding_BGRA, "BGRA"},
    {PixmatEncoding_Data, "Data"},
    {PixmatEncoding_Complex_Float, "Complex_Float"},
    {PixmatEncoding_Complex_Float_Half_Even, "Complex_Float_Half_Even"},
    {PixmatEncoding_Complex_Float_Half_Odd, "Complex_Float_Half_Odd"},
    {PixmatEncoding_Float_Vector2D, "Float_Vector2D"},
    {PixmatEncoding_Float_Vector3D, "Float_Vector3D"},
    {PixmatEncoding_Float_Vector4D, "Float_Vector4D"},
};

} // namespace

std::string format_name(const image_layout& layout)
{
    for (const auto& [encoding, name] : encodings)
        if (encoding == layout.encoding) return std::string(name) + " " + std::to_string(layout.bits);
    return "encoding " + std::to_string(layout.encoding);
}

bool find_encoding(const std::string& name, PixmatEncoding* found)
{
    for (const auto& [encoding, known] : encodings) {
        if (strcasecmp(name.c_str(), known) != 0) continue;
        *found = encoding;
        return true;
    }
    return false;
}

std::string message_of(const zelt::error& e)
{
    if (!e.description.empty()) return narrow(e.description);
    if (const char* meaning = system_message(e.hresult)) return meaning;
    return "failed";
}

new_image::new_image(int64_t width, int64_t height, int bits, PixmatEncoding encoding)
{
    const int64_t bytes = (int64_t{bits} + 7) / 8;
    if (width < 0 || height < 0 || width > INT_MAX / bytes || height > INT_MAX)
        throw failure("an image of " + std::to_string(width) + " x " + std::to_string(height) +
                      " pixels is too large");
    layout = packed_layout(static_cast<int32_t>(width), static_cast<int32_t>(height), bits, encoding);
    row_bytes = static_cast<size_t>(width * bytes);

    image = zelt::new_image(layout.width, layout.height, bits, encoding);
    zelt::check(image->OpenWrite(lock.put()));
    data = lock->Data(0);
}

com_ptr<IPixmat2> with_bits(IPixmat2* image, int bits)
{
    image_layout layout = layout_of(image);
    com_ptr<IPixmatLock> lock;
    zelt::check(image->OpenWrite(lock.put()));
    layout.bits = bits;
    uint8_t* data = lock->Data(0);
    // The lock keeps the first image and its memory alive for as long as the second wants them.
    const auto release = [](void* context) noexcept {
        com_ptr<IPixmatLock>::attach(static_cast<IPixmatLock*>(context));
    };
    com_ptr<IPixmat2> second = zelt::wrap(data, layout, false, release, lock.get());
    static_cast<void>(lock.detach());
    return second;
}

pixel_rows::pixel_rows(IPixmat2* image) : layout_(layout_of(image))
{
    zelt::check(image->OpenRead(nullptr, 1.0, lock_.put()));
    const auto bytes = static_cast<size_t>(pixel_bytes(layout_));
    row_bytes_ = bytes * static_cast<size_t>(std::max(layout_.width, 0));
    data_ = lock_->Data(0);
    if (layout_.x_stride != pixel_bytes(layout_)) packed_ = std::make_unique<uint8_t[]>(row_bytes_);
}

const uint8_t* pixel_rows::row(int y)
{
    const uint8_t* source = data_ + layout_.offset + int64_t{y} * layout_.y_stride;
    if (!packed_) return source;
    const auto bytes = static_cast<size_t>(pixel_bytes(layout_));
    for (int64_t x = 0; x < layout_.width; ++x)
        std::memcpy(packed_.get() + static_cast<size_t>(x) * bytes, source + x * layout_.x_stride, bytes);
    return packed_.get();
}

} // namespace cli
