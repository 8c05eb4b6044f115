// The image component: images, their descriptors and locks, the converter, notifications, the statistics store.
//
// Images own a packed buffer or wrap memory of the caller with any offset and signed strides. Locks keep the image
// alive and give its pixels; they do not shut each other out. Reading one image from many threads is always safe;
// threads that write and read one image at the same time need an order of their own, as with any array.
#pragma once

#include "zelt/com/interface_table.h"
#include "zelt/com/variant.h"
#include "zelt/pixmat/layout.h"
#include "zelt/pixmat/values.h"

namespace Qor::Luxar {

/// A property bag for a layout; nothing is checked here. All values are 32-bit; offset and strides are in bytes.
struct IPixmatDescriptor : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0201-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IPixmatDescriptor";
    using base = IDispatch;

    virtual HRESULT get_Width(LONG* value) noexcept = 0;
    virtual HRESULT put_Width(LONG value) noexcept = 0;
    virtual HRESULT get_Height(LONG* value) noexcept = 0;
    virtual HRESULT put_Height(LONG value) noexcept = 0;
    virtual HRESULT get_Bits(LONG* value) noexcept = 0;
    virtual HRESULT put_Bits(LONG value) noexcept = 0;
    virtual HRESULT get_Encoding(PixmatEncoding* value) noexcept = 0;
    virtual HRESULT put_Encoding(PixmatEncoding value) noexcept = 0;
    virtual HRESULT get_Offset(LONG* value) noexcept = 0;
    virtual HRESULT put_Offset(LONG value) noexcept = 0;
    virtual HRESULT get_XStride(LONG* value) noexcept = 0;
    virtual HRESULT put_XStride(LONG value) noexcept = 0;
    virtual HRESULT get_YStride(LONG* value) noexcept = 0;
    virtual HRESULT put_YStride(LONG value) noexcept = 0;
};

/// Access to the pixels of one image; it ends when the last reference goes.
struct IPixmatLock : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0202-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IPixmatLock";
    using base = IUnknown;

    /// The buffer that the descriptor's offset and strides address. `reserved` is 0.
    virtual uint8_t* Data(LONG reserved) noexcept = 0;
    /// Announces a complete result: drops the image's keyed statistics, then notifies its event sinks.
    /// `changed` null means the whole image. E_INVALIDARG for a read lock.
    virtual HRESULT Commit(const rectangle* changed) noexcept = 0;
};

/// When sinks are told of a change. Any other value is refused.
enum PixmatEventMode : int32_t {
    PixmatEventMode_AfterCommit = 1,
};

struct IPixmat2;

/// What a listener to images implements.
struct IPixmatEvents : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0203-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IPixmatEvents";
    using base = IUnknown;

    /// Comes on the committing thread. `changed` null means the whole image. The answer is not looked at.
    virtual HRESULT OnPixmatChanged(IPixmat2* image, const rectangle* changed) noexcept = 0;
};

struct IPixmat2 : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0204-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IPixmat2";
    using base = IDispatch;

    /// The image as it is now: a new descriptor each time.
    virtual HRESULT GetDescriptor(IPixmatDescriptor** out) noexcept = 0;
    /// `area` null means the whole image; a rectangle that leaves the image is E_INVALIDARG. `scale` is 1.0,
    /// any other value is E_INVALIDARG. The lock's data are those of the whole image in either case.
    virtual HRESULT OpenRead(IRectangle* area, double scale, IPixmatLock** out) noexcept = 0;
    /// A write lock that is released without Commit drops the keyed statistics, since pixels may have changed,
    /// but notifies nobody.
    virtual HRESULT OpenWrite(IPixmatLock** out) noexcept = 0;
    /// A packed copy with its own memory; statistics and listeners do not come along.
    virtual HRESULT Clone(IPixmat2** out) noexcept = 0;
    /// One sink may be given once; a second time is E_INVALIDARG.
    virtual HRESULT StartNotifications(IPixmatEvents* sink, PixmatEventMode mode) noexcept = 0;
    /// E_INVALIDARG for a sink that is not listening.
    virtual HRESULT StopNotifications(IPixmatEvents* sink) noexcept = 0;
};

/// Keyed values that live on an image until its pixels change.
struct IPixmatStatisticsStore : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0205-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IPixmatStatisticsStore";
    using base = IUnknown;

    /// Copies the value; null pointers are E_POINTER.
    virtual HRESULT SetValue(BSTR key, const VARIANT* value) noexcept = 0;
    /// S_OK and a copy for a key that is present, else S_FALSE and an empty value.
    virtual HRESULT GetValue(BSTR key, VARIANT* value) noexcept = 0;
};

