// What the tests of the image component share: images made in short, listeners, areas, keys.
#pragma once

#include "com/implements.h"
#include "pixmat/descriptor.h"
#include "support/cases.h"
#include "support/foreign_object.h"
#include "zelt/com/class_registry.h"
#include "zelt/pixmat/pixmat.h"

#include <functional>
#include <string>

namespace Qor::Luxar::Test {

using ZELT::Test::foreign_object;

template <class I>
com_ptr<I> create(const GUID& class_id)
{
    com_ptr<I> object;
    EXPECT_EQ(CoCreateInstance(class_id, nullptr, CLSCTX_ALL, I::iid, object.put_void()), S_OK);
    return object;
}

inline com_ptr<IPixmatDescriptor> descriptor_of(const image_layout& layout)
{
    return make<CPixmatDescriptor>(layout);
}

inline HRESULT try_create(const image_layout& layout, PixmatCreateMode mode, com_ptr<IPixmat2>& image)
{
    return create<IPixmatFactory>(CLSID_PixmatFactory)
        ->Create(descriptor_of(layout).get(), mode, image.put());
}

inline com_ptr<IPixmat2> new_image(const image_layout& layout,
                                   PixmatCreateMode mode = PixmatCreateMode_Layout)
{
    com_ptr<IPixmat2> image;
    EXPECT_EQ(try_create(layout, mode, image), S_OK);
    return image;
}

inline com_ptr<IPixmat2> small_image() { return new_image(packed_layout(4, 3, 8, PixmatEncoding_Unsigned)); }

inline image_layout layout_of(IPixmat2* image)
{
    com_ptr<IPixmatDescriptor> descriptor;
    image_layout layout;
    EXPECT_EQ(image->GetDescriptor(descriptor.put()), S_OK);
    EXPECT_EQ(read_layout(descriptor.get(), layout), S_OK);
    return layout;
}

inline com_ptr<IPixmatLock> open_read(IPixmat2* image)
{
    com_ptr<IPixmatLock> lock;
    EXPECT_EQ(image->OpenRead(nullptr, 1.0, lock.put()), S_OK);
    return lock;
}

inline com_ptr<IPixmatLock> open_write(IPixmat2* image)
{
    com_ptr<IPixmatLock> lock;
    EXPECT_EQ(image->OpenWrite(lock.put()), S_OK);
    return lock;
}

/// A foreign rectangle whose getters can fail.
class area_stub final : public foreign_object<IRectangle> {
public:
    explicit area_stub(rectangle r, HRESULT answer = S_OK) : r_(r), answer_(answer) {}

    HRESULT get_Left(LONG* value) noexcept override { return give(r_.left, value); }
    HRESULT get_Top(LONG* value) noexcept override { return give(r_.top, value); }
    HRESULT get_Right(LONG* value) noexcept override { return give(r_.right, value); }
    HRESULT get_Bottom(LONG* value) noexcept override { return give(r_.bottom, value); }
    HRESULT put_Left(LONG) noexcept override { return E_NOTIMPL; }
    HRESULT put_Top(LONG) noexcept override { return E_NOTIMPL; }
    HRESULT put_Right(LONG) noexcept override { return E_NOTIMPL; }
    HRESULT put_Bottom(LONG) noexcept override { return E_NOTIMPL; }

private:
    HRESULT give(int32_t field, LONG* value) const noexcept
    {
        *value = field;
        return answer_;
    }
    rectangle r_;
    HRESULT answer_;
};

/// Calls a function of the test.
class listener final : public implements<IPixmatEvents> {
public:
    using function = std::function<void(IPixmat2*, const rectangle*)>;
    explicit listener(function f) : function_(std::move(f)) {}

    HRESULT OnPixmatChanged(IPixmat2* image, const rectangle* changed) noexcept override
    {
        function_(image, changed);
        return E_FAIL; // nobody looks at it
    }

private:
    function function_;
};

} // namespace Qor::Luxar::Test
