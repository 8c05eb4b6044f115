#include "arithmetic/basic2.h"

#include "arithmetic/by_codes.h"
#include "arithmetic/kernels/plane.h"
#include "arithmetic/kernels/thresholds.h"
#include "frame/operation.h"
#include "zelt/com/class_registry.h"
#include "zelt/interfaces/zelt.h"

#include <cstring>
#include <limits>

namespace Qor::Luxar::ZELT {
namespace {

using Arithmetic::threshold_limits;

HRESULT refuse(const wchar_t* text) noexcept
{
    return ReportError(CLSID_ZELT, text, IBasicOps::iid, E_INVALIDARG);
}

/// An input and the image that receives the result, open. One image in both places has one lock.
struct open_images {
    com_ptr<IPixmat2> output;
    com_ptr<IPixmatLock> write, read;
    image_layout from, to;
    uint8_t* source = nullptr;
    uint8_t* target = nullptr;
    bool in_place = false;
    std::optional<Arithmetic::stable_operand> stable;

    HRESULT open(IPixmat2* input, IPixmat2* given)
    {
        if (const HRESULT hr = ReadLayout(input, &from); failed(hr)) return hr;
        output = com_ptr<IPixmat2>(given);
        in_place = same_object(input, given);
        to = from;
        HRESULT hr = S_OK;
        if (!given)
            hr = CreateImageFromLayout(from, output.put());
        else if (!in_place)
            hr = ReadLayout(given, &to);
        if (succeeded(hr)) hr = output->OpenWrite(write.put());
        if (failed(hr)) return hr;
        source = target = write->Data(0);
        if (in_place) return S_OK;
        hr = input->OpenRead(nullptr, 1.0, read.put());
        if (succeeded(hr)) source = read->Data(0);
        return hr;
    }

    HRESULT finish(IPixmat2** result)
    {
        if (const HRESULT hr = write->Commit(nullptr); failed(hr)) return hr;
        if (result) output.copy_to(result);
        return S_OK;
    }

    bool same_size() const { return from.width == to.width && from.height == to.height; }

