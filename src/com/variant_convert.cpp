#include "com/variant_parts.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <iterator>
#include <limits>
#include <memory>
#include <new>
#include <string_view>
#include <type_traits>
#include <utility>

namespace Qor {

namespace {

struct number {
    enum { of_signed, of_unsigned, of_real } kind;
    union {
        int64_t i;
        uint64_t u;
        double real;
    };
    bool from_bool = false;
};

constexpr number signed_number(int64_t i, bool from_bool = false) noexcept
{
    return {number::of_signed, {.i = i}, from_bool};
}
constexpr number unsigned_number(uint64_t u) noexcept { return {number::of_unsigned, {.u = u}}; }
constexpr number real_number(double real) noexcept { return {number::of_real, {.real = real}}; }

// The one list of the numeric types: calls visit with the member that holds the value.
template <class Value, class Visitor>
bool visit_number(Value& v, Visitor visit) noexcept
{
    switch (v.vt) {
    case VT_I1: visit(v.cVal); return true;
    case VT_UI1: visit(v.bVal); return true;
    case VT_I2: visit(v.iVal); return true;
    case VT_UI2: visit(v.uiVal); return true;
    case VT_I4: visit(v.lVal); return true;
    case VT_INT: visit(v.intVal); return true;
    case VT_UI4: visit(v.ulVal); return true;
    case VT_UINT: visit(v.uintVal); return true;
    case VT_I8: visit(v.llVal); return true;
    case VT_UI8: visit(v.ullVal); return true;
    case VT_R4: visit(v.fltVal); return true;
    case VT_R8: visit(v.dblVal); return true;
    default: return false;
    }
}

// By hand, because the processor's rounding mode belongs to the host.
double round_half_to_even(double x) noexcept
{
    const double below = std::floor(x);
    const double rest = x - below;
    const bool up = rest > 0.5 || (rest == 0.5 && std::fmod(below, 2.0) != 0.0);
    return up ? below + 1.0 : below;
}

template <class T>
HRESULT store(const number& n, T& out) noexcept
{
    if constexpr (std::is_floating_point_v<T>) {
        const double value = n.kind == number::of_signed     ? static_cast<double>(n.i)
                             : n.kind == number::of_unsigned ? static_cast<double>(n.u)
                                                             : n.real;
        // Half way between the highest float and the next power of two; from there on rounding leaves the
        // type.
        constexpr double too_much = 0x1.ffffffp127;
        if (std::is_same_v<T, float> && std::isfinite(value) && std::fabs(value) >= too_much)
            return DISP_E_OVERFLOW;
        // An integer goes to float in one step: by way of double it would be rounded twice.
        out = n.kind == number::of_signed     ? static_cast<T>(n.i)
              : n.kind == number::of_unsigned ? static_cast<T>(n.u)
                                              : static_cast<T>(n.real);
        return S_OK;
    } else {
        using limits = std::numeric_limits<T>;
        if (n.from_bool) {
            // True has all bits set, also where -1 is out of range.
            out = n.i ? static_cast<T>(-1) : T{0};
            return S_OK;
        }
        if (n.kind == number::of_real) {
            const double value = round_half_to_even(n.real);
            // The limit above is a power of two and therefore exact. NaN fails both comparisons.
            const double end = std::ldexp(1.0, limits::digits);
            if (!(value >= static_cast<double>(limits::min()) && value < end)) return DISP_E_OVERFLOW;
            out = static_cast<T>(value);
            return S_OK;
        }
        const bool fits = n.kind == number::of_signed ? std::in_range<T>(n.i) : std::in_range<T>(n.u);
        if (!fits) return DISP_E_OVERFLOW;
        out = n.kind == number::of_signed ? static_cast<T>(n.i) : static_cast<T>(n.u);
        return S_OK;
    }
}

bool is_nonzero(const number& n) noexcept { return n.kind == number::of_real ? n.real != 0.0 : n.u != 0; }

std::wstring_view without_blanks(std::wstring_view text) noexcept
{
    constexpr std::wstring_view blanks = L" \t\n\v\f\r";
    const size_t begin = text.find_first_not_of(blanks);
    return begin == text.npos ? std::wstring_view()
                              : text.substr(begin, text.find_last_not_of(blanks) + 1 - begin);
}

bool is_word(std::wstring_view text, std::wstring_view lower_case) noexcept
{
    if (text.size() != lower_case.size()) return false;
    for (size_t i = 0; i < text.size(); ++i) {
        const wchar_t c = text[i];
        if ((c >= L'A' && c <= L'Z' ? c + 32 : c) != lower_case[i]) return false;
    }
    return true;
}

// Whether a number that no floating-point type can hold is too small for it rather than too large.
bool is_tiny(std::string_view digits) noexcept
{
    const size_t e = digits.find_first_of("eE");
    const std::string_view mantissa = digits.substr(0, e);
    int64_t exponent = 0;
    if (e != digits.npos) {
        std::string_view tail = digits.substr(e + 1);
        if (tail.starts_with('+')) tail.remove_prefix(1);
        const auto read = std::from_chars(tail.data(), tail.data() + tail.size(), exponent);
        if (read.ec == std::errc::result_out_of_range)
            exponent = tail.starts_with('-') ? -(int64_t{1} << 62) : int64_t{1} << 62;
    }
    const auto point = static_cast<int64_t>(std::min(mantissa.find('.'), mantissa.size()));
    const auto first = static_cast<int64_t>(mantissa.find_first_of("123456789"));
    return exponent + point - first < 0;
}

template <class Real>
HRESULT parse_real(std::string_view digits, bool negative, number* out) noexcept
{
    Real value = 0;
    const char* const end = digits.data() + digits.size();
    const auto read = std::from_chars(digits.data(), end, value);
    if (read.ec == std::errc::invalid_argument || read.ptr != end) return DISP_E_TYPEMISMATCH;
    if (read.ec == std::errc::result_out_of_range) {
        if (!is_tiny(digits)) return DISP_E_OVERFLOW;
        value = 0;
    }
    *out = real_number(static_cast<double>(negative ? -value : value));
    return S_OK;
}

// Integers that are written as such are exact to the last digit; with a fraction or an exponent they are
// doubles.
HRESULT parse_integer(std::string_view digits, bool negative, number* out) noexcept
{
    if (digits.find_first_not_of("0123456789") != digits.npos)
        return parse_real<double>(digits, negative, out);
    uint64_t magnitude = 0;
    const auto read = std::from_chars(digits.data(), digits.data() + digits.size(), magnitude);
    if (read.ec != std::errc()) return DISP_E_OVERFLOW;
    if (negative && magnitude > uint64_t{1} << 63) return DISP_E_OVERFLOW;
    *out = negative ? signed_number(static_cast<int64_t>(0 - magnitude)) : unsigned_number(magnitude);
    return S_OK;
}

HRESULT parse_number(std::wstring_view text, VARTYPE type, number* out) noexcept
{
    text = without_blanks(text);
    const bool negative = text.starts_with(L'-');
    if (negative || text.starts_with(L'+')) text.remove_prefix(1);
    // The standard parser takes a minus sign of its own.
    if (text.empty() || text[0] == L'-') return DISP_E_TYPEMISMATCH;

    char few[64];
    std::unique_ptr<char[]> many;
    char* ascii = few;
    if (text.size() > sizeof few) {
        many.reset(new (std::nothrow) char[text.size()]);
        if (!many) return E_OUTOFMEMORY;
        ascii = many.get();
    }
    for (size_t i = 0; i < text.size(); ++i) {
        if (text[i] < L' ' || text[i] > L'~') return DISP_E_TYPEMISMATCH;
        ascii[i] = static_cast<char>(text[i]);
    }
    const std::string_view digits(ascii, text.size());
    if (type == VT_R4) return parse_real<float>(digits, negative, out);
    if (type == VT_R8 || type == VT_BOOL) return parse_real<double>(digits, negative, out);
    return parse_integer(digits, negative, out);
}

HRESULT read_number(const VARIANT& from, VARTYPE type, number* out) noexcept
{
    if (from.vt == VT_EMPTY) {
        *out = signed_number(0);
        return S_OK;
    }
    if (from.vt == VT_BOOL) {
        *out = signed_number(from.boolVal ? -1 : 0, true);
        return S_OK;
    }
    if (from.vt == VT_BSTR) {
        const std::wstring_view text(from.bstrVal ? from.bstrVal : L"", SysStringLen(from.bstrVal));
        const bool yes = is_word(without_blanks(text), L"true");
        if (type == VT_BOOL && (yes || is_word(without_blanks(text), L"false"))) {
            *out = signed_number(yes ? -1 : 0, true);
            return S_OK;
        }
        return parse_number(text, type, out);
    }
    const bool numeric = visit_number(from, [&](auto value) {
        if constexpr (std::is_floating_point_v<decltype(value)>)
            *out = real_number(static_cast<double>(value));
        else if constexpr (std::is_signed_v<decltype(value)>)
            *out = signed_number(value);
        else
            *out = unsigned_number(value);
    });
    return numeric ? S_OK : DISP_E_TYPEMISMATCH;
}

HRESULT to_number(const VARIANT& from, VARTYPE type, VARIANT* to) noexcept
{
    number n = signed_number(0);
    HRESULT hr = read_number(from, type, &n);
    if (failed(hr)) return hr;
    to->vt = type;
    if (type == VT_BOOL)
        to->boolVal = is_nonzero(n) ? VARIANT_TRUE : VARIANT_FALSE;
    else if (!visit_number(*to, [&](auto& member) { hr = store(n, member); }))
        hr = DISP_E_TYPEMISMATCH;
    return hr;
}

HRESULT to_text(const VARIANT& from, VARIANT* to) noexcept
{
    char digits[40]; // a double takes 24 at most
    std::string_view text;
    if (from.vt == VT_BOOL) {
        text = from.boolVal ? "True" : "False";
    } else if (from.vt == VT_ERROR) {
        constexpr std::string_view prefix = "Error ";
        prefix.copy(digits, prefix.size());
        const auto code = static_cast<uint32_t>(from.scode);
        text = {digits, std::to_chars(digits + prefix.size(), std::end(digits), code).ptr};
    } else if (from.vt != VT_EMPTY) {
        const auto print = [&](auto value) {
            text = {digits, std::to_chars(digits, std::end(digits), value).ptr};
        };
        if (!visit_number(from, print)) return DISP_E_TYPEMISMATCH;
    }
    const BSTR wide = SysAllocStringLen(nullptr, static_cast<uint32_t>(text.size()));
    if (!wide) return E_OUTOFMEMORY;
    for (size_t i = 0; i < text.size(); ++i) wide[i] = static_cast<unsigned char>(text[i]);
    to->vt = VT_BSTR;
    to->bstrVal = wide;
    return S_OK;
}

// A null object is one of every kind.
HRESULT to_object(const VARIANT& from, VARTYPE type, VARIANT* to) noexcept
{
    if (from.vt != VT_UNKNOWN && from.vt != VT_DISPATCH) return DISP_E_TYPEMISMATCH;
    IUnknown* const object = from.vt == VT_UNKNOWN ? from.punkVal : from.pdispVal;
    VARIANT result = empty_variant();
    result.vt = type;
    bool found;
    if (type == VT_UNKNOWN)
        found = (result.punkVal = query<IUnknown>(object).detach()) != nullptr;
    else
        found = (result.pdispVal = query<IDispatch>(object).detach()) != nullptr;
    if (object && !found) return DISP_E_TYPEMISMATCH;
    *to = result;
    return S_OK;
}

HRESULT convert(const VARIANT& from, VARTYPE type, VARIANT* to) noexcept
{
    if (from.vt == type) return copy_value(from, to);
    if (from.vt & VT_ARRAY) return DISP_E_TYPEMISMATCH;
    switch (type) {
    case VT_BSTR: return to_text(from, to);
    case VT_UNKNOWN:
    case VT_DISPATCH: return to_object(from, type, to);
    default: return to_number(from, type, to);
    }
}

} // namespace

HRESULT VariantChangeType(VARIANT* target, const VARIANT* source, uint16_t, VARTYPE type) noexcept
{
    if (!target || !source) return E_INVALIDARG;
    if (!is_known_type(type)) return DISP_E_BADVARTYPE;
    if (type & VT_BYREF) return DISP_E_TYPEMISMATCH;
    VARIANT borrowed;
    HRESULT hr = follow_reference(*source, &borrowed);
    if (failed(hr)) return hr;
    VARIANT result = empty_variant();
    hr = convert(borrowed, type, &result);
    return failed(hr) ? hr : replace_value(target, result);
}

} // namespace Qor
