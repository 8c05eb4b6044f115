#include "zelt/com/safe_array.h"

#include "com/variant_parts.h"

#include <atomic>
#include <cstring>
#include <limits>
#include <new>

namespace Qor {

namespace {

constexpr uint32_t most_dimensions = 64;
constexpr size_t alignment = 16;
static_assert(__STDCPP_DEFAULT_NEW_ALIGNMENT__ >= alignment);

} // namespace

// One block of memory: this record, the bounds, and the elements at the next multiple of the alignment.
struct SAFEARRAY {
    VARTYPE type;
    uint32_t dimensions;
    uint32_t element_size;
    uint32_t count; ///< of elements
    std::atomic<uint32_t> locks{0};
    // A walk over an array and all arrays inside it goes along `next`, so that neither the depth of
    // the nesting nor an empty heap can stop it. A copy being filled knows its source.
    SAFEARRAY* next = nullptr;
    const SAFEARRAY* source = nullptr;

    static size_t data_offset(uint32_t dimensions) noexcept
    {
        return (sizeof(SAFEARRAY) + dimensions * sizeof(SAFEARRAYBOUND) + alignment - 1) / alignment *
               alignment;
    }
    SAFEARRAYBOUND* bounds() noexcept { return reinterpret_cast<SAFEARRAYBOUND*>(this + 1); }
    const SAFEARRAYBOUND* bounds() const noexcept
    {
        return reinterpret_cast<const SAFEARRAYBOUND*>(this + 1);
    }
    std::byte* data() noexcept { return reinterpret_cast<std::byte*>(this) + data_offset(dimensions); }
    const std::byte* data() const noexcept
    {
        return reinterpret_cast<const std::byte*>(this) + data_offset(dimensions);
    }
    template <class T>
    T* elements() noexcept
    {
        return reinterpret_cast<T*>(data());
    }
    template <class T>
    const T* elements() const noexcept
    {
        return reinterpret_cast<const T*>(data());
    }
};

namespace {

SAFEARRAY* allocate(VARTYPE type, uint32_t dimensions, const SAFEARRAYBOUND* bounds, uint32_t count) noexcept
{
    const uint32_t size = size_of_type(type);
    const uint64_t bytes = SAFEARRAY::data_offset(dimensions) + uint64_t{count} * size;
    if (bytes > std::numeric_limits<size_t>::max()) return nullptr;
    void* const block = ::operator new(static_cast<size_t>(bytes), std::nothrow);
    if (!block) return nullptr;
    auto* const array = new (block) SAFEARRAY{type, dimensions, size, count};
    std::memcpy(array->bounds(), bounds, dimensions * sizeof(SAFEARRAYBOUND));
    std::memset(array->data(), 0, size_t{count} * size);
    return array;
}

void deallocate(SAFEARRAY* array) noexcept
{
    array->~SAFEARRAY();
    ::operator delete(array);
}

SAFEARRAY* allocate_like(const SAFEARRAY& model) noexcept
{
    return allocate(model.type, model.dimensions, model.bounds(), model.count);
}

bool is_object(VARTYPE type) noexcept { return type == VT_UNKNOWN || type == VT_DISPATCH; }

void release_elements(SAFEARRAY& array) noexcept
{
    for (uint32_t i = 0; i < array.count; ++i) {
        if (array.type == VT_BSTR)
            SysFreeString(array.elements<BSTR>()[i]);
        else if (is_object(array.type))
            com_ptr<IUnknown>::attach(array.elements<IUnknown*>()[i]) = nullptr;
        else if (array.type == VT_VARIANT && !held_array(array.elements<VARIANT>()[i]))
            VariantClear(&array.elements<VARIANT>()[i]);
        else if (array.type != VT_VARIANT)
            return;
    }
}

// Links a copy to the end of the walk that began with the outermost one.
HRESULT append_copy(const SAFEARRAY& source, SAFEARRAY*& last, SAFEARRAY** copy) noexcept
{
    *copy = allocate_like(source);
    if (!*copy) return E_OUTOFMEMORY;
    (*copy)->source = &source;
    last = last->next = *copy;
    return S_OK;
}

// Inner arrays are only made here; the walk comes to fill them later.
HRESULT fill_copy(SAFEARRAY& target, SAFEARRAY*& last) noexcept
{
    const SAFEARRAY& source = *target.source;
    HRESULT hr = S_OK;
    for (uint32_t i = 0; i < source.count && succeeded(hr); ++i) {
        if (source.type == VT_BSTR) {
            hr = copy_text(source.elements<BSTR>()[i], &target.elements<BSTR>()[i]);
        } else if (is_object(source.type)) {
            target.elements<IUnknown*>()[i] = com_ptr(source.elements<IUnknown*>()[i]).detach();
        } else if (source.type == VT_VARIANT) {
            const VARIANT& from = source.elements<VARIANT>()[i];
            VARIANT& to = target.elements<VARIANT>()[i];
            if (const SAFEARRAY* inner = held_array(from)) {
                hr = append_copy(*inner, last, &to.parray);
                if (succeeded(hr)) to.vt = from.vt;
            } else {
                hr = copy_value(from, &to);
            }
        } else {
            std::memcpy(target.data(), source.data(), size_t{source.count} * source.element_size);
            break;
        }
    }
    return hr;
}

// The address of the element; null when an index is outside its bounds.
std::byte* element_at(SAFEARRAY& array, const int32_t* indices) noexcept
{
    uint64_t position = 0;
    uint64_t stride = 1;
    for (uint32_t d = 0; d < array.dimensions; ++d) {
        const SAFEARRAYBOUND& bound = array.bounds()[d];
        const int64_t steps = int64_t{indices[d]} - bound.lLbound;
        if (steps < 0 || steps >= int64_t{bound.cElements}) return nullptr;
        position += static_cast<uint64_t>(steps) * stride;
        stride *= bound.cElements;
    }
    return array.data() + position * array.element_size;
}

HRESULT bound_of(const SAFEARRAY* array, uint32_t dimension, const int32_t* out,
                 SAFEARRAYBOUND* bound) noexcept
{
    if (!array) return E_INVALIDARG;
    if (!out) return E_POINTER;
    if (dimension < 1 || dimension > array->dimensions) return DISP_E_BADINDEX;
    *bound = array->bounds()[dimension - 1];
    return S_OK;
}

} // namespace

SAFEARRAY* SafeArrayCreate(VARTYPE type, uint32_t dimensions, const SAFEARRAYBOUND* bounds) noexcept
{
    if (dimensions < 1 || dimensions > most_dimensions || !bounds || size_of_type(type) == 0) return nullptr;
    constexpr int64_t highest = std::numeric_limits<int32_t>::max();
    constexpr int64_t lowest = std::numeric_limits<int32_t>::min();
    bool none = false;
    for (uint32_t d = 0; d < dimensions; ++d) {
        const int64_t last = int64_t{bounds[d].lLbound} + bounds[d].cElements - 1;
        if (last > highest || last < lowest) return nullptr;
        none = none || bounds[d].cElements == 0;
    }
    uint64_t count = none ? 0 : 1;
    for (uint32_t d = 0; d < dimensions; ++d) {
        count *= bounds[d].cElements;
        if (count > static_cast<uint64_t>(highest)) return nullptr;
    }
    return allocate(type, dimensions, bounds, static_cast<uint32_t>(count));
}

SAFEARRAY* SafeArrayCreateVector(VARTYPE type, int32_t low, uint32_t count) noexcept
{
    const SAFEARRAYBOUND bound{count, low};
    return SafeArrayCreate(type, 1, &bound);
}

HRESULT SafeArrayDestroy(SAFEARRAY* array) noexcept
{
    if (!array) return S_OK;
    // First all arrays inside are found, so that a locked one stops everything before anything is freed.
    SAFEARRAY* last = array;
    last->next = nullptr;
    for (SAFEARRAY* a = array; a; a = a->next) {
        if (a->locks.load() != 0) return DISP_E_ARRAYISLOCKED;
        for (uint32_t i = 0; a->type == VT_VARIANT && i < a->count; ++i)
            if (SAFEARRAY* inner = held_array(a->elements<VARIANT>()[i])) {
                last = last->next = inner;
                last->next = nullptr;
            }
    }
    while (array) {
        release_elements(*array);
        deallocate(std::exchange(array, array->next));
    }
    return S_OK;
}

HRESULT SafeArrayCopy(const SAFEARRAY* source, SAFEARRAY** target) noexcept
{
    if (!target) return E_POINTER;
    *target = nullptr;
    if (!source) return S_OK;
    SAFEARRAY* const copy = allocate_like(*source);
    if (!copy) return E_OUTOFMEMORY;
    copy->source = source;
    HRESULT hr = S_OK;
    SAFEARRAY* last = copy;
    for (SAFEARRAY* a = copy; a && succeeded(hr); a = a->next) hr = fill_copy(*a, last);
    if (failed(hr))
        SafeArrayDestroy(copy);
    else
        *target = copy;
    return hr;
}

HRESULT SafeArrayGetVartype(const SAFEARRAY* array, VARTYPE* type) noexcept
{
    if (!array) return E_INVALIDARG;
    if (!type) return E_POINTER;
    *type = array->type;
    return S_OK;
}

uint32_t SafeArrayGetDim(const SAFEARRAY* array) noexcept { return array ? array->dimensions : 0; }

uint32_t SafeArrayGetElemsize(const SAFEARRAY* array) noexcept { return array ? array->element_size : 0; }

HRESULT SafeArrayGetLBound(const SAFEARRAY* array, uint32_t dimension, int32_t* bound) noexcept
{
    SAFEARRAYBOUND found;
    const HRESULT hr = bound_of(array, dimension, bound, &found);
    if (succeeded(hr)) *bound = found.lLbound;
    return hr;
}

HRESULT SafeArrayGetUBound(const SAFEARRAY* array, uint32_t dimension, int32_t* bound) noexcept
{
    SAFEARRAYBOUND found;
    const HRESULT hr = bound_of(array, dimension, bound, &found);
    if (succeeded(hr)) *bound = static_cast<int32_t>(int64_t{found.lLbound} + found.cElements - 1);
    return hr;
}

HRESULT SafeArrayAccessData(SAFEARRAY* array, void** data) noexcept
{
    if (!data) return E_POINTER;
    *data = nullptr;
    if (!array) return E_INVALIDARG;
    uint32_t locks = array->locks.load();
    do
        if (locks == std::numeric_limits<uint32_t>::max()) return E_UNEXPECTED;
    while (!array->locks.compare_exchange_weak(locks, locks + 1));
    *data = array->data();
    return S_OK;
}

HRESULT SafeArrayUnaccessData(SAFEARRAY* array) noexcept
{
    if (!array) return E_INVALIDARG;
    uint32_t locks = array->locks.load();
    do
        if (locks == 0) return E_UNEXPECTED;
    while (!array->locks.compare_exchange_weak(locks, locks - 1));
    return S_OK;
}

HRESULT SafeArrayGetElement(SAFEARRAY* array, const int32_t* indices, void* value) noexcept
{
    if (!array) return E_INVALIDARG;
    if (!indices || !value) return E_POINTER;
    const std::byte* const element = element_at(*array, indices);
    if (!element) return DISP_E_BADINDEX;
    if (array->type == VT_BSTR) {
        BSTR copy;
        const HRESULT hr = copy_text(*reinterpret_cast<const BSTR*>(element), &copy);
        if (succeeded(hr)) *static_cast<BSTR*>(value) = copy;
        return hr;
    }
    if (array->type == VT_VARIANT) {
        VARIANT copy;
        const HRESULT hr = copy_value(*reinterpret_cast<const VARIANT*>(element), &copy);
        if (succeeded(hr)) *static_cast<VARIANT*>(value) = copy;
        return hr;
    }
    if (is_object(array->type))
        com_ptr(*reinterpret_cast<IUnknown* const*>(element)).copy_to(static_cast<IUnknown**>(value));
    else
        std::memcpy(value, element, array->element_size);
    return S_OK;
}

HRESULT SafeArrayPutElement(SAFEARRAY* array, const int32_t* indices, const void* value) noexcept
{
    if (!array) return E_INVALIDARG;
    if (!indices || (!value && array->type != VT_BSTR && !is_object(array->type))) return E_POINTER;
    std::byte* const element = element_at(*array, indices);
    if (!element) return DISP_E_BADINDEX;
    if (array->type == VT_BSTR) {
        BSTR copy;
        const HRESULT hr = copy_text(static_cast<BSTR>(const_cast<void*>(value)), &copy);
        if (succeeded(hr)) SysFreeString(std::exchange(*reinterpret_cast<BSTR*>(element), copy));
        return hr;
    }
    if (array->type == VT_VARIANT) {
        VARIANT copy;
        const HRESULT hr = copy_value(*static_cast<const VARIANT*>(value), &copy);
        return failed(hr) ? hr : replace_value(reinterpret_cast<VARIANT*>(element), copy);
    }
    if (is_object(array->type)) {
        com_ptr added(static_cast<IUnknown*>(const_cast<void*>(value)));
        IUnknown*& slot = *reinterpret_cast<IUnknown**>(element);
        const auto old = com_ptr<IUnknown>::attach(std::exchange(slot, added.detach()));
    } else {
        std::memcpy(element, value, array->element_size);
    }
    return S_OK;
}

safe_array safe_array::vector(VARTYPE type, uint32_t count)
{
    SAFEARRAY* const array = SafeArrayCreateVector(type, 0, count);
    if (!array) throw std::bad_alloc();
    return attach(array);
}

} // namespace Qor
