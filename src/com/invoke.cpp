#include "com/invoke.h"

#include "com/implements.h"
#include "zelt/com/error_info.h"
#include "zelt/com/safe_array.h"

#include <algorithm>
#include <array>

namespace Qor {
namespace {

constexpr uint32_t most_arguments = 24;

bool same_name(const OLECHAR* asked, const char* name) noexcept
{
    const auto lower = [](uint32_t c) { return c >= 'A' && c <= 'Z' ? c + ('a' - 'A') : c; };
    for (;; ++asked, ++name) {
        if (lower(static_cast<uint32_t>(*asked)) != lower(static_cast<unsigned char>(*name))) return false;
        if (!*name) return true;
    }
}

const method_info* find(const interface_info& table, DISPID id, uint16_t flags) noexcept
{
    if (flags & DISPATCH_PROPERTYPUTREF) flags |= DISPATCH_PROPERTYPUT;
    for (const method_info& m : table.methods)
        if (m.id == id && (m.kind & flags)) return &m;
    return nullptr;
}

/// The value behind VT_BYREF | VT_VARIANT, or the value itself.
const VARIANT& follow(const VARIANT& v) noexcept
{
    const bool to_variant = v.vt == (VT_BYREF | VT_VARIANT) && v.byref;
    return to_variant ? *static_cast<const VARIANT*>(v.byref) : v;
}

/// A value or what it refers to, as an object. False when it is no object at all.
bool get_object(const VARIANT& v, IUnknown** object) noexcept
{
    const VARIANT& value = follow(v);
    switch (value.vt) {
    case VT_UNKNOWN:
    case VT_DISPATCH: *object = value.punkVal; return true;
    case VT_BYREF | VT_UNKNOWN:
    case VT_BYREF | VT_DISPATCH:
        *object = value.byref ? *static_cast<IUnknown**>(value.byref) : nullptr;
        return true;
    default: return false;
    }
}

bool get_array(const VARIANT& v, SAFEARRAY** array) noexcept
{
    const VARIANT& value = follow(v);
    if (!(value.vt & VT_ARRAY)) return false;
    *array =
        value.vt & VT_BYREF ? (value.byref ? *static_cast<SAFEARRAY**>(value.byref) : nullptr) : value.parray;
    return *array != nullptr;
}

/// The slots of one call and what each of them must free.
class call_frame {
public:
    call_frame(const method_info& m, bool lenient) noexcept : method_(m), lenient_(lenient)
    {
        slots_.fill(empty_variant());
    }
    ~call_frame()
    {
        for (size_t i = 0; i < method_.arguments.size(); ++i)
            if (!borrowed_[i]) VariantClear(&slots_[i]);
    }
    call_frame(const call_frame&) = delete;
    call_frame& operator=(const call_frame&) = delete;

    VARIANT* slots() noexcept { return slots_.data(); }

    HRESULT place(size_t i, const VARIANT* given) noexcept
    {
        const argument_info& a = method_.arguments[i];
        if (a.way != direction::in) return place_out(a, given);
        if (!given || is_missing(*given)) {
            // A VARIANT operand that was passed as missing is handed on as it is.
            if (given && a.type == VT_VARIANT) return VariantCopyInd(&slots_[i], given);
            if (given && !a.optional && is_lenient_image(a))
                return E_INVALIDARG; // it came, but not as an object
            return place_default(i, a);
        }
        if (a.interface_id) return place_object(i, a, *given);
        if (a.type == VT_VARIANT) return VariantCopyInd(&slots_[i], given);
        if (a.type == VT_ARRAY) {
            borrowed_[i] = true;
            SAFEARRAY* array = nullptr;
            if (!get_array(*given, &array)) return DISP_E_TYPEMISMATCH;
            slots_[i].vt = VT_ARRAY;
            slots_[i].parray = array;
            return S_OK;
        }
        return VariantChangeType(&slots_[i], given, 0, a.type);
    }

    /// The result leaves the frame; an object goes as VT_DISPATCH where it is one.
    void take(size_t i, VARIANT* target) noexcept
    {
        VARIANT value = std::exchange(slots_[i], empty_variant());
        if (value.vt == VT_UNKNOWN) {
            const auto object = com_ptr<IUnknown>::attach(value.punkVal);
            com_ptr<IDispatch> scriptable = object.as<IDispatch>();
            if (scriptable || !object) {
                value.vt = VT_DISPATCH;
                value.pdispVal = scriptable.detach();
            } else {
                value.punkVal = com_ptr(object).detach();
            }
        }
        *target = value;
    }

private:
    bool is_lenient_image(const argument_info& a) const noexcept
    {
        return lenient_ && std::string_view(a.type_name) == "IPixmat2";
    }

