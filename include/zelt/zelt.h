// The library for C++ programs: one include, and a few helpers over the interfaces, none of which is hidden.
//
//     auto root = zelt::create<zelt::IZELT2>("ZELT.Main2");
//     auto flat = zelt::get(root, &zelt::IZELT2::get_FlatFielding);
//     auto frame = zelt::wrap(pixels, width, height, 16);                    // your memory, no copy
//     auto corrected = zelt::call(flat, &zelt::IFlatFielding::FlattenEx, frame, zelt::PixmatEncoding_Unsigned, dark, gain);
//
// A call that fails throws zelt::error, with the code and the texts of the failure.
#pragma once

#include "zelt/com/class_registry.h"
#include "zelt/com/error_info.h"
#include "zelt/com/interface_table.h"
#include "zelt/com/safe_array.h"
#include "zelt/debug_sink.h"
#include "zelt/error.h"
#include "zelt/interfaces/zelt.h"
#include "zelt/pixmat/pixmat.h"
#include "zelt/values.h"

#include <cstring>
#include <tuple>

namespace zelt {

using namespace Qor;
using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;

/// hresult, description, source; what() has it all in one line.
using error = Qor::HResultException;

/// Throws zelt::error for a failing code, with the thread's error information.
inline void check(HRESULT code)
{
    if (!failed(code)) return;
    error failure(code);
    com_ptr<IErrorInfo> info;
    GetErrorInfo(0, info.put());
    if (info) {
        bstr text;
        if (succeeded(info->GetSource(text.put()))) failure.source = text.view();
        if (succeeded(info->GetDescription(text.put()))) failure.description = text.view();
    }
    throw failure;
}

namespace detail {
/// Checks a call whose failure must not be told with the texts that an earlier one left behind.
template <class Call>
void checked(Call&& call)
{
    SetErrorInfo(0, nullptr);
    check(call());
}
} // namespace detail

/// A new object of a class, by its name: "ZELT.Main2" is the root of the library.
template <class Interface>
com_ptr<Interface> create(std::string_view name)
{
    com_ptr<Interface> object;
    detail::checked([&] {
        GUID id;
        const HRESULT hr = CLSIDFromProgID(widen(name).c_str(), &id);
        return failed(hr) ? hr : CoCreateInstance(id, nullptr, CLSCTX_ALL, Interface::iid, object.put_void());
    });
    return object;
}

/// A zero-filled image of the library's own memory, packed.
inline com_ptr<IPixmat2> new_image(int32_t width, int32_t height, int32_t bits,
                                   PixmatEncoding encoding = PixmatEncoding_Unsigned)
{
    SetErrorInfo(0, nullptr);
    com_ptr<IPixmatDescriptor> descriptor;
    com_ptr<IPixmatFactory> factory;
    const auto make = [](const GUID& id, auto& object, const GUID& interface_id) {
        check(CoCreateInstance(id, nullptr, CLSCTX_ALL, interface_id, object.put_void()));
    };
    make(CLSID_PixmatDescriptor, descriptor, IPixmatDescriptor::iid);
    make(CLSID_PixmatFactory, factory, IPixmatFactory::iid);
    check(descriptor->put_Width(width));
    check(descriptor->put_Height(height));
    check(descriptor->put_Bits(bits));
    check(descriptor->put_Encoding(encoding));
    com_ptr<IPixmat2> image;
    check(factory->Create(descriptor.get(), PixmatCreateMode_Packed, image.put()));
    return image;
}

/// An image over memory of the caller, which must outlive it (or give a release callback). Any offset and strides.
inline com_ptr<IPixmat2> wrap(void* data, const image_layout& layout, bool read_only = false,
                              pixmat_release release = nullptr, void* context = nullptr)
{
    com_ptr<IPixmat2> image;
    detail::checked([&] { return WrapPixmat(layout, data, read_only, release, context, image.put()); });
    return image;
}

/// The same for packed rows.
inline com_ptr<IPixmat2> wrap(void* data, int32_t width, int32_t height, int32_t bits,
                              PixmatEncoding encoding = PixmatEncoding_Unsigned)
{
    return wrap(data, packed_layout(width, height, bits, encoding));
}

inline com_ptr<IRectangle> make_rectangle(int32_t left, int32_t top, int32_t right, int32_t bottom)
{
    com_ptr<IRectangle> object;
    detail::checked([&] { return Common::MakeRectangle(left, top, right, bottom, object.put()); });
    return object;
}
inline com_ptr<ICoordinateInt> make_point(int32_t x, int32_t y)
{
    com_ptr<ICoordinateInt> object;
    detail::checked([&] { return Common::MakeCoordinateInt(x, y, object.put()); });
    return object;
}
inline com_ptr<ICoordinateFloat> make_float_point(double x, double y)
{
    com_ptr<ICoordinateFloat> object;
    detail::checked([&] { return Common::MakeCoordinateFloat(x, y, object.put()); });
    return object;
}

namespace detail {

/// What an out argument holds until it is returned, and as what it is returned.
template <class T>
struct out_value {
    T value{};
    T* pass() noexcept { return &value; }
    T take() noexcept { return value; }
};
template <>
struct out_value<VARIANT_BOOL> {
    VARIANT_BOOL value{};
    VARIANT_BOOL* pass() noexcept { return &value; }
    bool take() noexcept { return value != VARIANT_FALSE; }
};
template <class I>
    requires std::is_base_of_v<IUnknown, I>
struct out_value<I*> {
    com_ptr<I> value;
    I** pass() noexcept { return value.put(); }
    com_ptr<I> take() noexcept { return std::move(value); }
};
template <>
struct out_value<BSTR> {
    bstr value;
    BSTR* pass() noexcept { return value.put(); }
    bstr take() noexcept { return std::move(value); }
};
template <>
struct out_value<SAFEARRAY*> {
    safe_array value;
    SAFEARRAY** pass() noexcept { return value.put(); }
    safe_array take() noexcept { return std::move(value); }
};
template <>
struct out_value<VARIANT> {
    variant value;
    VARIANT* pass() noexcept { return value.put(); }
    variant take() noexcept { return std::move(value); }
};

template <class T>
inline constexpr bool is_out =
    std::is_pointer_v<T> && !std::is_base_of_v<IUnknown, std::remove_pointer_t<T>> &&
    !std::is_same_v<T, BSTR> && !std::is_same_v<T, SAFEARRAY*>;

/// An argument as it was given, kept for the length of the call, passed as the method's type.
template <class T>
struct in_value {
    T value{};
    /// DISP_E_OVERFLOW for a whole number that the argument cannot hold.
    template <class G>
    explicit in_value(const G& given) : value(static_cast<T>(given))
    {
        static_assert(!(std::is_floating_point_v<G> && std::is_integral_v<T>), "a whole number is wanted");
        if constexpr (std::is_same_v<T, VARIANT_BOOL> && std::is_same_v<G, bool>)
            value = given ? VARIANT_TRUE : VARIANT_FALSE;
        else if constexpr (std::is_integral_v<G> && std::is_integral_v<T>)
            if (static_cast<G>(value) != given || (value < T{}) != (given < G{}))
                throw error(DISP_E_OVERFLOW);
    }
    explicit in_value(const argument_info& a) : value(static_cast<T>(a.default_number)) {}
    T pass() noexcept { return value; }
};
template <class E>
    requires std::is_enum_v<E>
struct in_value<E> {
    E value{};
    explicit in_value(E given) : value(given) {}
    explicit in_value(const argument_info& a) : value(static_cast<E>(static_cast<int32_t>(a.default_number)))
    {
    }
    E pass() noexcept { return value; }
};
template <class I>
    requires std::is_base_of_v<IUnknown, I>
struct in_value<I*> {
    I* value = nullptr;
    explicit in_value(std::nullptr_t) {}
    explicit in_value(I* given) : value(given) {}
    template <class U>
    explicit in_value(const com_ptr<U>& given) : value(given.get())
    {
    }
    explicit in_value(const argument_info&) {}
    I* pass() noexcept { return value; }
};
template <>
struct in_value<SAFEARRAY*> {
    SAFEARRAY* value = nullptr;
    explicit in_value(SAFEARRAY* given) : value(given) {}
    explicit in_value(const safe_array& given) : value(given.get()) {}
    explicit in_value(const argument_info&) {}
    SAFEARRAY* pass() noexcept { return value; }
};
template <>
struct in_value<BSTR> {
    bstr value;
    explicit in_value(std::wstring_view given) : value(given) {}
    explicit in_value(const argument_info&) {}
    BSTR pass() noexcept { return value.get(); }
};
template <>
struct in_value<VARIANT> {
    variant value;
    template <class G>
        requires(std::is_constructible_v<variant, G> && !std::is_convertible_v<G, const char*>) // no bool
    explicit in_value(const G& given) : value(given) {}
    template <class U>
    explicit in_value(const com_ptr<U>& given) : value(given.get())
    {
    }
    explicit in_value(const argument_info&) : value(variant::attach(missing_argument())) {}
    VARIANT pass() noexcept { return *value.get(); }
};

template <class T, bool Out = is_out<T>>
struct carrier : out_value<std::remove_pointer_t<T>> {
    static constexpr bool given_by_caller = false;
};
template <class T>
struct carrier<T, false> : in_value<T> {
    using in_value<T>::in_value;
    static constexpr bool given_by_caller = true;
};

/// The description of the argument at a place of a method, found by its member pointer.
template <class Member>
const argument_info& describe_argument(IDispatch* object, const GUID& interface_id, Member member,
                                       size_t place)
{
    com_ptr<ITypeInfo> type;
    check(object->GetTypeInfo(0, LOCALE_USER_DEFAULT, type.put()));
    if (type->Describe()->id != interface_id) throw error(E_NOINTERFACE);
    for (const method_info& m : type->Describe()->methods)
        if (std::memcmp(m.member, &member, sizeof member) == 0) {
            if (!m.arguments[place].optional) throw error(DISP_E_PARAMNOTOPTIONAL, m.arguments[place].name);
            return m.arguments[place];
        }
    throw error(DISP_E_MEMBERNOTFOUND);
}

template <class... Args>
constexpr size_t given_before(size_t place)
{
    constexpr bool in[] = {carrier<Args>::given_by_caller..., false};
    size_t n = 0;
    for (size_t i = 0; i < place; ++i) n += in[i];
    return n;
}

template <class T, size_t Place, size_t Index, class Object, class Member, class Given>
carrier<T> carry(Object* object, Member member, const Given& given)
{
    if constexpr (!carrier<T>::given_by_caller)
        return carrier<T>();
    else if constexpr (Index < std::tuple_size_v<Given>)
        return carrier<T>(std::get<Index>(given));
    else
        return carrier<T>(describe_argument(object, Object::iid, member, Place));
}

template <class T>
auto taken(carrier<T>& c)
{
    if constexpr (carrier<T>::given_by_caller)
        return std::tuple<>();
    else
        return std::make_tuple(c.take());
}

template <class I, class... Args, class Given, size_t... N>
auto call(I* object, HRESULT (I::*member)(Args...) noexcept, const Given& given, std::index_sequence<N...>)
{
    static_assert(std::tuple_size_v<Given> <= given_before<Args...>(sizeof...(Args)), "too many arguments");
    if (!object) throw error(E_POINTER, "call of a null object");
    SetErrorInfo(0, nullptr);
    std::tuple<carrier<Args>...> carriers{carry<Args, N, given_before<Args...>(N)>(object, member, given)...};
    check((object->*member)(std::get<N>(carriers).pass()...));
    auto results = std::tuple_cat(taken<Args>(std::get<N>(carriers))...);
    if constexpr (std::tuple_size_v<decltype(results)> == 1)
        return std::get<0>(std::move(results));
    else if constexpr (std::tuple_size_v<decltype(results)> > 1)
        return results;
}

} // namespace detail

/// Calls a method with its arguments in order, results left out. Trailing optional arguments may be left out too; their
/// defaults come from the interface's description. Returns the result, several as a tuple; throws zelt::error.
template <class U, class I, class... Args, class... Given>
auto call(const com_ptr<U>& object, HRESULT (I::*member)(Args...) noexcept, const Given&... given)
{
    return detail::call(static_cast<I*>(object.get()), member, std::tuple<const Given&...>(given...),
                        std::index_sequence_for<Args...>{});
}

/// A property: zelt::get(root, &zelt::IZELT2::get_Statistics).
template <class U, class I, class T>
auto get(const com_ptr<U>& object, HRESULT (I::*member)(T*) noexcept)
{
    return call(object, member);
}

} // namespace zelt