    /// The views of pixels that can be compared with limits: E_NOTIMPL for an input of another kind, E_INVALIDARG
    /// for an output of another size or type. Images that share memory in part give what separate ones would.
    HRESULT compare(memory_2d* src, memory_2d* dst)
    {
        const auto in = Arithmetic::view_by_depth_class(from, source);
        if (!in) return E_NOTIMPL;
        const auto out = Arithmetic::view_by_depth_class(to, target);
        if (!out || out->type != in->type || !same_size()) return E_INVALIDARG;
        const int64_t pixel_bytes = GetPixmatBits(in->type) / 8;
        stable.emplace(Arithmetic::image{from, source}, pixel_bytes, Arithmetic::image{to, target},
                       pixel_bytes);
        *src = *Arithmetic::view_by_depth_class(stable->pixels().layout, stable->pixels().data);
        *dst = *out;
        return S_OK;
    }
};

/// A value as a pixel's type has it.
template <class T>
bool coerce(const VARIANT& v, VARTYPE type, T VARIANT::*member, double* value) noexcept
{
    variant converted;
    if (failed(VariantChangeType(converted.put(), &v, 0, type))) return false;
    *value = static_cast<double>(converted.get()->*member);
    return true;
}

bool coerce(const VARIANT& v, pixel_type type, double* value) noexcept
{
    switch (type) {
    case pixel_type::unsigned_8: return coerce(v, VT_UI1, &VARIANT::bVal, value);
    case pixel_type::unsigned_16: return coerce(v, VT_UI2, &VARIANT::uiVal, value);
    case pixel_type::unsigned_32: return coerce(v, VT_UI4, &VARIANT::ulVal, value);
    case pixel_type::signed_8: return coerce(v, VT_I1, &VARIANT::cVal, value);
    case pixel_type::signed_16: return coerce(v, VT_I2, &VARIANT::iVal, value);
    case pixel_type::signed_32: return coerce(v, VT_I4, &VARIANT::lVal, value);
    case pixel_type::float_32: return coerce(v, VT_R4, &VARIANT::fltVal, value);
    default: return coerce(v, VT_R8, &VARIANT::dblVal, value);
    }
}

/// What cannot be converted is the end of the type's range on its side.
double lower(const VARIANT& v, pixel_type type)
{
    double value = 0;
    if (!coerce(v, type, &value))
        switch_scalar(
            type, [&]<class T>(pixel<T>) { value = static_cast<double>(std::numeric_limits<T>::lowest()); });
    return value;
}
double upper(const VARIANT& v, pixel_type type)
{
    double value = 0;
    if (!coerce(v, type, &value))
        switch_scalar(type,
                      [&]<class T>(pixel<T>) { value = static_cast<double>(std::numeric_limits<T>::max()); });
    return value;
}

/// Opens the images, thresholds at what limits(source view) says, and hands the result out. Failures are thrown.
template <class Limits>
HRESULT threshold_method(IPixmat2* input, IPixmat2* given, IPixmat2** result, Limits&& limits) noexcept
{
    if (!input) return E_INVALIDARG;
    return run_frame(IBasicOps2::iid, [&] {
        open_images images;
        CheckHResult(images.open(input, given));
        memory_2d src, dst;
        if (const HRESULT hr = images.compare(&src, &dst); failed(hr)) throw HResultException(hr);
        Arithmetic::threshold(src, limits(src), dst);
        CheckHResult(images.finish(result));
        return S_OK;
    });
}

/// Depths that the converter does not know are copied byte by byte, into an image of the same kind.
HRESULT copy_unsigned(const open_images& images)
{
    com_ptr<IPixmatConverter> converter;
    HRESULT hr = CoCreateInstance(CLSID_PixmatConverter, nullptr, CLSCTX_ALL, IPixmatConverter::iid,
                                  converter.put_void());
    if (succeeded(hr))
        hr = converter->ConvertRecode(images.from, images.source, images.to, images.target, nullptr, nullptr);
    const image_layout &from = images.from, &to = images.to;
    if (hr != E_NOTIMPL || from.encoding != to.encoding || from.bits != to.bits) return hr;
    for (int64_t y = 0; y < from.height; ++y)
        for (int64_t x = 0; x < from.width; ++x)
            std::memcpy(images.target + to.offset + y * to.y_stride + x * to.x_stride,
                        images.source + from.offset + y * from.y_stride + x * from.x_stride,
                        static_cast<size_t>(from.bits + 7) / 8);
    return S_OK;
}

HRESULT take_absolute(open_images& images)
{
    if (!images.same_size()) return refuse(L"Abs(): Output image must have same format as input image");
    const image_layout& from = images.from;
    switch (from.encoding) {
    case PixmatEncoding_Unsigned:
        if (from.bits < 1 || from.bits > 32) return E_NOTIMPL;
        return images.in_place ? S_OK : copy_unsigned(images);
    case PixmatEncoding_Signed:
        if (from.bits != 8 && from.bits != 16 && from.bits != 32) return E_NOTIMPL;
        break;
    case PixmatEncoding_Float: break;
    default: return E_NOTIMPL;
    }
    memory_2d src, dst;
    if (const HRESULT hr = images.compare(&src, &dst); failed(hr)) return hr;
    Arithmetic::absolute(src, dst);
    return S_OK;
}

} // namespace

HRESULT CBasic2::Abs(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return by_codes([&] {
        open_images images;
        HRESULT hr = images.open(pIImage, pIOutImg);
        if (succeeded(hr)) hr = take_absolute(images);
        return succeeded(hr) ? images.finish(ppIOut) : hr;
    });
}

HRESULT CBasic2::Threshold(IPixmat2* pIImage, VARIANT lowLimit, VARIANT lowValue, VARIANT highLimit,
                           VARIANT highValue, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return threshold_method(pIImage, pIOutImg, ppIOut, [&](const memory_2d& src) {
        return threshold_limits{lower(lowLimit, src.type), lower(lowValue, src.type),
                                upper(highLimit, src.type), upper(highValue, src.type)};
    });
}

HRESULT CBasic2::Normalize(IPixmat2* pIImage, double low, double high, IPixmat2* pIOutImg,
                           IPixmat2** ppIOut) noexcept
{
    if (!pIImage) return E_INVALIDARG;
    if (low < 0.0 || high > 1.0) return refuse(L"Normalize(): low, high must be in [0, 1] range");
    return by_codes([&] {
        open_images images;
        memory_2d src, dst;
        HRESULT hr = images.open(pIImage, pIOutImg);
        if (succeeded(hr)) hr = images.compare(&src, &dst);
        if (failed(hr)) return hr;
        Arithmetic::normalize(src, low, high, dst);
        return images.finish(ppIOut);
    });
}

HRESULT CBasic2::AutoThreshold(IPixmat2* pIImage, VARIANT belowValue, VARIANT aboveValue,
                               ZELT_AutoThreshold_Method method, IPixmat2* pIOutImg,
                               IPixmat2** ppIOut) noexcept
{
    if (method != ZELT_AutoThreshold_Basic_Global) return E_INVALIDARG;
    return threshold_method(pIImage, pIOutImg, ppIOut, [&](const memory_2d& src) {
        const double limit = Arithmetic::find_threshold(src);
        return threshold_limits{limit, lower(belowValue, src.type), limit, upper(aboveValue, src.type)};
    });
}

} // namespace Qor::Luxar::ZELT