    static HRESULT place_out(const argument_info& a, const VARIANT* given) noexcept
    {
        const bool usable = !given || is_missing(*given) || ((given->vt & VT_BYREF) && given->byref);
        return a.way == direction::out && usable ? S_OK : DISP_E_TYPEMISMATCH;
    }

    HRESULT place_default(size_t i, const argument_info& a) noexcept
    {
        if (!a.optional) return DISP_E_PARAMNOTOPTIONAL;
        if (a.interface_id) {
            if (!lenient_) return DISP_E_PARAMNOTOPTIONAL;
            slots_[i].vt = VT_UNKNOWN;
            return S_OK;
        }
        if (a.type == VT_VARIANT) {
            slots_[i] = missing_argument();
            return S_OK;
        }
        const variant number(a.default_number);
        return VariantChangeType(&slots_[i], number.get(), 0, a.type);
    }

    HRESULT place_object(size_t i, const argument_info& a, const VARIANT& given) noexcept
    {
        const bool image = is_lenient_image(a);
        IUnknown* object = nullptr;
        if (!get_object(given, &object)) return image ? E_INVALIDARG : DISP_E_TYPEMISMATCH;
        slots_[i].vt = VT_UNKNOWN;
        if (!object) return S_OK;
        void* wanted = nullptr;
        const HRESULT hr = object->QueryInterface(*a.interface_id, &wanted);
        if (failed(hr)) return image ? hr : DISP_E_TYPEMISMATCH;
        slots_[i].punkVal = static_cast<IUnknown*>(wanted); // every interface starts with IUnknown
        return S_OK;
    }

