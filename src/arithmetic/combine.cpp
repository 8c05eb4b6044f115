#include "arithmetic/combine.h"

#include "arithmetic/kernels/expand_half_complex.h"
#include "frame/image_access.h"
#include "frame/report.h"
#include "zelt/com/safe_array.h"
#include "zelt/interfaces/complex.h"
#include "zelt/interfaces/zelt.h"

namespace Qor::Luxar::ZELT {
namespace {

using Arithmetic::image;
using Arithmetic::method;
using Arithmetic::number;
using Arithmetic::outcome;
using Arithmetic::storage;

HRESULT refuse(const wchar_t* text, HRESULT code) noexcept
{
    return ReportError(CLSID_ZELT, text, IBasicOps::iid, code);
}

HRESULT code_of(outcome o) noexcept
{
    switch (o) {
    case outcome::done: return S_OK;
    case outcome::too_small: return E_NOTIMPL;
    case outcome::unknown_rounding: return E_UNEXPECTED;
    case outcome::no_type_fits:
        return refuse(L"Supplied destination image must have same type as at least one of the arguments",
                      E_INVALIDARG);
    default: return E_INVALIDARG;
    }
}

/// What b turned out to be: an image, a complex number as an object, or a value that is read later.
struct second_operand {
    const VARIANT& value;
    com_ptr<IPixmat2> image;
    com_ptr<IComplex> complex;

