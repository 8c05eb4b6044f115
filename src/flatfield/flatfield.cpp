#include "flatfield/flatfield.h"

#include "flatfield/kernels/flatten.h"
#include "flatfield/kernels/flatten_double.h"
#include "flatfield/kernels/references.h"
#include "frame/operation.h"

#include <iterator>
#include <utility>

namespace Qor::Luxar::ZELT {
namespace {

using FlatField::image;
using FlatField::outcome;

/// An image of a call, while its lock is held. Failures are answered as they come, without texts of ours.
class operand {
public:
    /// A null image stays absent.
    HRESULT open_to_read(IPixmat2* i) noexcept
    {
        if (!i) return S_OK;
        if (const HRESULT hr = ReadLayout(i, &pixels_.layout); failed(hr)) return hr;
        return opened(i->OpenRead(nullptr, 1.0, lock_.put()));
    }
    HRESULT open_to_write(IPixmat2* i) noexcept
    {
        if (const HRESULT hr = ReadLayout(i, &pixels_.layout); failed(hr)) return hr;
        return opened(i->OpenWrite(lock_.put()));
    }
    const image& pixels() const noexcept { return pixels_; }
    HRESULT commit() noexcept { return lock_->Commit(nullptr); }

private:
    HRESULT opened(HRESULT hr) noexcept
    {
        if (succeeded(hr)) pixels_.data = lock_->Data(0);
        return hr;
    }