    const method_info& method_;
    bool lenient_;
    std::array<VARIANT, most_arguments> slots_;
    std::array<bool, most_arguments> borrowed_{};
};

/// Writes an out value where the caller's VT_BYREF argument points.
HRESULT store_by_reference(VARIANT value, const VARIANT& target) noexcept
{
    variant owner = variant::attach(value);
    const auto type = static_cast<VARTYPE>(target.vt & ~VT_BYREF);
    if (type == VT_VARIANT) {
        auto* place = static_cast<VARIANT*>(target.byref);
        VariantClear(place);
        *place = owner.detach();
        return S_OK;
    }
    if (owner.type() != type)
        if (const HRESULT hr = VariantChangeType(owner.get(), owner.get(), 0, type); failed(hr)) return hr;
    switch (type) {
    case VT_I1:
    case VT_UI1: *static_cast<uint8_t*>(target.byref) = owner->bVal; break;
    case VT_I2:
    case VT_UI2:
    case VT_BOOL: *static_cast<uint16_t*>(target.byref) = owner->uiVal; break;
    case VT_I4:
    case VT_UI4:
    case VT_INT:
    case VT_UINT:
    case VT_R4:
    case VT_ERROR: *static_cast<uint32_t*>(target.byref) = owner->ulVal; break;
    case VT_I8:
    case VT_UI8:
    case VT_R8: *static_cast<uint64_t*>(target.byref) = owner->ullVal; break;
    default: // strings, arrays and objects change hands
        if (type != VT_BSTR && type != VT_DISPATCH && type != VT_UNKNOWN && !(type & VT_ARRAY))
            return DISP_E_TYPEMISMATCH;
        *static_cast<void**>(target.byref) = owner.detach().byref;
    }
    return S_OK;
}

/// Moves the thread's error information and the code into the caller's record.
void fill_exception(HRESULT code, EXCEPINFO* record) noexcept
{
    com_ptr<IErrorInfo> info;
    GetErrorInfo(0, info.put());
    if (!record) return;
    *record = EXCEPINFO{};
    record->scode = code;
    if (!info) return;
    info->GetSource(&record->bstrSource);
    info->GetDescription(&record->bstrDescription);
    info->GetHelpFile(&record->bstrHelpFile);
    info->GetHelpContext(&record->dwHelpContext);
}

class type_info final : public implements<ITypeInfo> {
public:
    explicit type_info(const interface_info& table) noexcept : table_(table) {}
    const interface_info* Describe() noexcept override { return &table_; }

private:
    const interface_info& table_;
};

/// Which of the caller's values goes to which argument: positional ones from the end, named ones by number.
HRESULT match(const method_info& m, const DISPPARAMS& p, std::array<const VARIANT*, most_arguments>& given,
              uint32_t* bad_argument) noexcept
{
    const auto visible = static_cast<uint32_t>(std::ranges::count_if(
        m.arguments, [](const argument_info& a) { return a.way != direction::result; }));
    if (p.cArgs > visible || p.cNamedArgs > p.cArgs) return DISP_E_BADPARAMCOUNT;
    if ((p.cArgs && !p.rgvarg) || (p.cNamedArgs && !p.rgdispidNamedArgs)) return E_POINTER;
    std::array<size_t, most_arguments> place{}; // of the visible arguments
    size_t n = 0;
    for (size_t i = 0; i < m.arguments.size(); ++i)
        if (m.arguments[i].way != direction::result) place[n++] = i;
    for (uint32_t i = 0; i < p.cArgs - p.cNamedArgs; ++i) given[place[i]] = &p.rgvarg[p.cArgs - 1 - i];
    for (uint32_t i = 0; i < p.cNamedArgs; ++i) {
        DISPID id = p.rgdispidNamedArgs[i];
        if (id == DISPID_PROPERTYPUT) id = static_cast<DISPID>(visible) - 1;
        const bool known = id >= 0 && static_cast<uint32_t>(id) < visible;
        if (!known || given[place[static_cast<size_t>(id)]]) {
            if (bad_argument) *bad_argument = i;
            return DISP_E_PARAMNOTFOUND;
        }
        given[place[static_cast<size_t>(id)]] = &p.rgvarg[i];
    }
    return S_OK;
}

} // namespace

HRESULT invoke(const interface_info& table, IUnknown* self, invoke_form form,
               const invoke_request& request) noexcept
{
    const method_info* m = find(table, request.id, request.flags);
    if (!m) return DISP_E_MEMBERNOTFOUND;
    if (m->arguments.size() > most_arguments) return E_UNEXPECTED;
    constexpr DISPPARAMS none{};
    const DISPPARAMS& params = request.params ? *request.params : none;
    std::array<const VARIANT*, most_arguments> given{};
    if (const HRESULT hr = match(*m, params, given, request.bad_argument); failed(hr)) return hr;

    call_frame frame(*m, form == invoke_form::scripting && m->takes_image);
    for (size_t i = 0; i < m->arguments.size(); ++i) {
        if (m->arguments[i].way == direction::result) continue;
        if (const HRESULT hr = frame.place(i, given[i]); failed(hr)) {
            if (request.bad_argument && given[i])
                *request.bad_argument = static_cast<uint32_t>(given[i] - params.rgvarg);
            return hr;
        }
    }

    SetErrorInfo(0, nullptr); // what an earlier call left behind does not explain this one
    if (const HRESULT hr = m->call(self, frame.slots()); failed(hr)) {
        fill_exception(hr, request.exception);
        return DISP_E_EXCEPTION;
    }
    for (size_t i = 0; i < m->arguments.size(); ++i) {
        const argument_info& a = m->arguments[i];
        if (a.way == direction::result && request.result) frame.take(i, request.result);
        if (a.way == direction::out && given[i] && !is_missing(*given[i])) {
            VARIANT value;
            frame.take(i, &value);
            if (const HRESULT hr = store_by_reference(value, *given[i]); failed(hr)) return hr;
        }
    }
    return S_OK;
}

HRESULT find_ids(const interface_info& table, OLECHAR** names, uint32_t count, DISPID* ids) noexcept
{
    if (!names || !ids) return E_POINTER;
    if (count == 0) return E_INVALIDARG;
    std::fill_n(ids, count, DISPID_UNKNOWN);
    const auto m = std::ranges::find_if(
        table.methods, [&](const method_info& row) { return names[0] && same_name(names[0], row.name); });
    if (m == table.methods.end()) return DISP_E_UNKNOWNNAME;
    ids[0] = m->id;
    HRESULT hr = S_OK;
    for (uint32_t i = 1; i < count; ++i) {
        DISPID place = 0;
        for (const argument_info& a : m->arguments) {
            if (a.way == direction::result) continue;
            if (names[i] && same_name(names[i], a.name)) ids[i] = place;
            ++place;
        }
        if (ids[i] == DISPID_UNKNOWN) hr = DISP_E_UNKNOWNNAME;
    }
    return hr;
}

HRESULT get_type_info(const interface_info& table, uint32_t index, ITypeInfo** info) noexcept
{
    if (!info) return E_POINTER;
    *info = nullptr;
    if (index != 0) return DISP_E_BADINDEX;
    com_ptr<ITypeInfo> object = try_make<type_info>(table);
    if (!object) return E_OUTOFMEMORY;
    *info = object.detach();
    return S_OK;
}

} // namespace Qor
