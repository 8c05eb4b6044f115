// How the library opens images and makes new ones. Output first, then input; locks go in reverse order at the end
// of the scope, and Commit comes before.
#pragma once

#include "frame/errors.h"
#include "pixel/memory_2d.h"
#include "zelt/pixmat/pixmat.h"

namespace Qor::Luxar::ZELT {

/// The layout of an image as it is now. The first failure of the descriptor is the answer; null is E_INVALIDARG.
HRESULT ReadLayout(IPixmat2* image, image_layout* layout) noexcept;
HRESULT ReadLayout(IPixmatDescriptor* descriptor, image_layout* layout) noexcept;

/// Joins a view to what keeps it valid. Lock goes first, then the image. Moves, but has no copies.
class ImageReadAccess {
public:
    /// Throws std::invalid_argument "null IPixmat2", or HResultException for what the image answers.
    explicit ImageReadAccess(IPixmat2* image);
    ImageReadAccess(ImageReadAccess&&) noexcept = default;

    const memory_2d& view() const noexcept { return view_; }

private:
    com_ptr<IPixmat2> image_;
    com_ptr<IPixmatLock> lock_;
    memory_2d view_;
};

class ImageWriteAccess {
public:
    explicit ImageWriteAccess(IPixmat2* image);
    ImageWriteAccess(ImageWriteAccess&&) noexcept = default;

    const memory_2d& view() const noexcept { return view_; }
    IPixmat2* image() const noexcept { return image_.get(); }

    /// Once, when the result is complete. Null means that the whole image changed.
    HRESULT Commit(const rectangle* changed = nullptr) noexcept { return lock_->Commit(changed); }

private:
    com_ptr<IPixmat2> image_;
    com_ptr<IPixmatLock> lock_;
    memory_2d view_;
};

/// An image with exactly this layout, strides included.
HRESULT CreateImageFromLayout(const image_layout& layout, IPixmat2** out) noexcept;

/// A packed image of this size and type, with the bits of its storage. Throws.
ImageWriteAccess CreateImageOfType(size s, pixel_type type);

/// For methods with an optional descriptor: null means the input's layout. A descriptor of another size answers
/// E_SIZE_MISMATCH, which each method turns into its own words.
HRESULT CreateFromDescriptor(IPixmat2* input, IPixmatDescriptor* descriptor, IPixmat2** out) noexcept;

/// The image that receives a result: `out` when it is given, whatever its size and type, else a new one like the input.
/// Nominal bits are not carried across: a 12-bit input gives a 16-bit output.
ImageWriteAccess ResolveOutput(IPixmat2* input, IPixmat2* out);
ImageWriteAccess ResolveOutputSized(IPixmat2* input, IPixmat2* out, size s);
ImageWriteAccess ResolveOutputTyped(IPixmat2* out, size s, pixel_type type);

/// A new object of a creatable class. Failures throw with the description "CoCreateInstance({...})".
template <class Interface>
com_ptr<Interface> create_instance(const GUID& class_id);

namespace detail {
void create_instance(const GUID& class_id, const GUID& interface_id, void** out);
}

template <class Interface>
com_ptr<Interface> create_instance(const GUID& class_id)
{
    com_ptr<Interface> object;
    detail::create_instance(class_id, Interface::iid, object.put_void());
    return object;
}

} // namespace Qor::Luxar::ZELT