    bool is_complex_number() const noexcept { return complex || (value.vt & VT_ARRAY) != 0; }
};

HRESULT find(second_operand& b) noexcept
{
    if (b.value.vt != VT_UNKNOWN && b.value.vt != VT_DISPATCH) return S_OK;
    HRESULT hr = E_POINTER;
    if (IUnknown* const object = b.value.punkVal) {
        hr = object->QueryInterface(IPixmat2::iid, b.image.put_void());
        if (succeeded(hr)) return hr;
        if (succeeded(object->QueryInterface(IComplex::iid, b.complex.put_void()))) return S_OK;
    }
    return refuse(L"Right argument must be scalar or IPixmat2", hr);
}

bool read_real(const VARIANT& v, number* n) noexcept
{
    const auto is = [n](storage type, double value) {
        *n = {type, value, 0};
        return true;
    };
    switch (v.vt) {
    case VT_I1: return is(storage::i8, v.cVal);
    case VT_UI1: return is(storage::u8, v.bVal);
    case VT_I2: return is(storage::i16, v.iVal);
    case VT_UI2: return is(storage::u16, v.uiVal);
    case VT_I4: return is(storage::i32, v.lVal);
    case VT_UI4: return is(storage::u32, v.ulVal);
    case VT_R4: return is(storage::f32, static_cast<double>(v.fltVal));
    case VT_R8: return is(storage::f64, v.dblVal);
    default: return false;
    }
}

template <class T>
bool read_pair(SAFEARRAY* array, number* n) noexcept
{
    const safe_array_access<T> parts(array);
    if (!parts.data()) return false;
    *n = {storage::f64, static_cast<double>(parts.data()[0]), static_cast<double>(parts.data()[1])};
    return true;
}

bool read_array(const VARIANT& v, number* n) noexcept
{
    if (v.vt != (VT_ARRAY | VT_R4) && v.vt != (VT_ARRAY | VT_R8)) return false;
    LONG low = 0, high = 0;
    if (SafeArrayGetDim(v.parray) != 1 || failed(SafeArrayGetLBound(v.parray, 1, &low)) ||
        failed(SafeArrayGetUBound(v.parray, 1, &high)) || int64_t{high} - low != 1)
        return false;
    if (v.vt == (VT_ARRAY | VT_R4)) return read_pair<float>(v.parray, n);
    return read_pair<double>(v.parray, n);
}

HRESULT read_number(const second_operand& b, bool for_complex, number* n) noexcept
{
    if (for_complex && b.complex) {
        if (const HRESULT hr = b.complex->get_Real(&n->real); failed(hr)) return hr;
        return b.complex->get_Imaginary(&n->imaginary);
    }
    if (read_real(b.value, n)) return S_OK;
    return for_complex && read_array(b.value, n) ? S_OK : E_INVALIDARG;
}

/// The full image of a half-complex part, as first operand and output.
HRESULT expand(IPixmat2* half, const image_part& part, image_layout* full_layout, com_ptr<IPixmat2>* out)
{
    const image_layout& layout = part.layout;
    if (layout.bits != 64 && layout.bits != 128) return E_INVALIDARG;
    const image_layout wanted =
        packed_layout(full_width(layout), layout.height, layout.bits, PixmatEncoding_Complex_Float);
    com_ptr<IPixmat2> full;
    if (const HRESULT hr = CreateImageFromLayout(wanted, full.put()); failed(hr)) return hr;
    com_ptr<IPixmatLock> read, write;
    if (const HRESULT hr = full->OpenWrite(write.put()); failed(hr)) return hr;
    if (const HRESULT hr = half->OpenRead(nullptr, 1.0, read.put()); failed(hr)) return hr;
    ExpandHalfComplex(view_of(layout, read->Data(0) + part.first), view_of(wanted, write->Data(0)));
    *full_layout = wanted;
    *out = std::move(full);
    return S_OK;
}

} // namespace

HRESULT combine(method m, ZELT_Rounding mode, IPixmat2* pIA, const VARIANT& b, IPixmat2* pIOutImg,
                IPixmat2** ppIOut, const image_part* part)
{
    if (!pIA) return E_INVALIDARG;
    if (!pIOutImg && !ppIOut) return E_POINTER;
    second_operand second{b, {}, {}};
    if (const HRESULT hr = find(second); failed(hr)) return hr;

    image first_pixels, second_pixels, out_pixels;
    int64_t shift = part ? part->first : 0;
    if (part)
        first_pixels.layout = part->layout;
    else if (const HRESULT hr = ReadLayout(pIA, &first_pixels.layout); failed(hr))
        return hr;
    if (second.image)
        if (const HRESULT hr = ReadLayout(second.image.get(), &second_pixels.layout); failed(hr)) return hr;

    // A spectrum without its redundant half takes only what keeps it one.
    const bool first_is_half = is_half_complex(first_pixels.layout.encoding);
    const bool second_is_half = second.image && is_half_complex(second_pixels.layout.encoding);
    if (second_is_half && !first_is_half)
        return refuse(L"Half-complex image must be first operand", E_NOTIMPL);
    com_ptr<IPixmat2> first(pIA), out(pIOutImg);
    if (first_is_half && (second.image ? !second_is_half : second.is_complex_number())) {
        const image_part half{first_pixels.layout, shift};
        if (const HRESULT hr = expand(pIA, half, &first_pixels.layout, &first); failed(hr)) return hr;
        out = first;
        shift = 0;
        part = nullptr;
    }

    const bool new_output = !out;
    if (new_output)
        if (const HRESULT hr = CreateImageFromLayout(first_pixels.layout, out.put()); failed(hr)) return hr;
    const bool first_is_out = !new_output && same_object(first.get(), out.get());
    if (new_output || first_is_out)
        out_pixels.layout = first_pixels.layout;
    else if (const HRESULT hr = ReadLayout(out.get(), &out_pixels.layout); failed(hr))
        return hr;

    com_ptr<IPixmatLock> out_lock, first_lock, second_lock;
    if (const HRESULT hr = out->OpenWrite(out_lock.put()); failed(hr)) return hr;
    out_pixels.data = out_lock->Data(0);
    if (first_is_out) {
        first_pixels.data = out_pixels.data = out_pixels.data + shift;
    } else {
        if (const HRESULT hr = first->OpenRead(nullptr, 1.0, first_lock.put()); failed(hr)) return hr;
        first_pixels.data = first_lock->Data(0) + shift;
    }

    outcome done;
    if (second.image) {
        const bool same_size = first_pixels.layout.width == second_pixels.layout.width &&
                               first_pixels.layout.height == second_pixels.layout.height;
        if (!same_size) return refuse(L"Can't operate on images of different size", E_INVALIDARG);
        if (!new_output && same_object(second.image.get(), out.get())) {
            second_pixels.data = out_lock->Data(0);
        } else {
            const HRESULT hr = second.image->OpenRead(nullptr, 1.0, second_lock.put());
            if (failed(hr)) return hr;
            second_pixels.data = second_lock->Data(0);
        }
        done = Arithmetic::combine(m, mode, first_pixels, second_pixels, out_pixels);
    } else {
        done = Arithmetic::check_number_form(first_pixels, out_pixels);
        if (done != outcome::done) return code_of(done);
        number n;
        const bool for_complex = is_complex(Arithmetic::storage_of(out_pixels.layout));
        if (const HRESULT hr = read_number(second, for_complex, &n); failed(hr)) return hr;
        done = Arithmetic::combine(m, mode, first_pixels, n, out_pixels);
    }
    if (done != outcome::done) return code_of(done);

    if (const HRESULT hr = out_lock->Commit(nullptr); failed(hr)) return hr;
    if (ppIOut) out.copy_to(ppIOut);
    return S_OK;
}

} // namespace Qor::Luxar::ZELT
