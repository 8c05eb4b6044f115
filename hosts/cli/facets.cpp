#include "facets.h"

#include "common/zero_divisor.h"
#include "failure.h"

#include <algorithm>
#include <cctype>
#include <strings.h>

using namespace Qor;

namespace cli {
namespace {

std::string lower(std::string text)
{
    for (char& c : text) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return text;
}

/// Letters to insert, delete or exchange to make one word the other.
size_t distance(const std::string& a, const std::string& b)
{
    std::vector<size_t> row(b.size() + 1);
    for (size_t j = 0; j <= b.size(); ++j) row[j] = j;
    for (size_t i = 1; i <= a.size(); ++i) {
        size_t diagonal = std::exchange(row[0], i);
        for (size_t j = 1; j <= b.size(); ++j) {
            const size_t exchanged = diagonal + (a[i - 1] != b[j - 1]);
            diagonal = row[j];
            row[j] = std::min({row[j] + 1, row[j - 1] + 1, exchanged});
        }
    }
    return row[b.size()];
}

bool is_facet(const method_info& m)
{
    return m.kind == DISPATCH_PROPERTYGET && m.arguments.size() == 1 && m.arguments[0].interface_id;
}

/// The answer of Invoke as a failure: the exception's own code and texts where it left some.
[[noreturn]] void raise(HRESULT code, EXCEPINFO& exception, const method_info& method, uint32_t bad_argument)
{
    const bstr source = bstr::attach(exception.bstrSource);
    const bstr description = bstr::attach(exception.bstrDescription);
    SysFreeString(exception.bstrHelpFile);
    if (code == DISP_E_EXCEPTION)
        throw zelt::error(exception.scode, std::wstring(source.view()), std::wstring(description.view()), L"",
                          0);
    std::vector<const argument_info*> visible;
    for (const argument_info& a : method.arguments)
        if (a.way != direction::result) visible.push_back(&a);
    const char* meaning = system_message(code);
    std::string text = meaning ? meaning : "failed";
    if (bad_argument < visible.size())
        text += std::string(" for ") + visible[visible.size() - 1 - bad_argument]->name;
    throw zelt::error(code, text);
}

variant invoke(IDispatch* object, const method_info& method, uint16_t kind, std::vector<variant>& values)
{
    std::wstring name = widen(method.name);
    OLECHAR* names[] = {name.data()};
    DISPID id = DISPID_UNKNOWN;
    zelt::check(object->GetIDsOfNames(GUID_NULL, names, 1, LOCALE_USER_DEFAULT, &id));

    std::vector<VARIANT> arguments(values.size());
    size_t place = 0;
    for (const argument_info& a : method.arguments) {
        if (a.way == direction::result) continue;
        VARIANT& target = arguments[arguments.size() - 1 - place];
        target = *values[place].get();
        if (a.way == direction::out) {
            target = empty_variant();
            target.vt = VT_BYREF | VT_VARIANT;
            target.byref = values[place].put();
        }
        ++place;
    }
    size_t left_out = 0; // optional ones at the end, which a caller of any language would not write
    while (left_out < arguments.size() && is_missing(arguments[left_out])) ++left_out;
    DISPPARAMS params{arguments.data() + left_out, nullptr,
                      static_cast<uint32_t>(arguments.size() - left_out), 0};
    variant result;
    EXCEPINFO exception{};
    auto bad_argument = static_cast<uint32_t>(-1);
    const HRESULT code = object->Invoke(id, GUID_NULL, LOCALE_USER_DEFAULT, kind, &params, result.put(),
                                        &exception, &bad_argument);
    if (failed(code))
        raise(code, exception, method,
              bad_argument == static_cast<uint32_t>(-1) ? bad_argument
                                                        : bad_argument + static_cast<uint32_t>(left_out));
    return result;
}

} // namespace

library::library() : root_(zelt::create<IDispatch>("ZELT.Main2")), table_(table_of(root_.get()))
{
    if (!table_) throw failure("the library does not describe itself");
}

std::vector<std::string> library::facet_names() const
{
    std::vector<std::string> names;
    for (const method_info& m : table_->methods)
        if (is_facet(m)) names.push_back(m.name);
    return names;
}

facet library::find_facet(const std::string& name) const
{
    for (const method_info& m : table_->methods) {
        if (!is_facet(m) || !same_name(m.name, name)) continue;
        const variant value = get_late(root_.get(), m);
        facet f{m.name, query<IDispatch>(value->punkVal), nullptr};
        f.table = table_of(f.object.get());
        if (!f.table) throw failure(f.name + " does not describe itself");
        return f;
    }
    throw usage_error("there is no facet '" + name + "'" + near_misses(name, facet_names()));
}

qualified_name split_name(const std::string& text)
{
    const size_t dot = text.find('.');
    if (dot == std::string::npos) return {text, ""};
    return {text.substr(0, dot), text.substr(dot + 1)};
}

const method_info& find_method(const facet& f, const std::string& name)
{
    std::vector<std::string> known;
    for (const method_info& m : f.table->methods) {
        if (same_name(m.name, name)) return m;
        known.push_back(m.name);
    }
    throw usage_error(f.name + " has no method '" + name + "'" + near_misses(name, known));
}

bool same_name(const std::string& a, const std::string& b) { return strcasecmp(a.c_str(), b.c_str()) == 0; }

std::string near_misses(const std::string& name, std::span<const std::string> known)
{
    const std::string wanted = lower(name);
    std::vector<std::pair<size_t, std::string>> near;
    for (const std::string& k : known) {
        const std::string candidate = lower(k);
        size_t d = distance(wanted, candidate);
        // A part of the name was remembered, as in "FFT" for "FFTThreads".
        if (wanted.size() >= 3 && candidate.find(wanted) != std::string::npos) d = 1;
        if (d <= std::max<size_t>(2, wanted.size() / 3) && d < candidate.size()) near.emplace_back(d, k);
    }
    std::ranges::stable_sort(near, {}, &std::pair<size_t, std::string>::first);
    std::string text;
    const size_t shown = std::min<size_t>(near.size(), 3);
    for (size_t i = 0; i < shown; ++i)
        text += (i == 0 ? ": did you mean " : i + 1 == shown ? " or " : ", ") + near[i].second;
    return text.empty() ? text : text + "?";
}

variant call_late(IDispatch* object, const method_info& method, std::vector<variant>& values)
{
    const interface_info* table = table_of(object);
    if (table && host::divides(*table, method)) {
        std::vector<const VARIANT*> arguments;
        for (const variant& value : values) arguments.push_back(value.get());
        host::refuse_zero_divisor(method, arguments);
    }
    return invoke(object, method, method.kind, values);
}

variant get_late(IDispatch* object, const method_info& property)
{
    std::vector<variant> none;
    return invoke(object, property, DISPATCH_PROPERTYGET, none);
}

} // namespace cli
