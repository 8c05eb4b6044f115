#include "value_text.h"

#include "facets.h"

#include <charconv>
#include <cmath>
#include <functional>
#include <optional>

using namespace Qor;

namespace cli {
namespace {

using formatter = std::string (*)(const VARIANT&);

template <class T>
std::string shortest(T value)
{
    if (std::isnan(value)) return "nan"; // whatever its sign
    char text[40];
    const auto [end, error] = std::to_chars(text, text + sizeof text, value);
    return std::string(text, end);
}

/// A number's text; nothing for a value that is none.
std::optional<std::string> plain_number(const VARIANT& v)
{
    switch (v.vt) {
    case VT_I1: return std::to_string(v.cVal);
    case VT_UI1: return std::to_string(v.bVal);
    case VT_I2: return std::to_string(v.iVal);
    case VT_UI2: return std::to_string(v.uiVal);
    case VT_I4:
    case VT_INT: return std::to_string(v.lVal);
    case VT_UI4:
    case VT_UINT: return std::to_string(v.ulVal);
    case VT_I8: return std::to_string(v.llVal);
    case VT_UI8: return std::to_string(v.ullVal);
    case VT_R4: return number_text(v.fltVal);
    case VT_R8: return number_text(v.dblVal);
    case VT_BOOL: return v.boolVal ? "true" : "false";
    default: return {};
    }
}

/// The elements of an array, its leftmost dimension running fastest.
struct array_view {
    explicit array_view(SAFEARRAY* given) : array(given), dimensions(SafeArrayGetDim(given))
    {
        for (uint32_t d = 1; d <= dimensions; ++d) {
            int32_t low = 0;
            int32_t high = -1;
            SafeArrayGetLBound(array, d, &low);
            SafeArrayGetUBound(array, d, &high);
            lows.push_back(low);
            sizes.push_back(high - low + 1);
        }
        SafeArrayGetVartype(array, &type);
    }

    variant at(const std::vector<int32_t>& place) const
    {
        std::vector<int32_t> index(place);
        for (size_t d = 0; d < index.size(); ++d) index[d] += lows[d];
        if (type == VT_VARIANT) {
            variant value;
            SafeArrayGetElement(array, index.data(), value.put());
            return value;
        }
        VARIANT value = empty_variant();
        if (failed(SafeArrayGetElement(array, index.data(), &value.llVal))) return {};
        value.vt = type;
        return variant::attach(value);
    }

