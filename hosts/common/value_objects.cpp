#include "common/value_objects.h"

#include <atomic>
#include <cmath>
#include <stdexcept>

using namespace Qor;
using namespace Qor::Luxar;

namespace host {
namespace {

/// An object of one interface; methods call its functions directly, so it need not answer by name.
template <class Interface>
class value_object : public Interface {
public:
    HRESULT QueryInterface(const GUID& id, void** out) noexcept final
    {
        if (!out) return E_POINTER;
        const bool known = id == IUnknown::iid || id == IDispatch::iid || id == Interface::iid;
        *out = known ? static_cast<Interface*>(this) : nullptr;
        if (!known) return E_NOINTERFACE;
        AddRef();
        return S_OK;
    }
    ULONG AddRef() noexcept final { return ++count_; }
    ULONG Release() noexcept final
    {
        const ULONG left = --count_;
        if (left == 0) delete this;
        return left;
    }
    HRESULT GetTypeInfoCount(uint32_t* count) noexcept final
    {
        if (!count) return E_POINTER;
        *count = 0;
        return S_OK;
    }
    HRESULT GetTypeInfo(uint32_t, LCID, ITypeInfo**) noexcept final { return E_NOTIMPL; }
    HRESULT GetIDsOfNames(const GUID&, OLECHAR**, uint32_t, LCID, DISPID*) noexcept final
    {
        return DISP_E_UNKNOWNNAME;
    }
    HRESULT Invoke(DISPID, const GUID&, LCID, uint16_t, DISPPARAMS*, VARIANT*, EXCEPINFO*,
                   uint32_t*) noexcept final
    {
        return DISP_E_MEMBERNOTFOUND;
    }

protected:
    virtual ~value_object() = default;

    template <class T>
    static HRESULT read(const T& field, T* value) noexcept
    {
        if (!value) return E_POINTER;
        *value = field;
        return S_OK;
    }
    template <class T>
    static HRESULT store(T& field, T value) noexcept
    {
        field = value;
        return S_OK;
    }

private:
    std::atomic<ULONG> count_{1};
};

class size_object final : public value_object<ISizeInt> {
public:
    size_object(LONG width, LONG height) : width_(width), height_(height) {}
    HRESULT get_Width(LONG* value) noexcept override { return read(width_, value); }
    HRESULT put_Width(LONG value) noexcept override { return store(width_, value); }
    HRESULT get_Height(LONG* value) noexcept override { return read(height_, value); }
    HRESULT put_Height(LONG value) noexcept override { return store(height_, value); }

private:
    LONG width_;
    LONG height_;
};

class range_object final : public value_object<IRangeFloat> {
public:
    range_object(double low, double high) : low_(low), high_(high) {}
    HRESULT get_Low(double* value) noexcept override { return read(low_, value); }
    HRESULT put_Low(double value) noexcept override { return store(low_, value); }
    HRESULT get_High(double* value) noexcept override { return read(high_, value); }
    HRESULT put_High(double value) noexcept override { return store(high_, value); }

private:
    double low_;
    double high_;
};

class lookup_table final : public value_object<ILookupTable> {
public:
    explicit lookup_table(const std::vector<double>& numbers) : low_(numbers[0]), high_(numbers[1])
    {
        for (size_t i = 2; i < numbers.size(); ++i) {
            if (!(numbers[i] >= 0 && numbers[i] <= 0xffffff) || numbers[i] != std::floor(numbers[i]))
                throw std::invalid_argument("a colour is a whole number up to 16777215");
            colours_.push_back(static_cast<ULONG>(numbers[i]));
        }
    }
    HRESULT get_Count(LONG* value) noexcept override
    {
        return read(static_cast<LONG>(colours_.size()), value);
    }
    HRESULT get_Entry(LONG index, ULONG* colour) noexcept override
    {
        const auto i = static_cast<size_t>(index);
        return index < 0 || i >= colours_.size() ? E_INVALIDARG : read(colours_[i], colour);
    }
    HRESULT get_Low(double* value) noexcept override { return read(low_, value); }
    HRESULT get_High(double* value) noexcept override { return read(high_, value); }

private:
    double low_;
    double high_;
    std::vector<ULONG> colours_;
};

} // namespace

com_ptr<ISizeInt> make_size(int32_t width, int32_t height)
{
    return com_ptr<ISizeInt>::attach(new size_object(width, height));
}

com_ptr<IRangeFloat> make_range(double low, double high)
{
    return com_ptr<IRangeFloat>::attach(new range_object(low, high));
}

com_ptr<ILookupTable> make_lookup_table(const std::vector<double>& numbers)
{
    return com_ptr<ILookupTable>::attach(new lookup_table(numbers));
}

com_ptr<ZELT::IComplex> make_complex(std::complex<double> value)
{
    com_ptr<ZELT::IComplex> object = zelt::create<ZELT::IComplex>("ZELT.Complex");
    zelt::check(object->put_Real(value.real()));
    zelt::check(object->put_Imaginary(value.imag()));
    return object;
}

com_ptr<IPixmatDescriptor> make_descriptor(const image_layout& layout)
{
    com_ptr<IPixmatDescriptor> d;
    zelt::check(
        CoCreateInstance(CLSID_PixmatDescriptor, nullptr, CLSCTX_ALL, IPixmatDescriptor::iid, d.put_void()));
    zelt::check(d->put_Width(layout.width));
    zelt::check(d->put_Height(layout.height));
    zelt::check(d->put_Bits(layout.bits));
    zelt::check(d->put_Encoding(layout.encoding));
    zelt::check(d->put_Offset(layout.offset));
    zelt::check(d->put_XStride(layout.x_stride));
    zelt::check(d->put_YStride(layout.y_stride));
    return d;
}

} // namespace host
