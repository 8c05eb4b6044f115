#include "conversions/conversions.h"

#include "conversions/overlap.h"
#include "frame/operation.h"
#include "frame/value_objects.h"
#include "pixmat/image.h"

namespace Qor::Luxar::ZELT {
namespace {

using Common::optional_point;
using Common::optional_rectangle;

using converter_operation = HRESULT (IPixmatConverter::*)(const image_layout&, const void*,
                                                          const image_layout&, void*, const rectangle*,
                                                          const coordinate<int32_t>*) noexcept;

/// One of the two conversions: what the image component's converter does, and whether images of one format are copied
/// without it.
struct conversion {
    converter_operation operation;
    bool copies_equal_formats;
};

constexpr conversion recode{&IPixmatConverter::ConvertRecode, true};
constexpr conversion cast{&IPixmatConverter::ConvertCast, false};

bool equal_formats(const image_layout& a, const image_layout& b)
{
    return a.width == b.width && a.height == b.height &&
           GetPixelType(a.encoding, a.bits) == GetPixelType(b.encoding, b.bits);
}

com_ptr<IPixmatLock> open_write(IPixmat2* image)
{
    com_ptr<IPixmatLock> lock;
    CheckHResult(image->OpenWrite(lock.put()));
    return lock;
}

/// Writes a region to an image of its own and then to its place, when the source is in the way.
/// `write` takes the target and a point in it.
template <class Write>
HRESULT write_aside(Write&& write, const image_pixels& to, const rectangle& place)
{
    image_pixels part = to;
    part.layout.width = place.right - place.left;
    part.layout.height = place.bottom - place.top;
    part.data += int64_t{place.left} * to.layout.x_stride + int64_t{place.top} * to.layout.y_stride;

    com_ptr<IPixmat2> image;
    CheckHResult(create_packed_image(part.layout, pixel_buffer::zeroed, image.put()));
    const com_ptr<IPixmatLock> lock = open_write(image.get());
    const image_pixels aside{
        packed_layout(part.layout.width, part.layout.height, to.layout.bits, to.layout.encoding),
        lock->Data(0)};
    const HRESULT hr = write(aside, coordinate<int32_t>{});
    if (succeeded(hr)) copy_pixels(part.layout, part.data, aside.layout, aside.data);
    return hr;
}

HRESULT convert(const conversion& how, IPixmat2* dst, IPixmat2* src, IRectangle* area, ICoordinateInt* point)
{
    if (!dst || !src) return E_INVALIDARG;
    image_pixels to{};
    image_pixels from{};
    CheckHResult(ReadLayout(dst, &to.layout));
    CheckHResult(ReadLayout(src, &from.layout));
    const optional_rectangle src_area(area);
    const optional_point dst_point(point);

    com_ptr<IPixmatLock> reading;
    CheckHResult(src->OpenRead(area, 1.0, reading.put()));
    const com_ptr<IPixmatLock> writing = open_write(dst);
    from.data = reading->Data(0);
    to.data = writing->Data(0);

    const conversion_regions regions =
        compute_regions(from.layout, to.layout, src_area.get(), dst_point.get());
    com_ptr<IPixmatConverter> converter;
    if (!how.copies_equal_formats || area || point || !equal_formats(to.layout, from.layout))
        converter = create_instance<IPixmatConverter>(CLSID_PixmatConverter);
    const auto write = [&](const image_pixels& target, const coordinate<int32_t>& place) -> HRESULT {
        if (converter)
            return (converter.get()->*how.operation)(from.layout, from.data, target.layout, target.data,
                                                     &regions.source, &place);
        copy_pixels(target.layout, target.data, from.layout, from.data);
        return S_OK;
    };
    const HRESULT hr = writes_over_source(from, to, regions) ? write_aside(write, to, regions.target)
                                                             : write(to, regions.target_point);
    return failed(hr) ? hr : writing->Commit(&regions.target);
}

HRESULT convert_to_new(const conversion& how, IPixmat2* in, IPixmatDescriptor* descriptor, IRectangle* area,
                       ICoordinateInt* point, IPixmat2** out)
{
    if (!in || !descriptor) return E_INVALIDARG;
    if (!out) return E_POINTER;
    image_layout layout;
    CheckHResult(ReadLayout(descriptor, &layout));
    com_ptr<IPixmat2> image;
    CheckHResult(CreateImageFromLayout(layout, image.put()));
    const HRESULT hr = convert(how, image.get(), in, area, point);
    if (succeeded(hr)) *out = image.detach();
    return hr;
}

} // namespace

HRESULT CConversions2::Recode(IPixmat2* pIDstImage, IPixmat2* pISrcImage, IRectangle* pISrcArea,
                              ICoordinateInt* pIDstPoint) noexcept
{
    return run_frame(IConversions2::iid,
                     [&] { return convert(recode, pIDstImage, pISrcImage, pISrcArea, pIDstPoint); });
}

HRESULT CConversions2::RecodeEx(IPixmat2* pIIn, IPixmatDescriptor* pIDescr, IRectangle* pISrcArea,
                                ICoordinateInt* pIDstPoint, IPixmat2** ppIOut) noexcept
{
    return run_frame(IConversions2::iid,
                     [&] { return convert_to_new(recode, pIIn, pIDescr, pISrcArea, pIDstPoint, ppIOut); });
}

HRESULT CConversions2::Cast(IPixmat2* pIDstImage, IPixmat2* pISrcImage, IRectangle* pISrcArea,
                            ICoordinateInt* pIDstPoint) noexcept
{
    return run_frame(IConversions2::iid,
                     [&] { return convert(cast, pIDstImage, pISrcImage, pISrcArea, pIDstPoint); });
}

HRESULT CConversions2::CastEx(IPixmat2* pIIn, IPixmatDescriptor* pIDescr, IRectangle* pISrcArea,
                              ICoordinateInt* pIDstPoint, IPixmat2** ppIOut) noexcept
{
    return run_frame(IConversions2::iid,
                     [&] { return convert_to_new(cast, pIIn, pIDescr, pISrcArea, pIDstPoint, ppIOut); });
}

} // namespace Qor::Luxar::ZELT
