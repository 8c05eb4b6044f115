// Building blocks of interface tables. One row per method, in slot order:
//
//     constexpr auto rows = std::tuple(
//         method<&IStatistics::Minimum>("Minimum", "smallest pixel value", in("pIImage"), opt("pIArea"), result("pVal")),
//         get<&IStatistics::get_SubsampleFactor>("SubsampleFactor", "...", result("pValue")), ...);
//     template <> const interface_info& Qor::table_of<IStatistics>() noexcept
//     {
//         return interface_table<IStatistics, rows>::info("measures images");
//     }
//
// Types come from the C++ signature; the compiler checks that each argument has one name.
#pragma once

#include "zelt/com/interface_table.h"
#include "zelt/com/safe_array.h"

#include <array>
#include <cstring>
#include <tuple>
#include <type_traits>

namespace Qor {

struct argument_name {
    const char* name;
    direction way;
    bool optional;
    double default_number;
};

constexpr argument_name in(const char* name) { return {name, direction::in, false, 0}; }
constexpr argument_name opt(const char* name, double default_number = 0)
{
    return {name, direction::in, true, default_number};
}
constexpr argument_name out(const char* name) { return {name, direction::out, false, 0}; }
constexpr argument_name result(const char* name) { return {name, direction::result, false, 0}; }

namespace detail {

/// How one C++ argument type travels in a VARIANT slot: its tag, its spelling, a value to pass, a value to take back.
template <class T>
struct carried;

template <class T, VARTYPE Tag, auto Member>
struct carried_number {
    static constexpr VARTYPE type = Tag;
    static constexpr const GUID* interface_id = nullptr;
    static constexpr const enumeration_info* enumeration = nullptr;
    static T get(const VARIANT& slot) noexcept { return slot.*Member; }
    static void set(VARIANT& slot, T value) noexcept
    {
        slot.vt = Tag;
        slot.*Member = value;
    }
};
#define ZELT_CARRIED(T, tag, member, spelling)                                                               \
    template <>                                                                                              \
    struct carried<T> : carried_number<T, tag, &VARIANT::member> {                                           \
        static constexpr const char* spelled = spelling;                                                     \
    }
ZELT_CARRIED(int32_t, VT_I4, lVal, "long");
ZELT_CARRIED(uint32_t, VT_UI4, ulVal, "unsigned long");
ZELT_CARRIED(uint16_t, VT_UI2, uiVal, "unsigned short");
ZELT_CARRIED(float, VT_R4, fltVal, "float");
ZELT_CARRIED(double, VT_R8, dblVal, "double");
ZELT_CARRIED(VARIANT_BOOL, VT_BOOL, boolVal, "VARIANT_BOOL");
ZELT_CARRIED(BSTR, VT_BSTR, bstrVal, "BSTR");
#undef ZELT_CARRIED

template <class E>
    requires std::is_enum_v<E>
struct carried<E> {
    static constexpr VARTYPE type = VT_I4;
    static constexpr const char* spelled = enumeration_of<E>::info.name;
    static constexpr const GUID* interface_id = nullptr;
    static constexpr const enumeration_info* enumeration = &enumeration_of<E>::info;
    static E get(const VARIANT& slot) noexcept { return static_cast<E>(slot.lVal); }
    static void set(VARIANT& slot, E value) noexcept
    {
        slot.vt = VT_I4;
        slot.lVal = static_cast<int32_t>(value);
    }
};

template <>
struct carried<VARIANT> {
    static constexpr VARTYPE type = VT_VARIANT;
    static constexpr const char* spelled = "VARIANT";
    static constexpr const GUID* interface_id = nullptr;
    static constexpr const enumeration_info* enumeration = nullptr;
    static VARIANT get(const VARIANT& slot) noexcept { return slot; }
    static void set(VARIANT& slot, const VARIANT& value) noexcept { slot = value; }
};

template <>
struct carried<SAFEARRAY*> {
    static constexpr VARTYPE type = VT_ARRAY;
    static constexpr const char* spelled = "SAFEARRAY";
    static constexpr const GUID* interface_id = nullptr;
    static constexpr const enumeration_info* enumeration = nullptr;
    static SAFEARRAY* get(const VARIANT& slot) noexcept { return slot.parray; }
    static void set(VARIANT& slot, SAFEARRAY* value) noexcept
    {
        VARTYPE element = VT_EMPTY;
        if (value) SafeArrayGetVartype(value, &element);
        slot.vt = value ? static_cast<VARTYPE>(VT_ARRAY | element) : static_cast<VARTYPE>(VT_EMPTY);
        slot.parray = value;
    }
};

template <class I>
    requires std::is_base_of_v<IUnknown, I>
struct carried<I*> {
    static constexpr VARTYPE type = VT_DISPATCH;
    static constexpr const char* spelled = I::interface_name;
    static constexpr const GUID* interface_id = &I::iid;
    static constexpr const enumeration_info* enumeration = nullptr;
    static I* get(const VARIANT& slot) noexcept { return static_cast<I*>(slot.punkVal); }
    static void set(VARIANT& slot, I* value) noexcept
    {
        slot.vt = VT_UNKNOWN;
        slot.punkVal = value;
    }
};

template <class T>
struct is_out : std::false_type {
};
template <class T>
struct is_out<T*> : std::true_type {
};
template <class I>
    requires std::is_base_of_v<IUnknown, I>
struct is_out<I*> : std::false_type {
};
template <>
struct is_out<BSTR> : std::false_type {
};
template <>
struct is_out<SAFEARRAY*> : std::false_type {
};

/// Holds one argument for the length of a call and hands results back to the slot.
template <class T>
struct held {
    explicit held(VARIANT& slot) noexcept : value(carried<T>::get(slot)) {}
    T pass() noexcept { return value; }
    T value;
};
template <class T>
    requires(is_out<T>::value)
struct held<T> {
    using value_type = std::remove_pointer_t<T>;
    explicit held(VARIANT& slot) noexcept : slot_(slot) {}
    held(const held&) = delete;
    held& operator=(const held&) = delete;
    ~held() { carried<value_type>::set(slot_, value_); }
    T pass() noexcept { return &value_; }

private:
    VARIANT& slot_;
    value_type value_{};
};

template <class T>
struct bare {
    using type = T;
};
template <class T>
    requires(is_out<T>::value)
struct bare<T> {
    using type = std::remove_pointer_t<T>;
};

template <auto Member>
struct member;
template <class I, class... Args, HRESULT (I::*Member)(Args...) noexcept>
struct member<Member> {
    static constexpr size_t arity = sizeof...(Args);

