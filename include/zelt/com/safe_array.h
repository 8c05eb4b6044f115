// SAFEARRAY: arrays that carry their type and bounds, and `safe_array`, which owns one.
// The leftmost dimension varies fastest in memory. Elements may be numbers, VT_BOOL, VT_ERROR, VT_BSTR,
// VT_VARIANT, VT_UNKNOWN, VT_DISPATCH. Arrays of variants that hold arrays may be nested to any depth. A null
// array is E_INVALIDARG and a null pointer for a result E_POINTER, where nothing else is said.
#pragma once

#include "zelt/com/variant.h"

namespace Qor {

struct SAFEARRAYBOUND {
    uint32_t cElements;
    int32_t lLbound;
};

/// Opaque: use the functions.
struct SAFEARRAY;

/// Zero-filled, the first element aligned to 16 bytes. Null for no or more than 64 dimensions, an unknown
/// element type, more than 2^31 - 1 elements, an index beyond 32 bits, or when memory runs out. bounds[0] is
/// the leftmost dimension.
ZELT_API SAFEARRAY* SafeArrayCreate(VARTYPE type, uint32_t dimensions, const SAFEARRAYBOUND* bounds) noexcept;
ZELT_API SAFEARRAY* SafeArrayCreateVector(VARTYPE type, int32_t low, uint32_t count) noexcept;
/// Null is fine. DISP_E_ARRAYISLOCKED while it, or an array inside it, is accessed; it is untouched then.
ZELT_API HRESULT SafeArrayDestroy(SAFEARRAY* array) noexcept;
/// A deep copy; objects are shared. Null copies to null.
ZELT_API HRESULT SafeArrayCopy(const SAFEARRAY* source, SAFEARRAY** target) noexcept;
ZELT_API HRESULT SafeArrayGetVartype(const SAFEARRAY* array, VARTYPE* type) noexcept;
/// 0 for null.
ZELT_API uint32_t SafeArrayGetDim(const SAFEARRAY* array) noexcept;
ZELT_API uint32_t SafeArrayGetElemsize(const SAFEARRAY* array) noexcept;
/// Dimensions count from 1. DISP_E_BADINDEX beyond them.
ZELT_API HRESULT SafeArrayGetLBound(const SAFEARRAY* array, uint32_t dimension, int32_t* bound) noexcept;
ZELT_API HRESULT SafeArrayGetUBound(const SAFEARRAY* array, uint32_t dimension, int32_t* bound) noexcept;
/// Locks and gives the first element's address; UnaccessData undoes it.
ZELT_API HRESULT SafeArrayAccessData(SAFEARRAY* array, void** data) noexcept;
ZELT_API HRESULT SafeArrayUnaccessData(SAFEARRAY* array) noexcept;
/// One index per dimension, leftmost first: DISP_E_BADINDEX outside the bounds. Strings and variants are
/// copied, objects shared. `value` points to room for an element; what was there is overwritten, not
/// released.
ZELT_API HRESULT SafeArrayGetElement(SAFEARRAY* array, const int32_t* indices, void* value) noexcept;
/// `value` points to the element, but is itself the BSTR or the object for those types.
ZELT_API HRESULT SafeArrayPutElement(SAFEARRAY* array, const int32_t* indices, const void* value) noexcept;

/// Owns an array.
class safe_array {
public:
    safe_array() noexcept = default;
    safe_array(safe_array&& other) noexcept : array_(std::exchange(other.array_, nullptr)) {}
    safe_array& operator=(safe_array&& other) noexcept
    {
        std::swap(array_, other.array_);
        return *this;
    }
    ~safe_array() { SafeArrayDestroy(array_); }

    static safe_array attach(SAFEARRAY* array) noexcept
    {
        safe_array owner;
        owner.array_ = array;
        return owner;
    }
    /// One dimension, lower bound 0. Throws std::bad_alloc.
    ZELT_API static safe_array vector(VARTYPE type, uint32_t count);

    [[nodiscard]] SAFEARRAY* detach() noexcept { return std::exchange(array_, nullptr); }
    SAFEARRAY** put() noexcept
    {
        SafeArrayDestroy(std::exchange(array_, nullptr));
        return &array_;
    }
    SAFEARRAY* get() const noexcept { return array_; }
    explicit operator bool() const noexcept { return array_ != nullptr; }

private:
    SAFEARRAY* array_ = nullptr;
};

/// Access to the elements for the length of a scope. Null data for a null array.
template <class T>
class safe_array_access {
public:
    explicit safe_array_access(SAFEARRAY* array) noexcept : array_(array)
    {
        void* data = nullptr;
        if (array_ && succeeded(SafeArrayAccessData(array_, &data)))
            data_ = static_cast<T*>(data);
        else
            array_ = nullptr;
    }
    safe_array_access(const safe_array_access&) = delete;
    safe_array_access& operator=(const safe_array_access&) = delete;
    ~safe_array_access()
    {
        if (array_) SafeArrayUnaccessData(array_);
    }
    T* data() const noexcept { return data_; }

private:
    SAFEARRAY* array_;
    T* data_ = nullptr;
};

} // namespace Qor
