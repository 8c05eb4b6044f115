// Small value objects that cross the boundary: coordinates, rectangles, vectors, sizes, ranges, tables.
// Every get answers E_POINTER for a null out pointer; every put stores what it is given, unchecked.
#pragma once

#include "zelt/com/dispatch.h"

namespace Qor::Luxar {

struct ICoordinateInt : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0101-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "ICoordinateInt";
    using base = IDispatch;

    virtual HRESULT get_X(LONG* value) noexcept = 0;
    virtual HRESULT put_X(LONG value) noexcept = 0;
    virtual HRESULT get_Y(LONG* value) noexcept = 0;
    virtual HRESULT put_Y(LONG value) noexcept = 0;
};

struct ICoordinateFloat : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0102-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "ICoordinateFloat";
    using base = IDispatch;

    virtual HRESULT get_X(double* value) noexcept = 0;
    virtual HRESULT put_X(double value) noexcept = 0;
    virtual HRESULT get_Y(double* value) noexcept = 0;
    virtual HRESULT put_Y(double value) noexcept = 0;
};

/// Right and bottom are exclusive.
struct IRectangle : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0103-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IRectangle";
    using base = IDispatch;

    virtual HRESULT get_Left(LONG* value) noexcept = 0;
    virtual HRESULT put_Left(LONG value) noexcept = 0;
    virtual HRESULT get_Top(LONG* value) noexcept = 0;
    virtual HRESULT put_Top(LONG value) noexcept = 0;
    virtual HRESULT get_Right(LONG* value) noexcept = 0;
    virtual HRESULT put_Right(LONG value) noexcept = 0;
    virtual HRESULT get_Bottom(LONG* value) noexcept = 0;
    virtual HRESULT put_Bottom(LONG value) noexcept = 0;
};

struct IFloatVector2D : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0104-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IFloatVector2D";
    using base = IDispatch;

    virtual HRESULT get_X(double* value) noexcept = 0;
    virtual HRESULT put_X(double value) noexcept = 0;
    virtual HRESULT get_Y(double* value) noexcept = 0;
    virtual HRESULT put_Y(double value) noexcept = 0;
};

/// Read only by this library.
struct ISizeInt : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0105-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "ISizeInt";
    using base = IDispatch;

    virtual HRESULT get_Width(LONG* value) noexcept = 0;
    virtual HRESULT put_Width(LONG value) noexcept = 0;
    virtual HRESULT get_Height(LONG* value) noexcept = 0;
    virtual HRESULT put_Height(LONG value) noexcept = 0;
};

/// Two bounds. Read only by this library.
struct IRangeFloat : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0106-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IRangeFloat";
    using base = IDispatch;

    virtual HRESULT get_Low(double* value) noexcept = 0;
    virtual HRESULT put_Low(double value) noexcept = 0;
    virtual HRESULT get_High(double* value) noexcept = 0;
    virtual HRESULT put_High(double value) noexcept = 0;
};

/// A colour for each of `Count` equal steps of the value range Low..High. Read only by this library.
/// An entry is a colour number: red in bits 0..7, green in 8..15, blue in 16..23.
struct ILookupTable : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0107-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "ILookupTable";
    using base = IDispatch;

    virtual HRESULT get_Count(LONG* value) noexcept = 0;
    virtual HRESULT get_Entry(LONG index, ULONG* colour) noexcept = 0;
    virtual HRESULT get_Low(double* value) noexcept = 0;
    virtual HRESULT get_High(double* value) noexcept = 0;
};

} // namespace Qor::Luxar