/// The component's pixel pipeline between two layouts: values through a lookup table or through levels.
struct IPixmatTransfer : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0206-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IPixmatTransfer";
    using base = IUnknown;

    /// Null pointers are E_POINTER; layouts of different width or height and a rectangle or point E_INVALIDARG; a
    /// pair without mapping E_NOTIMPL: nothing is written then. Without table and levels the pixels are recoded as by
    /// ConvertRecode. The last two are 0.
    virtual HRESULT Run(const void* source, void* target, const rectangle* source_area,
                        const coordinate<int32_t>* target_point) noexcept = 0;
    /// `count` colour numbers (see ILookupTable) over the value range low..high: the entry of a value v is
    /// floor((v - low) / (high - low) * count), limited to the table (NaN: the first). The value of a colour is its
    /// luminance; complex sources and targets without colour are E_NOTIMPL in Run. Alpha is 255. A table goes before
    /// levels. E_POINTER for null entries, E_INVALIDARG for a count below 1.
    virtual HRESULT SetLookupTable(const uint32_t* entries, LONG count, double low, double high) noexcept = 0;
    /// Levels act on the nominal range of the source mapped to [0, 1] (floats: the value itself) and end on that of
    /// the target: u = (v - 0.5) * contrast + 0.5 + brightness, limited to [0, 1]; u to the power of 1 / gamma; then
    /// 0.5 (2u)^sigma below one half and 1 - 0.5 (2 (1 - u))^sigma above; rounded, float targets not. Colour to colour
    /// acts on each channel and keeps alpha. Defaults (1, 0, 1, 1) leave pixels of the same range as they are. Values
    /// that are not finite, gamma and sigma of 0 and below are E_INVALIDARG; complex pixels E_NOTIMPL in Run.
    virtual HRESULT SetContrast(double value) noexcept = 0;
    virtual HRESULT SetBrightness(double value) noexcept = 0;
    virtual HRESULT SetGamma(double value) noexcept = 0;
    virtual HRESULT SetSigma(double value) noexcept = 0;
};

/// Element-wise copy and conversion between two layouts. A new object for each use; it has no state.
/// Both conversions take any strides; a rectangle that leaves the source or lands outside the destination is
/// E_INVALIDARG before anything is written; a region of non-positive width or height is an empty success. Null data
/// is E_POINTER unless the region is empty. Source and target may be the same memory with the same strides; what
/// overlaps otherwise gives no defined values.
struct IPixmatConverter : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0207-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IPixmatConverter";
    using base = IUnknown;

    /// Carries values over. To integers: rounded half away from zero, limited to the target's nominal range (12
    /// bits: 4095), NaN is 0. To float: the value itself, unscaled. Grey to colour repeats the grey limited to 8
    /// bits, alpha 255; colour to grey is 0.299 R + 0.587 G + 0.114 B, rounded (to float: not rounded); colour to
    /// colour reorders, keeps alpha between four-byte layouts, else alpha is 255. Real to complex makes the
    /// imaginary part zero; complex to real takes the real part; complex and half-complex to the same kind in the
    /// other precision is element-wise. Anything else is E_NOTIMPL.
    virtual HRESULT ConvertRecode(const image_layout& source_layout, const void* source,
                                  const image_layout& target_layout, void* target,
                                  const rectangle* source_area,
                                  const coordinate<int32_t>* target_point) noexcept = 0;
    /// Reserved: E_NOTIMPL.
    virtual HRESULT Reserved1() noexcept = 0;
    virtual HRESULT ConvertCopy(const image_layout& source_layout, const image_layout& target_layout,
                                IPixmatTransfer** out) noexcept = 0;
    /// Reserved: E_NOTIMPL.
    virtual HRESULT Reserved2() noexcept = 0;
    /// The plain numeric conversion: truncation toward zero, low bits kept (through a 64-bit integer; NaN and what
    /// neither a signed nor an unsigned one holds give 0), nothing limited. Complex as in ConvertRecode. Colour casts
    /// to the same layout only; anything else is E_NOTIMPL.
    virtual HRESULT ConvertCast(const image_layout& source_layout, const void* source,
                                const image_layout& target_layout, void* target, const rectangle* source_area,
                                const coordinate<int32_t>* target_point) noexcept = 0;
};

