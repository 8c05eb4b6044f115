// The library's own coordinates, rectangles, vectors and complex numbers, and the way between objects and values.
#pragma once

#include "com/implements.h"
#include "frame/errors.h"
#include "zelt/interfaces/complex.h"
#include "zelt/pixmat/layout.h"
#include "zelt/values.h"

namespace Qor::Luxar::Common {

template <class T>
HRESULT read_field(const T& field, T* value) noexcept
{
    if (!value) return E_POINTER;
    *value = field;
    return S_OK;
}

template <class T>
HRESULT write_field(T& field, T value) noexcept
{
    field = value;
    return S_OK;
}

/// Two numbers with the properties X and Y.
template <class Interface, class T>
class pair_object : public automation<Interface> {
public:
    pair_object() noexcept = default;
    pair_object(T first, T second) noexcept : x(first), y(second) {}

    HRESULT get_X(T* value) noexcept override { return read_field(x, value); }
    HRESULT put_X(T value) noexcept override { return write_field(x, value); }
    HRESULT get_Y(T* value) noexcept override { return read_field(y, value); }
    HRESULT put_Y(T value) noexcept override { return write_field(y, value); }

    T x{};
    T y{};
};

template <class Interface>
using CCoordinateIntImpl = pair_object<Interface, LONG>;
using CCoordinateFloat = pair_object<ICoordinateFloat, double>;
using CFloatVector2D = pair_object<IFloatVector2D, double>;

template <class Interface>
class CRectangleIntImpl : public automation<Interface> {
public:
    CRectangleIntImpl() noexcept = default;
    explicit CRectangleIntImpl(const rectangle& r) noexcept : value(r) {}

    HRESULT get_Left(LONG* left) noexcept override { return read_field(value.left, left); }
    HRESULT put_Left(LONG left) noexcept override { return write_field(value.left, left); }
    HRESULT get_Top(LONG* top) noexcept override { return read_field(value.top, top); }
    HRESULT put_Top(LONG top) noexcept override { return write_field(value.top, top); }
    HRESULT get_Right(LONG* right) noexcept override { return read_field(value.right, right); }
    HRESULT put_Right(LONG right) noexcept override { return write_field(value.right, right); }
    HRESULT get_Bottom(LONG* bottom) noexcept override { return read_field(value.bottom, bottom); }
    HRESULT put_Bottom(LONG bottom) noexcept override { return write_field(value.bottom, bottom); }

    rectangle value;
};

/// The coclass Complex.
class CoComplex
    : public dispatching<implements<ZELT::IComplex, error_support<ZELT::IComplex>, safe_for_scripts>,
                         ZELT::IComplex> {
public:
    HRESULT get_Real(double* value) noexcept override { return read_field(real, value); }
    HRESULT put_Real(double value) noexcept override { return write_field(real, value); }
    HRESULT get_Imaginary(double* value) noexcept override { return read_field(imaginary, value); }
    HRESULT put_Imaginary(double value) noexcept override { return write_field(imaginary, value); }

    double real = 0;
    double imaginary = 0;
};

// Object to value, read with gets in slot order. A null object is E_INVALIDARG.
HRESULT ReadValue(ICoordinateInt* object, coordinate<int32_t>* value) noexcept;
HRESULT ReadValue(ICoordinateFloat* object, coordinate<double>* value) noexcept;
HRESULT ReadValue(IRectangle* object, rectangle* value) noexcept;

/// An optional argument: null means absent.
template <class Value>
class optional_value {
public:
    /// Throws HResultException for what the object answers.
    template <class Interface>
    explicit optional_value(Interface* object) : present_(object != nullptr)
    {
        if (present_) CheckHResult(ReadValue(object, &value_));
    }
    optional_value() noexcept = default;

    /// For methods that answer codes: reads the object into `target`.
    template <class Interface>
    static HRESULT read(Interface* object, optional_value* target) noexcept
    {
        target->present_ = object != nullptr;
        return object ? ReadValue(object, &target->value_) : S_OK;
    }

    /// Null when absent.
    const Value* get() const noexcept { return present_ ? &value_ : nullptr; }

private:
    bool present_ = false;
    Value value_{};
};

using optional_rectangle = optional_value<rectangle>;
using optional_point = optional_value<coordinate<int32_t>>;

} // namespace Qor::Luxar::Common
