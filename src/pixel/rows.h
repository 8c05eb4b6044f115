// How a loop sees the rows of a view. A row is contiguous (a fixed distance between pixels, what the vectoriser
// sees) or strided (any byte distance, any alignment); the choice is made once per call, outside all loops.
#pragma once

#include "pixel/level.h"
#include "pixel/memory_2d.h"

namespace Qor::Luxar::ZELT::ZELT_LEVEL {

/// A pixel that may lie at any address.
template <class T>
struct pixel_reference {
    uint8_t* address;

    operator T() const
    {
        T value;
        __builtin_memcpy(&value, address, sizeof value);
        return value;
    }
    const pixel_reference& operator=(T value) const
    {
        __builtin_memcpy(address, &value, sizeof value);
        return *this;
    }
    pixel_reference(uint8_t* a) : address(a) {}
    pixel_reference(const pixel_reference&) = default;
    const pixel_reference& operator=(const pixel_reference& other) const
    {
        return *this = static_cast<T>(other);
    }
};

template <class T>
struct contiguous_row {
    uint8_t* first;

    pixel_reference<T> operator[](int64_t x) const { return first + x * static_cast<int64_t>(sizeof(T)); }
};

template <class T>
struct strided_row {
    uint8_t* first;
    int64_t stride;

    pixel_reference<T> operator[](int64_t x) const { return first + x * stride; }
};

template <class T>
struct contiguous_rows {
    using value_type = T;
    int32_t width, height;
    int64_t y_stride;
    uint8_t* first;

    explicit contiguous_rows(const memory_2d& m)
        : width(m.width), height(m.height), y_stride(m.y_stride), first(m.data + m.offset)
    {
    }
    contiguous_row<T> operator[](int64_t y) const { return {first + y * y_stride}; }
};

template <class T>
struct strided_rows {
    using value_type = T;
    int32_t width, height;
    int64_t x_stride, y_stride;
    uint8_t* first;

    explicit strided_rows(const memory_2d& m)
        : width(m.width), height(m.height), x_stride(m.x_stride), y_stride(m.y_stride),
          first(m.data + m.offset)
    {
    }
    strided_row<T> operator[](int64_t y) const { return {first + y * y_stride, x_stride}; }
};

/// Calls the body with the rows of a view: with_rows<T>(view, [&](auto rows) { ... }).
template <class T, class Body>
decltype(auto) with_rows(const memory_2d& m, Body&& body)
{
    if (m.x_stride == static_cast<int64_t>(sizeof(T))) return body(contiguous_rows<T>(m));
    return body(strided_rows<T>(m));
}

/// The same for two views: contiguous only when both are.
template <class A, class B, class Body>
decltype(auto) with_rows(const memory_2d& a, const memory_2d& b, Body&& body)
{
    if (a.x_stride == static_cast<int64_t>(sizeof(A)) && b.x_stride == static_cast<int64_t>(sizeof(B)))
        return body(contiguous_rows<A>(a), contiguous_rows<B>(b));
    return body(strided_rows<A>(a), strided_rows<B>(b));
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL
