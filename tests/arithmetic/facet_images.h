// Images for the facets of arithmetic.
#pragma once

#include "frame/image_access.h"
#include "support/cases.h"
#include "support/foreign_image.h"

namespace Qor::Luxar::ZELT::Test {

inline constexpr size small{4, 3};

/// A new image of the library, all of one value.
template <class T>
com_ptr<IPixmat2> image(PixmatEncoding encoding, T value, size s = small, int32_t bits = 8 * sizeof(T))
{
    com_ptr<IPixmat2> made;
    CheckHResult(CreateImageFromLayout(packed_layout(s.width, s.height, bits, encoding), made.put()));
    ImageWriteAccess access(made.get());
    for (int i = 0; i < s.width * s.height; ++i)
        std::memcpy(access.view().data + i * static_cast<int64_t>(sizeof(T)), &value, sizeof(T));
    CheckHResult(access.Commit());
    return made;
}

template <class T>
T pixel_of(const com_ptr<IPixmat2>& i, int x = 0, int y = 0)
{
    const ImageReadAccess access(i.get());
    const auto& v = access.view();
    T value;
    std::memcpy(&value, v.data + v.offset + y * v.y_stride + x * v.x_stride, sizeof value);
    return value;
}

template <class T>
com_ptr<foreign_image> object(const test_image<T>& i, failing where = failing::nothing)
{
    return com_ptr<foreign_image>::attach(new foreign_image(i.layout(), i.data(), where));
}

} // namespace Qor::Luxar::ZELT::Test