    SAFEARRAY* array;
    uint32_t dimensions;
    VARTYPE type = VT_EMPTY;
    std::vector<int32_t> lows;
    std::vector<int32_t> sizes;
};

/// How nested parts of an array are put together; the innermost list is the leftmost dimension.
struct array_style {
    const char* open;
    const char* close;
    const char* between;
    const char* between_rows;
};

std::string array_text(const array_view& a, std::vector<int32_t>& place, size_t level,
                       const array_style& style, formatter element)
{
    std::string text = style.open;
    for (int32_t i = 0; i < a.sizes[level]; ++i) {
        if (i > 0) text += level == 0 ? style.between : style.between_rows;
        place[level] = i;
        text += level == 0 ? element(*a.at(place).get()) : array_text(a, place, level - 1, style, element);
    }
    return text + style.close;
}

std::string array_text(SAFEARRAY* array, const array_style& style, formatter element)
{
    const array_view view(array);
    if (view.dimensions == 0) return std::string(style.open) + style.close;
    std::vector<int32_t> place(view.dimensions);
    return array_text(view, place, view.dimensions - 1, style, element);
}

/// The properties that an object shows without being asked for anything.
std::vector<const method_info*> shown_properties(const interface_info& table)
{
    std::vector<const method_info*> shown;
    for (const method_info& m : table.methods)
        if (m.kind == DISPATCH_PROPERTYGET && m.arguments.size() == 1 && m.id != DISPID_NEWENUM)
            shown.push_back(&m);
    return shown;
}

/// Objects that are no more than their few numbers are written as those, as they are in an argument.
bool is_tuple(const interface_info& table)
{
    for (const char* name : {"IRectangle", "ICoordinateInt", "ICoordinateFloat", "IFloatVector2D", "ISizeInt",
                             "IRangeFloat", "IComplex"})
        if (std::string_view(table.name) == name) return true;
    return false;
}

const method_info* row_of(const interface_info& table, const char* name)
{
    for (const method_info& m : table.methods)
        if (same_name(m.name, name)) return &m;
    return nullptr;
}

/// The items of an object with Count and Item; nothing for another one.
std::optional<std::vector<variant>> items_of(IDispatch* object, const interface_info& table)
{
    const method_info* count = row_of(table, "Count");
    const method_info* item = row_of(table, "Item");
    if (!count || !item || inputs_of(*item).size() != 1) return {};
    const variant number = get_late(object, *count);
    std::vector<variant> items;
    for (int32_t i = 0; i < number->lVal; ++i) {
        std::vector<variant> index;
        index.emplace_back(i);
        items.push_back(call_late(object, *item, index));
    }
    return items;
}

template <class List>
std::string join(const List& list, const char* between,
                 const std::function<std::string(const typename List::value_type&)>& text)
{
    std::string all;
    const char* separator = "";
    for (const auto& element : list) {
        all += separator + text(element);
        separator = between;
    }
    return all;
}

std::string enclosed(char open, const std::string& text, char close)
{
    std::string all(1, open);
    all += text;
    all += close;
    return all;
}

std::string object_text(IDispatch* object)
{
    const interface_info* table = table_of(object);
    if (!object) return "none";
    if (!table) return "(object)";
    if (const auto items = items_of(object, *table))
        return join(*items, "\n", [](const variant& v) { return value_text(*v.get()); });
    const auto properties = shown_properties(*table);
    if (properties.empty()) return std::string("(") + table->name + ")";
    const bool bare = is_tuple(*table);
    return join(properties, bare ? "," : " ", [&](const method_info* m) {
        return (bare ? "" : std::string(m->name) + "=") + value_text(*get_late(object, *m).get());
    });
}

std::string object_json(IDispatch* object)
{
    const interface_info* table = table_of(object);
    if (!table) return "null";
    if (const auto items = items_of(object, *table))
        return enclosed('[', join(*items, ", ", [](const variant& v) { return value_json(*v.get()); }), ']');
    const auto properties = shown_properties(*table);
    const bool bare = is_tuple(*table);
    const std::string inside = join(properties, ", ", [&](const method_info* m) {
        return (bare ? "" : json_string(m->name) + ": ") + value_json(*get_late(object, *m).get());
    });
    return bare ? enclosed('[', inside, ']') : enclosed('{', inside, '}');
}

com_ptr<IDispatch> object_in(const VARIANT& v) { return query<IDispatch>(v.punkVal); }

} // namespace

std::string number_text(double value) { return shortest(value); }

std::string number_text(float value) { return shortest(value); }

std::string value_text(const VARIANT& value)
{
    if (value.vt & VT_ARRAY) return array_text(value.parray, {"", "", " ", "\n"}, value_text);
    if (const auto number = plain_number(value)) return *number;
    switch (value.vt) {
    case VT_BSTR: return narrow({value.bstrVal ? value.bstrVal : L"", SysStringLen(value.bstrVal)});
    case VT_DISPATCH:
    case VT_UNKNOWN:
        return value.punkVal && !object_in(value) ? "(object)" : object_text(object_in(value).get());
    default: return "none";
    }
}

std::string value_json(const VARIANT& value)
{
    if (value.vt & VT_ARRAY) return array_text(value.parray, {"[", "]", ", ", ", "}, value_json);
    if (value.vt == VT_R8 && !std::isfinite(value.dblVal)) return "null";
    if (value.vt == VT_R4 && !std::isfinite(value.fltVal)) return "null";
    if (const auto number = plain_number(value)) return *number;
    switch (value.vt) {
    case VT_BSTR: return json_string(value_text(value));
    case VT_DISPATCH:
    case VT_UNKNOWN: return object_json(object_in(value).get());
    default: return "null";
    }
}

std::string json_string(const std::string& text)
{
    std::string quoted = "\"";
    for (const char c : text) {
        if (c == '"' || c == '\\') quoted += '\\';
        if (static_cast<unsigned char>(c) >= ' ') {
            quoted += c;
            continue;
        }
        char escaped[8];
        std::snprintf(escaped, sizeof escaped, "\\u%04x", static_cast<unsigned>(c));
        quoted += escaped;
    }
    return quoted + "\"";
}

} // namespace cli
