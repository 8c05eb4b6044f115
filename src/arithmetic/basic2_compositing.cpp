// Methods of the facets that put images together.
#include "arithmetic/basic.h"
#include "arithmetic/basic2.h"
#include "arithmetic/kernels/blend.h"
#include "arithmetic/kernels/equals.h"
#include "arithmetic/kernels/modulate.h"
#include "arithmetic/kernels/offset.h"
#include "arithmetic/kernels/padding.h"
#include "arithmetic/kernels/plane.h"
#include "frame/operation.h"
#include "frame/value_objects.h"
#include "zelt/interfaces/zelt.h"

#include <cmath>

namespace Qor::Luxar::ZELT {
namespace {

using Arithmetic::image;
using Arithmetic::outcome;
using Arithmetic::real_storage_of;
using Arithmetic::storage;

HRESULT refuse(const wchar_t* text, HRESULT code) noexcept
{
    return ReportError(CLSID_ZELT, text, IBasicOps::iid, code);
}

image_layout layout_of(IPixmat2* image)
{
    image_layout layout;
    CheckHResult(ReadLayout(image, &layout));
    return layout;
}

bool same_size(const image_layout& a, const image_layout& b)
{
    return a.width == b.width && a.height == b.height;
}

bool same_format(const image_layout& a, const image_layout& b)
{
    return a.encoding == b.encoding && a.bits == b.bits && same_size(a, b);
}

bool is_real(const image_layout& layout) { return real_storage_of(layout) != storage::none; }

/// The given image, whose layout this is, or a new one with that layout, open for writing.
class output {
public:
    output(IPixmat2* given, const image_layout& layout) : object_(given)
    {
        if (!object_) CheckHResult(CreateImageFromLayout(layout, object_.put()));
        CheckHResult(object_->OpenWrite(lock_.put()));
        pixels_ = {layout, lock_->Data(0)};
    }

    IPixmat2* object() const noexcept { return object_.get(); }
    const image& pixels() const noexcept { return pixels_; }

    /// The image goes to *result, unless that is null.
    HRESULT commit(IPixmat2** result)
    {
        CheckHResult(lock_->Commit(nullptr));
        if (result) object_.copy_to(result);
        return S_OK;
    }

private:
    com_ptr<IPixmat2> object_;
    com_ptr<IPixmatLock> lock_;
    image pixels_;
};

/// An image open for reading, unless it is the output, which is open already.
class input {
public:
    input(IPixmat2* object, const image_layout& layout, const output* out = nullptr)
    {
        if (!out || !same_object(object, out->object()))
            CheckHResult(object->OpenRead(nullptr, 1.0, lock_.put()));
        pixels_ = {layout, lock_ ? lock_->Data(0) : out->pixels().data};
    }