    image pixels_;
    com_ptr<IPixmatLock> lock_;
};

/// The frame of the family: opens the sources in their order, then the destination, calls
/// kernel(dst, sources...) on the pixels and commits what is done. Absent sources stay so.
template <class Kernel, class... Images>
HRESULT flat_field_method(Kernel&& kernel, IPixmat2* dst, Images*... sources) noexcept
{
    return run_frame(IFlatFielding::iid, [&]() -> HRESULT {
        IPixmat2* const given[] = {sources...};
        operand in[sizeof...(sources)];
        operand out;
        for (size_t i = 0; i < sizeof...(sources); ++i)
            if (const HRESULT hr = in[i].open_to_read(given[i]); failed(hr)) return hr;
        if (const HRESULT hr = out.open_to_write(dst); failed(hr)) return hr;

        const outcome o = [&]<size_t... I>(std::index_sequence<I...>)
        {
            return kernel(out.pixels(), in[I].pixels()...);
        }
        (std::index_sequence_for<Images...>());
        if (o == outcome::unsupported) return E_NOTIMPL;
        return o == outcome::done ? out.commit() : E_INVALIDARG;
    });
}

/// Calls method(dst) with a new image like the input, of another encoding, and hands that out.
template <class Method>
HRESULT into_new_image(IPixmat2* input, PixmatEncoding encoding, IPixmat2** result, Method&& method) noexcept
{
    if (!input) return E_INVALIDARG;
    if (!result) return E_POINTER;
    image_layout layout;
    if (const HRESULT hr = ReadLayout(input, &layout); failed(hr)) return hr;
    layout.encoding = encoding;
    com_ptr<IPixmat2> dst;
    if (const HRESULT hr = CreateImageFromLayout(layout, dst.put()); failed(hr)) return hr;
    const HRESULT hr = method(dst.get());
    if (succeeded(hr)) *result = dst.detach();
    return hr;
}

} // namespace

HRESULT CFlatFielding::ToDarkRef(IPixmat2* pIDstImage, IPixmat2* pISrcImage, LONG offset) noexcept
{
    if (!pIDstImage || !pISrcImage) return E_INVALIDARG;
    return flat_field_method(
        [=](const image& dst, const image& src) { return FlatField::to_dark_ref(dst, src, offset); },
        pIDstImage, pISrcImage);
}

HRESULT CFlatFielding::ToDarkRefEx(IPixmat2* pIIn, PixmatEncoding encoding, LONG offset,
                                   IPixmat2** ppIOut) noexcept
{
    return into_new_image(pIIn, encoding, ppIOut,
                          [&](IPixmat2* dst) { return ToDarkRef(dst, pIIn, offset); });
}

HRESULT CFlatFielding::ToGainRef(IPixmat2* pIDstImage, IPixmat2* pISrcImage, double Norm,
                                 LONG scaleFactor) noexcept
{
    if (!pIDstImage || !pISrcImage) return E_INVALIDARG;
    return flat_field_method(
        [=](const image& dst, const image& src) {
            return FlatField::to_gain_ref(dst, src, Norm, scaleFactor);
        },
        pIDstImage, pISrcImage);
}

HRESULT CFlatFielding::ToGainRefEx(IPixmat2* pIIn, PixmatEncoding encoding, double Norm, LONG scaleFactor,
                                   IPixmat2** ppIOut) noexcept
{
    return into_new_image(pIIn, encoding, ppIOut,
                          [&](IPixmat2* dst) { return ToGainRef(dst, pIIn, Norm, scaleFactor); });
}

HRESULT CFlatFielding::Flatten(IPixmat2* pIDstImage, IPixmat2* pISrcImage, IPixmat2* pIDarkRefImage,
                               IPixmat2* pIGainRefImage, LONG scaleFactor) noexcept
{
    if (!pIDstImage || !pISrcImage || !pIDarkRefImage) return E_INVALIDARG;
    return flat_field_method(
        [&](const image& dst, const image& src, const image& dark, const image& gain) {
            return FlatField::flatten(dst, src, dark, gain, scaleFactor, &pool_);
        },
        pIDstImage, pISrcImage, pIDarkRefImage, pIGainRefImage);
}

HRESULT CFlatFielding::FlattenEx(IPixmat2* pIIn, PixmatEncoding encoding, IPixmat2* pIDarkRefImage,
                                 IPixmat2* pIGainRefImage, LONG scaleFactor, IPixmat2** ppIOut) noexcept
{
    return into_new_image(pIIn, encoding, ppIOut, [&](IPixmat2* dst) {
        return Flatten(dst, pIIn, pIDarkRefImage, pIGainRefImage, scaleFactor);
    });
}

HRESULT CFlatFielding::FlattenDouble(IPixmat2* pIDstImage, IPixmat2* pISrcImageLong,
                                     IPixmat2* pISrcImageShort, double scaleFactorShortExposure,
                                     IPixmat2* pIDarkRefImage, IPixmat2* pIGainRefImage,
                                     LONG scaleFactor) noexcept
{
    if (!pIDstImage || !pISrcImageLong) return E_INVALIDARG;
    const HRESULT checked = run_frame(IFlatFielding::iid, [&] {
        IPixmat2* const given[] = {pIDstImage, pISrcImageLong, pISrcImageShort, pIDarkRefImage,
                                   pIGainRefImage};
        image_layout layouts[std::size(given)];
        const auto layout_of = [&](size_t i) { return given[i] ? &layouts[i] : nullptr; };
        for (size_t i = 0; i < std::size(given); ++i) {
            if (const HRESULT hr = given[i] ? ReadLayout(given[i], &layouts[i]) : S_OK; failed(hr)) return hr;
            if (i == 0) FlatField::check_merge_destination(layouts[0]);
        }
        FlatField::check_merge({layout_of(0), layout_of(1), layout_of(2), layout_of(3), layout_of(4)});
        return S_OK;
    });
    if (failed(checked)) return checked;
    return flat_field_method(
        [&](const image& dst, const image& long_exposure, const image& short_exposure, const image& dark,
            const image& gain) {
            return FlatField::flatten_double(dst, long_exposure, short_exposure, scaleFactorShortExposure,
                                             dark, gain, scaleFactor, &pool_);
        },
        pIDstImage, pISrcImageLong, pISrcImageShort, pIDarkRefImage, pIGainRefImage);
}

} // namespace Qor::Luxar::ZELT
