#include "frame/image_access.h"

#include "frame/operation.h"
#include "pixmat/descriptor.h"
#include "zelt/com/class_registry.h"

namespace Qor::Luxar::ZELT {
namespace {

image_layout layout_of(IPixmat2* image)
{
    if (!image) throw std::invalid_argument("null IPixmat2");
    image_layout layout;
    CheckHResult(ReadLayout(image, &layout));
    return layout;
}

memory_2d open(IPixmat2* image, IPixmatLock* lock) { return view_of(layout_of(image), lock->Data(0)); }

com_ptr<IPixmatDescriptor> make_descriptor(const image_layout& layout)
{
    auto descriptor = create_instance<IPixmatDescriptor>(CLSID_PixmatDescriptor);
    CheckHResult(descriptor->put_Width(layout.width));
    CheckHResult(descriptor->put_Height(layout.height));
    CheckHResult(descriptor->put_Bits(layout.bits));
    CheckHResult(descriptor->put_Encoding(layout.encoding));
    CheckHResult(descriptor->put_Offset(layout.offset));
    CheckHResult(descriptor->put_XStride(layout.x_stride));
    CheckHResult(descriptor->put_YStride(layout.y_stride));
    return descriptor;
}

com_ptr<IPixmat2> create(const image_layout& layout, PixmatCreateMode mode)
{
    const auto factory = create_instance<IPixmatFactory>(CLSID_PixmatFactory);
    com_ptr<IPixmat2> image;
    CheckHResult(factory->Create(make_descriptor(layout).get(), mode, image.put()));
    return image;
}

} // namespace

HRESULT ReadLayout(IPixmat2* image, image_layout* layout) noexcept
{
    if (!image) return E_INVALIDARG;
    com_ptr<IPixmatDescriptor> descriptor;
    if (const HRESULT hr = image->GetDescriptor(descriptor.put()); failed(hr)) return hr;
    return ReadLayout(descriptor.get(), layout);
}

HRESULT ReadLayout(IPixmatDescriptor* descriptor, image_layout* layout) noexcept
{
    return descriptor ? read_layout(descriptor, *layout) : E_INVALIDARG;
}

ImageReadAccess::ImageReadAccess(IPixmat2* image) : image_(image)
{
    if (!image) throw std::invalid_argument("null IPixmat2");
    CheckHResult(image->OpenRead(nullptr, 1.0, lock_.put()));
    view_ = open(image, lock_.get());
}

ImageWriteAccess::ImageWriteAccess(IPixmat2* image) : image_(image)
{
    if (!image) throw std::invalid_argument("null IPixmat2");
    CheckHResult(image->OpenWrite(lock_.put()));
    view_ = open(image, lock_.get());
}

HRESULT CreateImageFromLayout(const image_layout& layout, IPixmat2** out) noexcept
{
    if (!out) return E_POINTER;
    return run_frame(IPixmat2::iid, [&] {
        *out = create(layout, PixmatCreateMode_Layout).detach();
        return S_OK;
    });
}

ImageWriteAccess CreateImageOfType(size s, pixel_type type)
{
    const com_ptr<IPixmat2> image =
        create(packed_layout(s.width, s.height, GetPixmatBits(type), GetPixmatEncoding(type)),
               PixmatCreateMode_Packed);
    return ImageWriteAccess(image.get());
}

HRESULT CreateFromDescriptor(IPixmat2* input, IPixmatDescriptor* descriptor, IPixmat2** out) noexcept
{
    image_layout layout;
    if (const HRESULT hr = ReadLayout(input, &layout); failed(hr)) return hr;
    if (descriptor) {
        const size wanted{layout.width, layout.height};
        if (const HRESULT hr = ReadLayout(descriptor, &layout); failed(hr)) return hr;
        if (layout.width != wanted.width || layout.height != wanted.height) return E_SIZE_MISMATCH;
    }
    return CreateImageFromLayout(layout, out);
}

ImageWriteAccess ResolveOutput(IPixmat2* input, IPixmat2* out)
{
    if (out) return ImageWriteAccess(out);
    const image_layout layout = layout_of(input);
    return CreateImageOfType({layout.width, layout.height}, GetPixelType(layout.encoding, layout.bits));
}

ImageWriteAccess ResolveOutputSized(IPixmat2* input, IPixmat2* out, size s)
{
    if (out) return ImageWriteAccess(out);
    const image_layout layout = layout_of(input);
    return CreateImageOfType(s, GetPixelType(layout.encoding, layout.bits));
}

ImageWriteAccess ResolveOutputTyped(IPixmat2* out, size s, pixel_type type)
{
    return out ? ImageWriteAccess(out) : CreateImageOfType(s, type);
}

void detail::create_instance(const GUID& class_id, const GUID& interface_id, void** out)
{
    const HRESULT hr = CoCreateInstance(class_id, nullptr, CLSCTX_ALL, interface_id, out);
    if (succeeded(hr)) return;
    char name[39];
    guid_to_text(class_id, name);
    CheckHResult(hr, L"CoCreateInstance(" + widen(name) + L")");
}

} // namespace Qor::Luxar::ZELT
