// VariantChangeType against the rules written with long double, which holds every value of every numeric type.
#include "com/probe.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <clocale>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <locale>
#include <optional>
#include <string>
#include <vector>

using namespace Qor;

namespace {

static_assert(std::numeric_limits<long double>::digits >= 64);

constexpr VARTYPE numeric_types[] = {VT_I1,  VT_UI1,  VT_I2, VT_UI2, VT_I4, VT_UI4,
                                     VT_INT, VT_UINT, VT_I8, VT_UI8, VT_R4, VT_R8};
constexpr VARTYPE all_types[] = {VT_EMPTY, VT_NULL,    VT_I1,       VT_UI1,
                                 VT_I2,    VT_UI2,     VT_I4,       VT_UI4,
                                 VT_INT,   VT_UINT,    VT_I8,       VT_UI8,
                                 VT_R4,    VT_R8,      VT_BOOL,     VT_BSTR,
                                 VT_ERROR, VT_UNKNOWN, VT_DISPATCH, static_cast<VARTYPE>(VT_ARRAY | VT_R8)};

bool is_numeric(VARTYPE type)
{
    return std::find(std::begin(numeric_types), std::end(numeric_types), type) != std::end(numeric_types);
}

struct integer_range {
    long double low, high;
};

// Nothing for the real types.
std::optional<integer_range> range_of(VARTYPE type)
{
    const bool is_unsigned =
        type == VT_UI1 || type == VT_UI2 || type == VT_UI4 || type == VT_UINT || type == VT_UI8;
    int bits = 0;
    if (type == VT_I1 || type == VT_UI1) bits = 8;
    if (type == VT_I2 || type == VT_UI2) bits = 16;
    if (type == VT_I4 || type == VT_UI4 || type == VT_INT || type == VT_UINT) bits = 32;
    if (type == VT_I8 || type == VT_UI8) bits = 64;
    if (bits == 0) return std::nullopt;
    if (is_unsigned) return integer_range{0, std::ldexp(1.0L, bits) - 1};
    return integer_range{-std::ldexp(1.0L, bits - 1), std::ldexp(1.0L, bits - 1) - 1};
}

long double value_of(const VARIANT& v)
{
    switch (v.vt) {
    case VT_I1: return v.cVal;
    case VT_UI1: return v.bVal;
    case VT_I2: return v.iVal;
    case VT_UI2: return v.uiVal;
    case VT_I4: return static_cast<long double>(v.lVal);
    case VT_INT: return static_cast<long double>(v.intVal);
    case VT_UI4: return v.ulVal;
    case VT_UINT: return v.uintVal;
    case VT_I8: return static_cast<long double>(v.llVal);
    case VT_UI8: return static_cast<long double>(v.ullVal);
    case VT_R4: return v.fltVal;
    case VT_R8: return v.dblVal;
    case VT_BOOL: return v.boolVal;
    default: ADD_FAILURE() << "not a number: " << v.vt; return 0;
    }
}

VARIANT make(VARTYPE type, long double value)
{
    VARIANT v = empty_variant();
    v.vt = type;
    if (type == VT_R4)
        v.fltVal = static_cast<float>(value);
    else if (type == VT_R8)
        v.dblVal = static_cast<double>(value);
    else if (type == VT_UI8)
        v.ullVal = static_cast<uint64_t>(value);
    else
        v.llVal = static_cast<int64_t>(value); // little-endian: the low bytes are the narrow member
    return v;
}

std::vector<long double> edge_values()
{
    std::vector<long double> values{
        0, -0.0L, 1e-60L, 3e38L, 3.5e38L, -3.5e38L, 1e300L, 0.1L, 1.0L / 3,
        std::numeric_limits<long double>::infinity(), -HUGE_VALL, NAN,
        // The highest float, the last double that rounds to it, and the next double.
        0x1.fffffep127L, 0x1.fffffefffffffp127L, 0x1.ffffffp127L,
        // Integers that round differently to float directly and by way of double.
        0x1.000001p62L + 1, 0x1.000003p62L - 1};
    for (const int bits : {0, 1, 2, 7, 8, 15, 16, 24, 31, 32, 53, 63, 64})
        for (const long double step : {-1.5L, -1.0L, -0.5L, -0.25L, 0.0L, 0.25L, 0.5L, 1.0L, 1.5L})
            for (const int sign : {-1, 1}) values.push_back(sign * (std::ldexp(1.0L, bits) + step));
    return values;
}

// Every value that the type can hold, or rounds to when it is a real type.
std::vector<VARIANT> sources(VARTYPE type)
{
    std::vector<VARIANT> found;
    for (const long double value : edge_values()) {
        const auto range = range_of(type);
        if (!range || (std::rint(value) == value && value >= range->low && value <= range->high))
            found.push_back(make(type, value));
    }
    return found;
}

struct expectation {
    HRESULT hr;
    long double value;
};

expectation by_definition(long double value, VARTYPE type)
{
    if (type == VT_BOOL) return {S_OK, value != 0 ? -1.0L : 0.0L};
    if (type == VT_R8) return {S_OK, static_cast<double>(value)};
    if (type == VT_R4) {
        const auto rounded = static_cast<float>(value);
        return {std::isinf(rounded) && std::isfinite(value) ? DISP_E_OVERFLOW : S_OK, rounded};
    }
    const long double rounded = std::rint(value);
    const auto range = range_of(type);
    return {rounded >= range->low && rounded <= range->high ? S_OK : DISP_E_OVERFLOW, rounded};
}

std::wstring text_of(const variant& v) { return {v->bstrVal, SysStringLen(v->bstrVal)}; }

variant text(std::wstring_view characters)
{
    VARIANT v = empty_variant();
    v.vt = VT_BSTR;
    v.bstrVal = bstr(characters).detach();
    return variant::attach(v);
}

TEST(VariantChangeType, ConvertsNumbersToNumbersByTheRules)
{
    int overflows = 0;
    for (const VARTYPE from : numeric_types)
        for (const VARIANT& source : sources(from))
            for (const VARTYPE to : all_types) {
                if (!is_numeric(to) && to != VT_BOOL) continue;
                const expectation expected = by_definition(value_of(source), to);
                VARIANT target = missing_argument();
                ASSERT_EQ(VariantChangeType(&target, &source, 0, to), expected.hr)
                    << from << " to " << to << ": " << value_of(source);
                if (failed(expected.hr)) {
                    ++overflows;
                    ASSERT_TRUE(is_missing(target)) << "touched by a failure";
                    continue;
                }
                ASSERT_EQ(target.vt, to);
                const long double result = value_of(target);
                ASSERT_TRUE(result == expected.value || (std::isnan(result) && std::isnan(expected.value)))
                    << from << " to " << to << ": " << value_of(source) << " gave " << result;
            }
    EXPECT_GT(overflows, 100);
}

TEST(VariantChangeType, WritesTheShortestTextThatReadsBack)
{
    for (const VARTYPE from : numeric_types)
        for (const VARIANT& source : sources(from)) {
            variant written, back;
            ASSERT_EQ(VariantChangeType(written.put(), &source, 0, VT_BSTR), S_OK);
            ASSERT_EQ(VariantChangeType(back.put(), written.get(), 0, from), S_OK)
                << narrow(text_of(written));
            const long double value = value_of(source);
            EXPECT_TRUE(value_of(*back.get()) == value || std::isnan(value)) << narrow(text_of(written));
            if (range_of(from)) {
                EXPECT_EQ(text_of(written), value < 0 ? std::to_wstring(static_cast<int64_t>(value))
                                                      : std::to_wstring(static_cast<uint64_t>(value)));
                continue;
            }
            if (!std::isfinite(value)) continue;
            char printed[64];
            for (int digits = 1;; ++digits) {
                std::snprintf(printed, sizeof printed, "%.*Lg", digits, value);
                if (from == VT_R4 ? std::strtof(printed, nullptr) == value
                                  : std::strtod(printed, nullptr) == value)
                    break;
            }
            EXPECT_LE(text_of(written).size(), std::strlen(printed)) << printed;
        }
}

TEST(VariantChangeType, ReadsWholeStringsOnly)
{
    const std::wstring many_zeros(5000, L'0');
    const struct {
        std::wstring text;
        VARTYPE type;
        HRESULT hr;
        long double value;
    } cases[] = {
        {L" \t+42\r\n", VT_I4, S_OK, 42},
        {L"-128", VT_I1, S_OK, -128},
        {L"-129", VT_I1, DISP_E_OVERFLOW, 0},
        {L"-0", VT_UI4, S_OK, 0},
        {L"-1", VT_UI4, DISP_E_OVERFLOW, 0},
        {L"2.5", VT_UI1, S_OK, 2},
        {L"-0.5", VT_UI1, S_OK, 0},
        {L"1e3", VT_I2, S_OK, 1000},
        {L"9223372036854775807", VT_I8, S_OK, 9223372036854775807.0L},
        {L"-9223372036854775808", VT_I8, S_OK, -9223372036854775808.0L},
        {L"9223372036854775808", VT_I8, DISP_E_OVERFLOW, 0},
        {L"-9223372036854775809", VT_I8, DISP_E_OVERFLOW, 0},
        {L"18446744073709551615", VT_UI8, S_OK, 18446744073709551615.0L},
        {L"18446744073709551616", VT_UI8, DISP_E_OVERFLOW, 0},
        {L"18446744073709551616", VT_R8, S_OK, 18446744073709551616.0L},
        {many_zeros + L"7", VT_I4, S_OK, 7},
        {L"0." + many_zeros + L"1e5001", VT_R8, S_OK, 1},
        {L"16777217.000000001", VT_R4, S_OK, 16777218}, // a double in between would tie to 16777216
        {L"1e400", VT_R8, DISP_E_OVERFLOW, 0},
        {L"1e39", VT_R4, DISP_E_OVERFLOW, 0},
        {L"1e-400", VT_R8, S_OK, 0},
        {L"1e99999999999999999999", VT_R8, DISP_E_OVERFLOW, 0},
        {L"1e-99999999999999999999", VT_R4, S_OK, 0},
        {L"-inf", VT_R4, S_OK, -HUGE_VALL},
        {L"nan", VT_I4, DISP_E_OVERFLOW, 0},
        {L"TruE ", VT_BOOL, S_OK, -1},
        {L"False", VT_BOOL, S_OK, 0},
        {L"0.0", VT_BOOL, S_OK, 0},
        {L"2", VT_BOOL, S_OK, -1},
        {L"True", VT_I4, DISP_E_TYPEMISMATCH, 0},
    };
    for (const auto& c : cases) {
        variant v = text(c.text);
        EXPECT_EQ(VariantChangeType(v.get(), v.get(), 0, c.type), c.hr) << narrow(c.text) << " to " << c.type;
        if (succeeded(c.hr))
            EXPECT_EQ(value_of(*v.get()), c.value) << narrow(c.text) << " to " << c.type;
        else
            EXPECT_EQ(text_of(v), c.text);
    }
    for (const std::wstring bad :
         {L"", L" ", L"abc", L"1 2", L"+-1", L"--1", L"0x10", L"1e", L"1,5", L".", L"-", L"\x663", L"1\x80"})
        for (const VARTYPE type : {VT_UI1, VT_I8, VT_R4, VT_R8, VT_BOOL}) {
            variant v = text(bad);
            EXPECT_EQ(VariantChangeType(v.get(), v.get(), 0, type), DISP_E_TYPEMISMATCH) << narrow(bad);
        }
    variant cut = text(std::wstring_view(L"1\0002", 3));
    EXPECT_EQ(VariantChangeType(cut.get(), cut.get(), 0, VT_I4), DISP_E_TYPEMISMATCH);
}

TEST(VariantChangeType, ConvertsWhatIsNoNumberAsListedAndNothingElse)
{
    const auto object = make_probe();
    const auto as = [](VARTYPE type) {
        VARIANT v = empty_variant();
        v.vt = type;
        return variant::attach(v);
    };
    variant unknown(static_cast<IUnknown*>(object.get()));
    variant array = as(VT_ARRAY | VT_R8);
    array.get()->parray = SafeArrayCreateVector(VT_R8, 0, 3);
    const variant values[] = {as(VT_EMPTY), as(VT_NULL), as(VT_ERROR), unknown, variant(object.get()), array};
    for (const variant& source : values)
        for (const VARTYPE type : all_types) {
            const VARTYPE from = source.type();
            const bool object_pair =
                (from == VT_UNKNOWN || from == VT_DISPATCH) && (type == VT_UNKNOWN || type == VT_DISPATCH);
            const bool allowed =
                from == type || object_pair || (from == VT_ERROR && type == VT_BSTR) ||
                (from == VT_EMPTY && (is_numeric(type) || type == VT_BOOL || type == VT_BSTR));
            variant target;
            ASSERT_EQ(VariantChangeType(target.put(), source.get(), 0, type),
                      allowed ? S_OK : DISP_E_TYPEMISMATCH)
                << from << " to " << type;
            ASSERT_EQ(target.type(), allowed ? type : VARTYPE{VT_EMPTY});
            EXPECT_TRUE(!object_pair || same_object(target->punkVal, object.get()));
            EXPECT_TRUE(from != VT_EMPTY || !is_numeric(type) || value_of(*target.get()) == 0);
        }
    for (const VARTYPE type : {VT_NULL, VT_EMPTY, VT_ERROR, VT_UNKNOWN, VT_DISPATCH}) {
        variant v(1);
        EXPECT_EQ(VariantChangeType(v.get(), v.get(), 0, type), DISP_E_TYPEMISMATCH) << type;
    }
    variant v(1);
    for (const int type : {6, 7, 12, 14, 24, 0x1003, 0x8003, 0x2000})
        EXPECT_EQ(VariantChangeType(v.get(), v.get(), 0, static_cast<VARTYPE>(type)), DISP_E_BADVARTYPE)
            << type;
    EXPECT_EQ(VariantChangeType(v.get(), v.get(), 0, VT_BYREF | VT_I4), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(VariantChangeType(v.get(), nullptr, 0, VT_I4), E_INVALIDARG);
    EXPECT_EQ(VariantChangeType(nullptr, v.get(), 0, VT_I4), E_INVALIDARG);
}

TEST(VariantChangeType, WritesTextsForBooleansErrorsAndNothing)
{
    variant error(0);
    *error.get() = missing_argument();
    const std::pair<variant, std::wstring> cases[] = {
        {true, L"True"}, {false, L"False"}, {error, L"Error 2147614724"}, {variant(), L""}};
    for (const auto& [source, expected] : cases) {
        variant written;
        ASSERT_EQ(VariantChangeType(written.put(), source.get(), 0, VT_BSTR), S_OK);
        EXPECT_EQ(text_of(written), expected);
    }
}

TEST(VariantChangeType, TrueHasAllBitsSet)
{
    for (const VARTYPE type : numeric_types) {
        variant v(true);
        ASSERT_EQ(VariantChangeType(v.get(), v.get(), 0, type), S_OK) << type;
        const auto range = range_of(type);
        EXPECT_EQ(value_of(*v.get()), range && range->low == 0 ? range->high : -1) << type;
    }
}

TEST(VariantChangeType, FollowsReferences)
{
    for (const VARTYPE type : numeric_types) {
        VARIANT value = make(type, 100), byref = empty_variant(), nested = empty_variant(),
                deeper = empty_variant();
        byref.vt = static_cast<VARTYPE>(VT_BYREF | type), byref.byref = &value.llVal;
        nested.vt = VT_BYREF | VT_VARIANT, nested.byref = &byref;
        deeper.vt = VT_BYREF | VT_VARIANT, deeper.byref = &nested;
        for (const VARIANT* source : {&byref, &nested}) {
            VARIANT target = empty_variant();
            ASSERT_EQ(VariantChangeType(&target, source, 0, VT_I2), S_OK) << type;
            EXPECT_EQ(target.iVal, 100) << type;
            ASSERT_EQ(VariantCopyInd(&target, source), S_OK) << type;
            EXPECT_EQ(target.vt, type);
            EXPECT_EQ(value_of(target), 100) << type;
        }
        VARIANT target = empty_variant();
        EXPECT_EQ(VariantChangeType(&target, &deeper, 0, VT_I2), E_INVALIDARG);
        byref.byref = nullptr;
        EXPECT_EQ(VariantChangeType(&target, &byref, 0, VT_I2), E_INVALIDARG);
    }
}

struct comma : std::numpunct<char> {
    char do_decimal_point() const override { return ','; }
};

TEST(VariantChangeType, DoesNotAskTheLocale)
{
    const std::locale before = std::locale::global(std::locale(std::locale(), new comma));
    std::setlocale(LC_ALL, "de_DE.UTF-8"); // where it is installed
    variant v(1234.5);
    EXPECT_EQ(VariantChangeType(v.get(), v.get(), 0, VT_BSTR), S_OK);
    EXPECT_EQ(text_of(v), L"1234.5");
    EXPECT_EQ(VariantChangeType(v.get(), v.get(), 0, VT_R8), S_OK);
    EXPECT_EQ(v->dblVal, 1234.5);
    std::locale::global(before);
    std::setlocale(LC_ALL, "C");
}

} // namespace
