// An interface described as data: what late binding, scripts, the command line and the reference pages go by.
// Read it from any object: IDispatch::GetTypeInfo, then ITypeInfo::Describe.
#pragma once

#include "zelt/com/variant.h"

#include <span>

namespace Qor {

enum class direction : uint8_t { in, out, result };

struct enumeration_value {
    const char* name;
    int32_t value;
};

struct enumeration_info {
    const char* name;
    std::span<const enumeration_value> values;
};

/// One argument. `type` is what a late-bound call converts to: a number type, VT_BSTR, VT_VARIANT, VT_ARRAY |
/// element, or VT_DISPATCH for any interface, which `interface_id` then names.
struct argument_info {
    const char* name;
    const char* type_name; ///< as C++ spells it, without pointer: "double", "IPixmat2", "ZELT_Rounding"
    VARTYPE type;
    direction way;
    bool optional;
    double
        default_number; ///< for an optional number; an optional object is null, an optional VARIANT missing
    const GUID* interface_id;
    const enumeration_info* enumeration;
};

struct method_info {
    const char* name;
    const char* help;
    const char*
        pixels; ///< accepted pixel types and the type of the result; null where the table does not tell
    DISPID id;
    uint16_t kind; ///< DISPATCH_METHOD, DISPATCH_PROPERTYGET or DISPATCH_PROPERTYPUT
    bool takes_image;
    std::span<const argument_info> arguments;
    /// Calls the method of `self`, which is the described interface. A slot for each argument in order: the
    /// value, of exactly the argument's type (an object is that very interface, in punkVal); results come back
    /// in their slots, objects and strings with ownership.
    HRESULT (*call)(IUnknown* self, VARIANT* slots) noexcept;
    unsigned char member[16]; ///< the member pointer's bytes, by which a typed caller finds its row
};

struct interface_info {
    const char* name;
    const char* help;
    GUID id;
    std::span<const method_info> methods;
};

/// What GetTypeInfo hands out here.
struct ITypeInfo : IUnknown {
    static constexpr GUID iid = guid("5a1e0000-0008-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "ITypeInfo";
    using base = IUnknown;

    /// Static data; lives as long as the library.
    virtual const interface_info* Describe() noexcept = 0;
};

/// Specialised beside an enumeration that scripts see: `static constexpr enumeration_info info`.
template <class E>
struct enumeration_of;

} // namespace Qor