    const image& pixels() const noexcept { return pixels_; }

private:
    com_ptr<IPixmatLock> lock_;
    image pixels_;
};

/// Hands out what was done; a null result is E_POINTER, but only now.
HRESULT finish(output& out, IPixmat2** result)
{
    const HRESULT hr = out.commit(result);
    return result ? hr : E_POINTER;
}

HRESULT add_offset(IPixmat2* pIA, IPixmat2* pIB, coordinate<double> position, double fa, double fb)
{
    const image_layout a = layout_of(pIA), b = layout_of(pIB);
    if (!Arithmetic::takes_offset(a, b)) return E_NOTIMPL;
    if (!Arithmetic::reaches(a, b, position)) return S_OK;
    output target(pIA, a);
    const input added(pIB, b, &target);
    Arithmetic::add_offset(target.pixels(), added.pixels(), position, fa, fb);
    return target.commit(nullptr);
}

/// A view of real pixels as the kernels of arithmetic take it.
image image_of(const memory_2d& v)
{
    return {{v.width, v.height, GetPixmatBits(v.type), GetPixmatEncoding(v.type), 0,
             static_cast<int32_t>(v.x_stride), static_cast<int32_t>(v.y_stride)},
            v.data + v.offset};
}

/// Width and height of a rectangle, whose sides may be further apart than 32 bits tell.
coordinate<int64_t> extent_of(const rectangle& r)
{
    const coordinate<int64_t> extent{int64_t{r.right} - r.left, int64_t{r.bottom} - r.top};
    if (extent.x < 0 || extent.y < 0) throw HResultException(E_INVALIDARG);
    return extent;
}

ImageWriteAccess resolve_extended(IPixmat2* pIImage, IPixmat2* pIOut, coordinate<int64_t> extent)
{
    if (!pIOut && (extent.x > INT32_MAX || extent.y > INT32_MAX)) throw std::bad_alloc();
    return ResolveOutputSized(pIImage, pIOut,
                              {static_cast<int32_t>(extent.x), static_cast<int32_t>(extent.y)});
}

} // namespace

HRESULT CBasic2::AddOffset(IPixmat2* pIA, IPixmat2* pIB, ICoordinateFloat* pIPos, double fa,
                           double fb) noexcept
{
    return run_frame(IBasicOps2::iid, [&]() -> HRESULT {
        coordinate<double> position;
        if (!pIA || !pIB) return E_INVALIDARG;
        if (const HRESULT hr = Common::ReadValue(pIPos, &position); failed(hr)) return hr;
        return add_offset(pIA, pIB, position, fa, fb);
    });
}

HRESULT CBasic::AddOffset(IPixmat2* pIA, IPixmat2* pIB, ICoordinateFloat* pIPos, ZELT_Offset mode) noexcept
{
    return run_frame(IBasicOps::iid, [&]() -> HRESULT {
        coordinate<double> position;
        if (!pIA || !pIB) return E_INVALIDARG;
        if (mode != ZELT_Offset_Integer && mode != ZELT_Offset_SubPixel) return E_INVALIDARG;
        if (const HRESULT hr = Common::ReadValue(pIPos, &position); failed(hr)) return hr;
        if (mode == ZELT_Offset_Integer) position = {std::floor(position.x), std::floor(position.y)};
        return add_offset(pIA, pIB, position, 1, 1);
    });
}

HRESULT CBasic2::AddIntegerOffset(IPixmat2* pIA, IPixmat2* pIB, ICoordinateInt* pIPos, double fa, double fb,
                                  IPixmat2* pIOut, IPixmat2** ppIOut) noexcept
{
    return run_frame(IBasicOps2::iid, [&]() -> HRESULT {
        if (!pIOut && !ppIOut) return E_POINTER;
        const image_layout a = layout_of(pIA), b = layout_of(pIB), to = pIOut ? layout_of(pIOut) : a;
        if (!same_size(a, to))
            return refuse(L"AddIntegerOffset: Source and destination image must be equal in size",
                          E_INVALIDARG);
        coordinate<int32_t> position;
        if (pIPos)
            if (const HRESULT hr = Common::ReadValue(pIPos, &position); failed(hr)) return hr;
        if (!is_real(a) || !is_real(b)) return E_NOTIMPL;
        if (real_storage_of(to) != real_storage_of(a)) return E_INVALIDARG;
        output out(pIOut, to);
        const input first(pIA, a, &out), second(pIB, b, &out);
        Arithmetic::add_integer_offset(first.pixels(), second.pixels(), position, fa, fb, out.pixels());
        return out.commit(ppIOut);
    });
}

HRESULT CBasic2::Equals(IPixmat2* pIImgA, IPixmat2* pIImgB, VARIANT_BOOL* pResult) noexcept
{
    return run_frame(IBasicOps2::iid, [&]() -> HRESULT {
        if (!pIImgA || !pIImgB) return E_INVALIDARG;
        if (!pResult) return E_POINTER;
        const image_layout a = layout_of(pIImgA), b = layout_of(pIImgB);
        bool same = same_format(a, b);
        if (same) {
            const input first(pIImgA, a), second(pIImgB, b);
            if (Arithmetic::equals(first.pixels(), second.pixels(), &same) != outcome::done) return E_NOTIMPL;
        }
        *pResult = same ? VARIANT_TRUE : VARIANT_FALSE;
        return S_OK;
    });
}

HRESULT CBasic2::Margins(IPixmat2* pIImage, LONG imgMargins, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    if (!pIImage) return E_INVALIDARG;
    return run_frame(IBasicOps2::iid, [&]() -> HRESULT {
        const image_layout from = layout_of(pIImage), to = pIOutImg ? layout_of(pIOutImg) : from;
        if (!same_size(from, to)) return E_INVALIDARG;
        if (!is_real(from)) return E_NOTIMPL;
        if (real_storage_of(to) != real_storage_of(from)) return E_INVALIDARG;
        output out(pIOutImg, to);
        const input source(pIImage, from, &out);
        Arithmetic::set_margins(source.pixels(), imgMargins, out.pixels());
        return finish(out, ppIOut);
    });
}

HRESULT CBasic2::Combine(IPixmat2* pIBaseImage, IPixmat2* pICombineImage, IPixmat2* pIWeightMask,
                         IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    if (!pIBaseImage || !pICombineImage || !pIWeightMask) return E_INVALIDARG;
    return run_frame(IBasicOps2::iid, [&]() -> HRESULT {
        const image_layout base = layout_of(pIBaseImage), other = layout_of(pICombineImage);
        const image_layout mask = layout_of(pIWeightMask);
        if (!same_format(base, other) || !same_format(base, mask))
            return refuse(L"all input images must be of the same format", E_INVALIDARG);
        const image_layout to = pIOutImg ? layout_of(pIOutImg) : base;
        if (!same_format(base, to))
            return refuse(L"input and output images must be of the same format", E_INVALIDARG);
        for (const image_layout* l : {&base, &other, &mask, &to})
            if (!is_real(*l)) return E_NOTIMPL;
        output out(pIOutImg, to);
        const input first(pIBaseImage, base, &out), second(pICombineImage, other, &out);
        const input weights(pIWeightMask, mask, &out);
        Arithmetic::blend(first.pixels(), second.pixels(), weights.pixels(), out.pixels());
        return finish(out, ppIOut);
    });
}

HRESULT CBasic2::Modulate(IPixmat2* pIImage, IPixmat2* pIMask, double weight, IPixmat2* pIOutImage,
                          IPixmat2** ppIOut) noexcept
{
    if (!pIImage || !pIMask) return E_INVALIDARG;
    return run_frame(IBasicOps2::iid, [&]() -> HRESULT {
        const image_layout colours = layout_of(pIImage), mask = layout_of(pIMask);
        if (colours.encoding != PixmatEncoding_RGB && colours.encoding != PixmatEncoding_RGBA &&
            colours.encoding != PixmatEncoding_BGR)
            return refuse(L"Source image must have color encoding", E_NOTIMPL);
        if (!same_size(colours, mask)) return refuse(L"Image and mask must have the same size", E_INVALIDARG);
        const image_layout to = pIOutImage ? layout_of(pIOutImage) : colours;
        if (!same_format(colours, to))
            return refuse(L"input and output images must be of the same format", E_INVALIDARG);
        if (!Arithmetic::has_colour_bytes(colours) || !is_real(mask)) return E_NOTIMPL;
        output out(pIOutImage, to);
        const input source(pIImage, colours, &out), weights(pIMask, mask, &out);
        Arithmetic::modulate(source.pixels(), weights.pixels(), weight, out.pixels());
        return finish(out, ppIOut);
    });
}

HRESULT CBasic2::Extend(IPixmat2* pIImage, IRectangle* pIExtendedImageDomain,
                        ZELT_BoundaryCondition boundaryCondition, double padValue, IPixmat2* pIOut,
                        IPixmat2** ppIPixmat) noexcept
{
    if (boundaryCondition != ZELT_BoundaryCondition_ConstantValue) return E_NOTIMPL;
    return image_method<IBasicOps2>(ppIPixmat, [&] {
        rectangle domain;
        CheckHResult(Common::ReadValue(pIExtendedImageDomain, &domain));
        const coordinate<int64_t> extent = extent_of(domain);
        auto dst = resolve_extended(pIImage, pIOut, extent);
        const ImageReadAccess src(pIImage);
        if (src.view().type != dst.view().type)
            throw std::invalid_argument("Extend: src and dst pixel types must be identical");
        if (dst.view().width != extent.x || dst.view().height != extent.y)
            throw std::invalid_argument("Extend: dst size mismatch");
        if (Arithmetic::extend(image_of(src.view()), {domain.left, domain.top}, padValue,
                               image_of(dst.view())) != outcome::done)
            throw std::invalid_argument("Extend: unsupported pixel type");
        return committed(dst);
    });
}

} // namespace Qor::Luxar::ZELT
