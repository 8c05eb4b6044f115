// IUnknown and com_ptr, the one owner of counted references.
//
// An interface is an abstract struct whose virtual functions stand in slot order. It names itself with three
// members: `iid` (its fixed identifier), `interface_name`, and `base` (the interface it extends).
#pragma once

#include "zelt/com/types.h"

#include <type_traits>
#include <utility>

namespace Qor {

struct IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0000-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IUnknown";

    /// Stores a pointer to the asked interface with a reference added, or null and E_NOINTERFACE.
    virtual HRESULT QueryInterface(const GUID& id, void** out) noexcept = 0;
    virtual ULONG AddRef() noexcept = 0;
    virtual ULONG Release() noexcept = 0;

protected:
    ~IUnknown() = default;
};

/// Owns one reference. There is no other AddRef or Release in the library.
template <class T>
class com_ptr {
public:
    com_ptr() noexcept = default;
    com_ptr(std::nullptr_t) noexcept {}
    /// Shares: adds a reference.
    explicit com_ptr(T* p) noexcept : p_(p) { add(); }
    com_ptr(const com_ptr& other) noexcept : p_(other.p_) { add(); }
    com_ptr(com_ptr&& other) noexcept : p_(std::exchange(other.p_, nullptr)) {}
    template <class U>
        requires std::is_convertible_v<U*, T*> com_ptr(const com_ptr<U>& other)
    noexcept : p_(other.get()) { add(); }
    ~com_ptr() { drop(); }

    com_ptr& operator=(com_ptr other) noexcept
    {
        std::swap(p_, other.p_);
        return *this;
    }

    /// Takes over a reference that somebody else counted.
    static com_ptr attach(T* p) noexcept
    {
        com_ptr owner;
        owner.p_ = p;
        return owner;
    }
    /// Gives the reference away; the caller counts it from here on.
    [[nodiscard]] T* detach() noexcept { return std::exchange(p_, nullptr); }

    /// For out arguments: releases what was held first.
    T** put() noexcept
    {
        drop();
        return &p_;
    }
    void** put_void() noexcept { return reinterpret_cast<void**>(put()); }

    /// Stores the pointer with a reference added.
    void copy_to(T** out) const noexcept
    {
        add();
        *out = p_;
    }

    T* get() const noexcept { return p_; }
    T* operator->() const noexcept { return p_; }
    T& operator*() const noexcept { return *p_; }
    explicit operator bool() const noexcept { return p_ != nullptr; }
    friend bool operator==(const com_ptr& a, const com_ptr& b) noexcept { return a.p_ == b.p_; }

    /// Asks for another interface; null when the object does not have it.
    template <class U>
    com_ptr<U> as() const noexcept
    {
        com_ptr<U> other;
        if (p_) p_->QueryInterface(U::iid, other.put_void());
        return other;
    }

private:
    void add() const noexcept
    {
        if (p_) p_->AddRef();
    }
    void drop() noexcept
    {
        if (T* old = std::exchange(p_, nullptr)) old->Release();
    }

    T* p_ = nullptr;
};

/// Asks a borrowed pointer for another interface; null in, null out.
template <class U, class T>
com_ptr<U> query(T* p) noexcept
{
    com_ptr<U> other;
    if (p) p->QueryInterface(U::iid, other.put_void());
    return other;
}

/// Identity of objects: two null references are not the same object.
inline bool same_object(IUnknown* a, IUnknown* b) noexcept
{
    if (!a || !b) return false;
    return a == b || query<IUnknown>(a) == query<IUnknown>(b);
}

} // namespace Qor
