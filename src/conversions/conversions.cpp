#include "conversions/conversions.h"

#include "conversions/regions.h"
#include "frame/operation.h"
#include "frame/value_objects.h"

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

HRESULT convert(const conversion& how, IPixmat2* dst, IPixmat2* src, IRectangle* area, ICoordinateInt* point)
{
    if (!dst || !src) return E_INVALIDARG;
    image_layout to;
    image_layout from;
    CheckHResult(ReadLayout(dst, &to));
    CheckHResult(ReadLayout(src, &from));
    const optional_rectangle src_area(area);
    const optional_point dst_point(point);

    com_ptr<IPixmatLock> reading;
    com_ptr<IPixmatLock> writing;
    CheckHResult(src->OpenRead(area, 1.0, reading.put()));
    CheckHResult(dst->OpenWrite(writing.put()));

    if (how.copies_equal_formats && !area && !point && equal_formats(to, from)) {
        copy_pixels(to, writing->Data(0), from, reading->Data(0));
        return writing->Commit(nullptr);
    }
    const conversion_regions regions = compute_regions(from, to, src_area.get(), dst_point.get());
    const auto converter = create_instance<IPixmatConverter>(CLSID_PixmatConverter);
    const HRESULT hr = (converter.get()->*how.operation)(from, reading->Data(0), to, writing->Data(0),
                                                         &regions.source, &regions.target_point);
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