    static HRESULT call(IUnknown* self, VARIANT* slots) noexcept
    {
        return call(static_cast<I*>(self), slots, std::index_sequence_for<Args...>{});
    }

    template <size_t... N>
    static constexpr std::array<argument_info, arity> describe(const std::array<argument_name, arity>& names,
                                                               std::index_sequence<N...>)
    {
        return {describe<Args>(names[N])...};
    }
    static constexpr auto describe(const std::array<argument_name, arity>& names)
    {
        return describe(names, std::index_sequence_for<Args...>{});
    }

private:
    template <size_t... N>
    static HRESULT call(I* self, VARIANT* slots, std::index_sequence<N...>) noexcept
    {
        return [self](held<Args>&&... arguments) noexcept {
            return (self->*Member)(arguments.pass()...);
        }(held<Args>(slots[N])...);
    }

    template <class T>
    static constexpr argument_info describe(const argument_name& n)
    {
        if ((n.way != direction::in) != is_out<T>::value) throw "in, out or result does not fit the C++ type";
        using c = carried<typename bare<T>::type>;
        return {n.name,     c::spelled,       c::type,         n.way,
                n.optional, n.default_number, c::interface_id, c::enumeration};
    }
};

} // namespace detail

/// One row, with its arguments.
template <size_t Arity>
struct method_row {
    const char* name;
    const char* help;
    uint16_t kind;
    std::array<argument_info, Arity> arguments;
    HRESULT (*call)(IUnknown*, VARIANT*) noexcept;
    std::array<unsigned char, 16> (*member)() noexcept;
    const char* pixels = nullptr;
};

/// A row that also tells which pixels the method takes, and what comes out.
template <size_t Arity>
constexpr method_row<Arity> pixels(const char* types, method_row<Arity> row)
{
    row.pixels = types;
    return row;
}

namespace detail {

template <auto Member>
std::array<unsigned char, 16> member_bytes() noexcept
{
    std::array<unsigned char, 16> bytes{};
    const auto pointer = Member;
    static_assert(sizeof pointer <= sizeof bytes);
    std::memcpy(bytes.data(), &pointer, sizeof pointer);
    return bytes;
}

template <auto Member, class... Names>
constexpr auto row(uint16_t kind, const char* name, const char* help, Names... names)
{
    static_assert(sizeof...(Names) == member<Member>::arity, "one name for each argument, in order");
    return method_row<sizeof...(Names)>{
        name,
        help,
        kind,
        member<Member>::describe(std::array<argument_name, sizeof...(Names)>{names...}),
        &member<Member>::call,
        &member_bytes<Member>,
        nullptr};
}

} // namespace detail

template <auto Member, class... Names>
constexpr auto method(const char* name, const char* help, Names... names)
{
    return detail::row<Member>(DISPATCH_METHOD, name, help, names...);
}
template <auto Member, class... Names>
constexpr auto get(const char* name, const char* help, Names... names)
{
    return detail::row<Member>(DISPATCH_PROPERTYGET, name, help, names...);
}
template <auto Member, class... Names>
constexpr auto put(const char* name, const char* help, Names... names)
{
    return detail::row<Member>(DISPATCH_PROPERTYPUT, name, help, names...);
}

/// A property that scripts may read by the object alone gets DISPID_VALUE, an enumerator DISPID_NEWENUM.
constexpr DISPID well_known_id(const char* name) noexcept
{
    const std::string_view n = name;
    return n == "Value" ? DISPID_VALUE : n == "_NewEnum" ? DISPID_NEWENUM : DISPID_UNKNOWN;
}

/// The table of one interface. `Rows` is a tuple of rows with static storage.
template <class Interface, const auto& Rows>
class interface_table {
public:
    static const interface_info& info(const char* help) noexcept
    {
        static const std::array<method_info, count> methods = build(std::make_index_sequence<count>{});
        static const interface_info table{Interface::interface_name, help, Interface::iid, methods};
        return table;
    }

private:
    static constexpr size_t count = std::tuple_size_v<std::remove_cvref_t<decltype(Rows)>>;

    template <size_t... N>
    static std::array<method_info, count> build(std::index_sequence<N...>) noexcept
    {
        std::array<method_info, count> methods{describe(std::get<N>(Rows))...};
        for (size_t i = 0; i < count; ++i) {
            methods[i].id = well_known_id(methods[i].name);
            if (methods[i].id == DISPID_UNKNOWN) methods[i].id = static_cast<DISPID>(i + 1);
            for (size_t j = 0; j < i; ++j) // a property's put shares the number of its get
                if (std::strcmp(methods[i].name, methods[j].name) == 0) methods[i].id = methods[j].id;
        }
        return methods;
    }

    template <size_t Arity>
    static method_info describe(const method_row<Arity>& row) noexcept
    {
        method_info m{row.name, row.help, row.pixels, 0, row.kind, false, row.arguments, row.call, {}};
        for (const argument_info& a : row.arguments)
            if (a.way == direction::in && std::string_view(a.type_name) == "IPixmat2") m.takes_image = true;
        const auto bytes = row.member();
        std::memcpy(m.member, bytes.data(), bytes.size());
        return m;
    }
};

} // namespace Qor
