// The base of every object: reference count, QueryInterface, late binding and error support, written once.
#pragma once

#include "com/invoke.h"
#include "com/module_use.h"
#include "zelt/com/dispatch.h"
#include "zelt/com/interface_table.h"

#include <atomic>
#include <new>

namespace Qor {

namespace detail {

/// The pointer to an interface that answers to an identifier, itself or by what it extends.
template <class Interface, class Object>
bool answer(Object* object, const GUID& id, void** out) noexcept
{
    if (id == Interface::iid) {
        *out = static_cast<Interface*>(object);
        return true;
    }
    if constexpr (!std::is_same_v<Interface, IUnknown>)
        return answer<typename Interface::base>(static_cast<Interface*>(object), id, out);
    else
        return false;
}

} // namespace detail

/// A counted object with these interfaces. It starts with one reference; see make().
template <class First, class... Others>
class implements : public First, public Others... {
public:
    HRESULT QueryInterface(const GUID& id, void** out) noexcept override
    {
        if (!out) return E_POINTER;
        *out = nullptr;
        // IUnknown always comes from the first interface: identity of objects rests on it.
        if (!(detail::answer<First>(this, id, out) || (detail::answer<Others>(this, id, out) || ...)))
            return E_NOINTERFACE;
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

    implements(const implements&) = delete;
    implements& operator=(const implements&) = delete;

protected:
    implements() noexcept = default;
    virtual ~implements() = default;

private:
    std::atomic<ULONG> references_{1};
    [[no_unique_address]] counted_life life_;
};

/// The description of an interface; each is defined beside its table.
template <class Interface>
const interface_info& table_of() noexcept;

/// Late binding for an object whose first interface is dual and described by a table.
template <class Base, class First>
class dispatching : public Base {
public:
    using Base::Base;

    HRESULT GetTypeInfoCount(uint32_t* count) noexcept override
    {
        if (!count) return E_POINTER;
        *count = 1;
        return S_OK;
    }
    HRESULT GetTypeInfo(uint32_t index, LCID, ITypeInfo** info) noexcept override
    {
        return get_type_info(table_of<First>(), index, info);
    }
    HRESULT GetIDsOfNames(const GUID&, OLECHAR** names, uint32_t count, LCID, DISPID* ids) noexcept override
    {
        return find_ids(table_of<First>(), names, count, ids);
    }
    HRESULT Invoke(DISPID id, const GUID&, LCID, uint16_t flags, DISPPARAMS* params, VARIANT* result,
                   EXCEPINFO* exception, uint32_t* bad_argument) noexcept override
    {
        return invoke(table_of<First>(), static_cast<First*>(this), invoke_form::standard,
                      {id, flags, params, result, exception, bad_argument});
    }

    using described_interface = First;
};

/// Says that failures of the main interface leave error information.
template <class First>
struct error_support : ISupportErrorInfo {
    HRESULT InterfaceSupportsErrorInfo(const GUID& id) noexcept override
    {
        return id == First::iid ? S_OK : S_FALSE;
    }
};

/// Safe for untrusted callers and untrusted data, always.
struct safe_for_scripts : IObjectSafety {
    HRESULT GetInterfaceSafetyOptions(const GUID&, uint32_t* supported, uint32_t* enabled) noexcept override
    {
        if (!supported || !enabled) return E_POINTER;
        *supported = *enabled = INTERFACESAFE_FOR_UNTRUSTED_CALLER | INTERFACESAFE_FOR_UNTRUSTED_DATA;
        return S_OK;
    }
    HRESULT SetInterfaceSafetyOptions(const GUID&, uint32_t, uint32_t) noexcept override { return S_OK; }
};

/// A scriptable object.
template <class First, class... Others>
using automation = dispatching<implements<First, Others..., error_support<First>>, First>;

/// Like implements, for objects that may become part of an outer object. The outer one then answers for identity
/// and counts references; it holds this object by inner().
template <class First, class... Others>
class aggregatable : public First, public Others... {
public:
    HRESULT QueryInterface(const GUID& id, void** out) noexcept override
    {
        return outer_->QueryInterface(id, out);
    }
    ULONG AddRef() noexcept override { return outer_->AddRef(); }
    ULONG Release() noexcept override { return outer_->Release(); }

    /// The object's own IUnknown, with its own count, whoever owns it.
    IUnknown* inner() noexcept { return &inner_; }

    aggregatable(const aggregatable&) = delete;
    aggregatable& operator=(const aggregatable&) = delete;

protected:
    explicit aggregatable(IUnknown* outer) noexcept : inner_(*this), outer_(outer ? outer : &inner_) {}
    virtual ~aggregatable() = default;

private:
    class own_unknown final : public IUnknown {
    public:
        explicit own_unknown(aggregatable& owner) noexcept : owner_(owner) {}
        HRESULT QueryInterface(const GUID& id, void** out) noexcept override
        {
            if (!out) return E_POINTER;
            *out = nullptr;
            if (id == IUnknown::iid)
                *out = static_cast<IUnknown*>(this);
            else if (!(detail::answer<First>(&owner_, id, out) ||
                       (detail::answer<Others>(&owner_, id, out) || ...)))
                return E_NOINTERFACE;
            static_cast<IUnknown*>(*out)->AddRef();
            return S_OK;
        }
        ULONG AddRef() noexcept override { return references_.fetch_add(1, std::memory_order_relaxed) + 1; }
        ULONG Release() noexcept override
        {
            const ULONG left = references_.fetch_sub(1, std::memory_order_acq_rel) - 1;
            if (left == 0) delete &owner_;
            return left;
        }

    private:
        aggregatable& owner_;
        std::atomic<ULONG> references_{1};
    };

    own_unknown inner_;
    IUnknown* outer_;
    [[no_unique_address]] counted_life life_;
};

/// The same object for script hosts: methods that take images accept calls that leave optional images out.
template <class Base>
class scripting : public Base {
public:
    using Base::Base;

    HRESULT Invoke(DISPID id, const GUID&, LCID, uint16_t flags, DISPPARAMS* params, VARIANT* result,
                   EXCEPINFO* exception, uint32_t* bad_argument) noexcept override
    {
        using described = typename Base::described_interface;
        return invoke(table_of<described>(), static_cast<described*>(this), invoke_form::scripting,
                      {id, flags, params, result, exception, bad_argument});
    }
};

/// A new object, or std::bad_alloc, or what its constructor throws.
template <class T, class... Args>
com_ptr<T> make(Args&&... args)
{
    return com_ptr<T>::attach(new T(std::forward<Args>(args)...));
}

/// A new object whose constructor cannot throw; null when memory runs out.
template <class T, class... Args>
    requires std::is_nothrow_constructible_v<T, Args...> com_ptr<T> try_make(Args&&... args)
noexcept { return com_ptr<T>::attach(new (std::nothrow) T(std::forward<Args>(args)...)); }

} // namespace Qor
