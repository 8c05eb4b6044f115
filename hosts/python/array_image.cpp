#include "array_image.h"

#include <atomic>
#include <memory>

namespace python {
namespace {

bool is_ending() noexcept
{
#if PY_VERSION_HEX >= 0x030D0000
    return !Py_IsInitialized() || Py_IsFinalizing();
#else
    return !Py_IsInitialized() || _Py_IsFinalizing();
#endif
}

/// Comes from whatever thread drops the last reference.
void release_owner(void* owner) noexcept
{
    if (is_ending()) return; // nobody is left to give it back to
    const PyGILState_STATE state = PyGILState_Ensure();
    Py_DECREF(static_cast<PyObject*>(owner));
    PyGILState_Release(state);
}

/// All of an image but its place for statistics.
class array_image final : public IPixmat2 {
public:
    explicit array_image(com_ptr<IPixmat2>&& pixels) noexcept : pixels_(std::move(pixels)) {}
    virtual ~array_image() = default;

    HRESULT QueryInterface(const GUID& id, void** out) noexcept override
    {
        if (!out) return E_POINTER;
        const bool known = id == IUnknown::iid || id == IDispatch::iid || id == IPixmat2::iid;
        *out = known ? static_cast<IPixmat2*>(this) : nullptr;
        if (!known) return E_NOINTERFACE;
        AddRef();
        return S_OK;
    }
    ULONG AddRef() noexcept override { return references_.fetch_add(1, std::memory_order_relaxed) + 1; }
    ULONG Release() noexcept override
    {
        const ULONG left = references_.fetch_sub(1, std::memory_order_acq_rel) - 1;
        if (left == 0) delete this;
        return left;
    }

    HRESULT GetTypeInfoCount(uint32_t* count) noexcept override { return pixels_->GetTypeInfoCount(count); }
    HRESULT GetTypeInfo(uint32_t index, LCID locale, ITypeInfo** info) noexcept override
    {
        return pixels_->GetTypeInfo(index, locale, info);
    }
    HRESULT GetIDsOfNames(const GUID& reserved, OLECHAR** names, uint32_t count, LCID locale,
                          DISPID* ids) noexcept override
    {
        return pixels_->GetIDsOfNames(reserved, names, count, locale, ids);
    }
    HRESULT Invoke(DISPID id, const GUID& reserved, LCID locale, uint16_t flags, DISPPARAMS* params,
                   VARIANT* result, EXCEPINFO* exception, uint32_t* bad_argument) noexcept override
    {
        return pixels_->Invoke(id, reserved, locale, flags, params, result, exception, bad_argument);
    }

    HRESULT GetDescriptor(IPixmatDescriptor** out) noexcept override { return pixels_->GetDescriptor(out); }
    HRESULT OpenRead(IRectangle* area, double scale, IPixmatLock** out) noexcept override
    {
        return pixels_->OpenRead(area, scale, out);
    }
    HRESULT OpenWrite(IPixmatLock** out) noexcept override { return pixels_->OpenWrite(out); }
    HRESULT Clone(IPixmat2** out) noexcept override { return pixels_->Clone(out); }
    HRESULT StartNotifications(IPixmatEvents* sink, PixmatEventMode mode) noexcept override
    {
        return pixels_->StartNotifications(sink, mode);
    }
    HRESULT StopNotifications(IPixmatEvents* sink) noexcept override
    {
        return pixels_->StopNotifications(sink);
    }

private:
    const com_ptr<IPixmat2> pixels_;
    std::atomic<ULONG> references_{1};
};

} // namespace

com_ptr<IPixmat2> make_array_image(void* first_pixel, const image_layout& layout, bool read_only,
                                   py::object owner)
{
    com_ptr<IPixmat2> pixels;
    check(WrapPixmat(layout, first_pixel, read_only, release_owner, owner.ptr(), pixels.put()));
    static_cast<void>(owner.release()); // the image gives it back
    return com_ptr<IPixmat2>::attach(new array_image(std::move(pixels)));
}

} // namespace python