/// What the factory makes of a descriptor.
enum PixmatCreateMode : int32_t {
    PixmatCreateMode_Layout = 1, ///< the layout as it is, strides and offset included
    PixmatCreateMode_Packed = 2, ///< size, bits and encoding; packed, whatever the strides say
};

/// Called once, when a wrapped buffer is no longer in use.
using pixmat_release = void (*)(void* context) noexcept;

struct IPixmatFactory : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0208-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IPixmatFactory";
    using base = IDispatch;

    /// A zero-filled image. Any encoding is accepted, and sizes of 0. E_INVALIDARG for a null descriptor, another
    /// mode, negative sizes or bits below 1; E_OUTOFMEMORY when the memory cannot be had, and for packed rows of
    /// more than 2^31 - 1 bytes. In mode 1 overlapping pixels (strides of 0) are the caller's wish.
    virtual HRESULT Create(IPixmatDescriptor* descriptor, PixmatCreateMode mode, IPixmat2** out) noexcept = 0;
};

inline constexpr GUID CLSID_PixmatDescriptor = guid("5a1e0001-0201-4000-8000-00000000c0de");
inline constexpr GUID CLSID_PixmatFactory = guid("5a1e0001-0208-4000-8000-00000000c0de");
inline constexpr GUID CLSID_PixmatConverter = guid("5a1e0001-0207-4000-8000-00000000c0de");

/// An image over memory of the caller: data + offset is pixel (0,0). `release(context)`, if given, is called once when
/// the image goes; not when this call fails. A read-only image refuses OpenWrite with E_ACCESSDENIED.
ZELT_API HRESULT WrapPixmat(const image_layout& layout, void* data, bool read_only, pixmat_release release,
                            void* context, IPixmat2** out) noexcept;

} // namespace Qor::Luxar

namespace Qor {

template <>
struct enumeration_of<Luxar::PixmatEncoding> {
    static constexpr enumeration_value values[] = {
        {"PixmatEncoding_Unsigned", Luxar::PixmatEncoding_Unsigned},
        {"PixmatEncoding_Signed", Luxar::PixmatEncoding_Signed},
        {"PixmatEncoding_Float", Luxar::PixmatEncoding_Float},
        {"PixmatEncoding_RGB", Luxar::PixmatEncoding_RGB},
        {"PixmatEncoding_RGBA", Luxar::PixmatEncoding_RGBA},
        {"PixmatEncoding_BGR", Luxar::PixmatEncoding_BGR},
        {"PixmatEncoding_Reserved3", Luxar::PixmatEncoding_Reserved3},
        {"PixmatEncoding_Reserved4", Luxar::PixmatEncoding_Reserved4},
        {"PixmatEncoding_Data", Luxar::PixmatEncoding_Data},
        {"PixmatEncoding_Reserved1", Luxar::PixmatEncoding_Reserved1},
        {"PixmatEncoding_Complex_Float", Luxar::PixmatEncoding_Complex_Float},
        {"PixmatEncoding_Reserved2", Luxar::PixmatEncoding_Reserved2},
        {"PixmatEncoding_Complex_Float_Half_Even", Luxar::PixmatEncoding_Complex_Float_Half_Even},
        {"PixmatEncoding_BGRA", Luxar::PixmatEncoding_BGRA},
        {"PixmatEncoding_Float_Vector2D", Luxar::PixmatEncoding_Float_Vector2D},
        {"PixmatEncoding_Float_Vector3D", Luxar::PixmatEncoding_Float_Vector3D},
        {"PixmatEncoding_Float_Vector4D", Luxar::PixmatEncoding_Float_Vector4D},
        {"PixmatEncoding_Complex_Float_Half_Odd", Luxar::PixmatEncoding_Complex_Float_Half_Odd},
    };
    static constexpr enumeration_info info{"PixmatEncoding", values};
};

template <>
struct enumeration_of<Luxar::PixmatEventMode> {
    static constexpr enumeration_value values[] = {
        {"PixmatEventMode_AfterCommit", Luxar::PixmatEventMode_AfterCommit},
    };
    static constexpr enumeration_info info{"PixmatEventMode", values};
};

template <>
struct enumeration_of<Luxar::PixmatCreateMode> {
    static constexpr enumeration_value values[] = {
        {"PixmatCreateMode_Layout", Luxar::PixmatCreateMode_Layout},
        {"PixmatCreateMode_Packed", Luxar::PixmatCreateMode_Packed},
    };
    static constexpr enumeration_info info{"PixmatCreateMode", values};
};

} // namespace Qor
