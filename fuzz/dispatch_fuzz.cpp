// Late binding and the automation types with any arguments: each call answers a code, frees what it took, and leaves the
// caller's arguments as they were unless they are results.
#include "fuzz_input.h"

#include <algorithm>
#include <deque>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace {

using namespace fuzz;

constexpr VARTYPE types[] = {VT_EMPTY,    VT_NULL,    VT_I2,   VT_I4,      VT_R4,  VT_R8,  VT_BSTR,
                             VT_DISPATCH, VT_ERROR,   VT_BOOL, VT_VARIANT, VT_I1,  VT_UI1, VT_UI2,
                             VT_UI4,      VT_UNKNOWN, VT_I8,   VT_UI8,     VT_INT, VT_UINT};

std::wstring any_text(input& in)
{
    constexpr const wchar_t* texts[] = {L"",        L"1",          L" -12.5 ",  L"1e999",
                                        L"nan",     L"-inf",       L"0x10",     L"TRUE",
                                        L"false",   L"1e-5000",    L"1,5",      L"+",
                                        L".",       L"4294967296", L"Rounding", L"Flatten",
                                        L"pIImage", L"Value",      L"\x10ffff", L"9223372036854775808"};
    std::wstring text = in.one_of(texts);
    for (size_t n = in.pick(8) == 0 ? in.pick(64) : 0; n > 0; --n)
        text.push_back(static_cast<wchar_t>(in.pick(4) == 0 ? in.take<uint16_t>() : in.take<uint8_t>()));
    return text;
}

/// The objects that arguments refer to, and the root whose facets are called.
class objects {
public:
    explicit objects(input& in)
    {
        constexpr GUID roots[] = {CLSID_ZELT, CLSID_ZELT2, CLSID_ZELT2NoDispatch};
        root_ = create<IDispatch>(in.one_of(roots));
        constexpr image_layout layouts[] = {packed_layout(8, 6, 16, PixmatEncoding_Unsigned),
                                            packed_layout(8, 6, 32, PixmatEncoding_Float),
                                            {5, 4, 8, PixmatEncoding_Signed, 40, -2, 12},
                                            packed_layout(3, 3, 24, PixmatEncoding_RGB),
                                            packed_layout(4, 4, 128, PixmatEncoding_Complex_Float),
                                            packed_layout(2, 2, 8, PixmatEncoding_Data)};
        for (const image_layout& layout : layouts) {
            descriptors_.push_back(descriptor_of(layout));
            com_ptr<IPixmat2> image;
            require(create<IPixmatFactory>(CLSID_PixmatFactory)
                        ->Create(descriptors_.back().get(), PixmatCreateMode_Layout, image.put()) == S_OK);
            all_.emplace_back(image);
        }
        for (const auto& d : descriptors_) all_.emplace_back(d);
        com_ptr<IRectangle> area;
        require(Common::MakeRectangle(1, 1, 4, 3, area.put()) == S_OK);
        com_ptr<ICoordinateInt> point;
        require(Common::MakeCoordinateInt(1, 0, point.put()) == S_OK);
        all_.emplace_back(area);
        all_.emplace_back(point);
        all_.emplace_back(create<IDispatch>(CLSID_Complex));
        all_.emplace_back(root_);
    }

    IDispatch* any(input& in) const { return all_[in.pick(all_.size())].get(); }

    /// The root, one of its facets, or an object that arguments refer to.
    com_ptr<IDispatch> any_callee(input& in) const
    {
        const size_t kind = in.pick(4);
        if (kind == 0) return com_ptr(any(in));
        const auto& table = *table_of(root_.get());
        const method_info& m = table.methods[in.pick(table.methods.size())];
        VARIANT facet = empty_variant();
        DISPPARAMS none{};
        if (m.kind == DISPATCH_PROPERTYGET)
            root_->Invoke(m.id, GUID_NULL, 0, m.kind, &none, &facet, nullptr, nullptr);
        const variant owner = variant::attach(facet);
        return owner.type() == VT_DISPATCH && facet.pdispVal ? com_ptr(facet.pdispVal) : root_;
    }

    static const interface_info* table_of(IDispatch* object)
    {
        com_ptr<ITypeInfo> type;
        require(object->GetTypeInfo(0, LOCALE_USER_DEFAULT, type.put()) == S_OK);
        return type->Describe();
    }

    /// Calls may have written to the descriptors; images that are made of them stay small.
    void tame() const
    {
        for (const auto& d : descriptors_)
            if (!is_small(layout_of(d.get()))) {
                d->put_Width(4);
                d->put_Height(4);
                d->put_Bits(8);
                d->put_Offset(0);
                d->put_XStride(1);
                d->put_YStride(4);
            }
    }

private:
    com_ptr<IDispatch> root_;
    std::vector<com_ptr<IPixmatDescriptor>> descriptors_;
    std::vector<com_ptr<IDispatch>> all_;
};

/// Makes values and owns what they refer to until the end of a step.
class value_maker {
public:
    value_maker(input& in, const objects& o) : in_(in), objects_(o) {}
    ~value_maker()
    {
        for (place& p : places_) p.clear();
        for (VARIANT& v : variants_) VariantClear(&v);
    }
    value_maker(const value_maker&) = delete;
    value_maker& operator=(const value_maker&) = delete;

    /// A value of any type; the caller clears it. Types that nobody knows are among them, without content.
    VARIANT any(int depth = 3)
    {
        VARIANT v = empty_variant();
        const size_t kind = in_.pick(16);
        if (kind == 0) {
            v.vt = in_.take<VARTYPE>(); // clearing an unknown one must do nothing
            if ((v.vt & VT_BYREF) && v.vt != (VT_BYREF | VT_VARIANT))
                v.byref = refer_to(static_cast<VARTYPE>(v.vt & ~VT_BYREF), 0);
        } else if (kind <= 3 && depth > 0) {
            v.parray = array(depth - 1);
            VARTYPE element = VT_I4;
            SafeArrayGetVartype(v.parray, &element);
            v.vt = static_cast<VARTYPE>(VT_ARRAY | element);
        } else if (kind <= 5) {
            v = reference(depth);
        } else if (kind == 6) {
            v = missing_argument();
        } else {
            v.vt = in_.one_of(types);
            if (v.vt == VT_VARIANT) v.vt = VT_I4;
            fill(v.vt, &v.llVal);
        }
        return v;
    }

    /// Null, or an array of a few elements, all of them of its type.
    SAFEARRAY* array(int depth)
    {
        SAFEARRAYBOUND bounds[4];
        const auto dimensions = static_cast<uint32_t>(in_.pick(4));
        for (uint32_t d = 0; d < dimensions; ++d) bounds[d] = {in_.take<uint8_t>() % 4u, in_.number()};
        const VARTYPE type = in_.one_of(types);
        SAFEARRAY* const made = SafeArrayCreate(type, dimensions, bounds);
        void* data = nullptr;
        if (!made || failed(SafeArrayAccessData(made, &data))) return made;
        uint32_t count = 1;
        for (uint32_t d = 0; d < dimensions; ++d) count *= bounds[d].cElements;
        const uint32_t size = SafeArrayGetElemsize(made);
        for (uint32_t i = 0; i < count && !in_.empty(); ++i) {
            uint8_t* const element = static_cast<uint8_t*>(data) + i * size;
            if (type == VT_VARIANT) {
                const VARIANT v = in_.pick(4) == 0 ? any_array(depth) : any_scalar();
                std::memcpy(element, &v, sizeof v);
            } else {
                int64_t value = 0;
                fill(type, &value);
                std::memcpy(element, &value, size);
            }
        }
        SafeArrayUnaccessData(made);
        return made;
    }

private:
    /// What a VT_BYREF value points to. A call may put another string, array or object there without freeing the old.
    struct place {
        VARTYPE type;
        int64_t first, now;
        void clear()
        {
            for (int64_t content : {first, now}) {
                VARIANT v = empty_variant();
                v.vt = type;
                v.llVal = content;
                VariantClear(&v);
                if (first == now) break;
            }
        }
    };

    VARIANT any_scalar()
    {
        VARIANT v = empty_variant();
        v.vt = in_.one_of(types);
        if (v.vt == VT_VARIANT) v.vt = VT_BSTR;
        fill(v.vt, &v.llVal);
        return v;
    }
    VARIANT any_array(int depth)
    {
        VARIANT v = empty_variant();
        if (depth <= 0) return v;
        v.parray = array(depth - 1);
        VARTYPE element = VT_R8;
        SafeArrayGetVartype(v.parray, &element);
        v.vt = static_cast<VARTYPE>(VT_ARRAY | element);
        return v;
    }

    VARIANT reference(int depth)
    {
        VARIANT v = empty_variant();
        const bool of_array = depth > 0 && in_.pick(4) == 0;
        if (of_array) {
            SAFEARRAY* const a = array(depth - 1);
            VARTYPE element = VT_UI2;
            SafeArrayGetVartype(a, &element);
            v.byref = refer_to(static_cast<VARTYPE>(VT_ARRAY | element), reinterpret_cast<intptr_t>(a));
            v.vt = static_cast<VARTYPE>(VT_BYREF | VT_ARRAY | element);
        } else {
            const VARTYPE type = in_.one_of(types);
            v.vt = static_cast<VARTYPE>(VT_BYREF | type);
            if (in_.pick(16) == 0) return v; // a null reference
            if (type == VT_VARIANT) {
                const bool itself = in_.pick(8) == 0;
                variants_.push_back(itself ? v : depth > 0 ? any(depth - 1) : any_scalar());
                v.byref = &variants_.back();
                if (itself) variants_.back() = v;
            } else {
                int64_t content = 0;
                fill(type, &content);
                v.byref = refer_to(type, content);
            }
        }
        return v;
    }
    void* refer_to(VARTYPE type, int64_t content)
    {
        places_.push_back({type, content, content});
        return &places_.back().now;
    }

    /// A value of a type that is neither an array nor a variant.
    void fill(VARTYPE type, int64_t* value)
    {
        const auto put = [value](auto v) { std::memcpy(value, &v, sizeof v); };
        switch (type) {
        case VT_BSTR: {
            const std::wstring text = any_text(in_);
            if (in_.pick(8) != 0) put(SysAllocStringLen(text.data(), static_cast<uint32_t>(text.size())));
            break;
        }
        case VT_DISPATCH:
        case VT_UNKNOWN:
            if (in_.pick(8) != 0) put(static_cast<IUnknown*>(com_ptr(objects_.any(in_)).detach()));
            break;
        case VT_R4: put(static_cast<float>(std::clamp(in_.real(), -3e38, 3e38))); break;
        case VT_R8: put(in_.real()); break;
        case VT_I8:
        case VT_UI8: put(in_.chance() ? in_.take<int64_t>() : int64_t{in_.number()}); break;
        case VT_EMPTY:
        case VT_NULL: break;
        default: put(in_.number());
        }
    }

    input& in_;
    const objects& objects_;
    std::deque<place> places_;
    std::deque<VARIANT> variants_;
};

/// Arguments in a block of exactly their size.
struct arguments {
    std::unique_ptr<VARIANT[]> values;
    std::unique_ptr<DISPID[]> names;
    std::vector<VARIANT> before;
    DISPPARAMS params{};

    arguments(input& in, value_maker& make, const method_info* m)
    {
        const auto count = static_cast<uint32_t>(m && in.pick(4) != 0 ? m->arguments.size() : in.pick(28));
        const auto named = static_cast<uint32_t>(in.pick(4) == 0 ? in.pick(count + 2) : 0);
        values = std::make_unique<VARIANT[]>(count);
        names = std::make_unique<DISPID[]>(named);
        for (uint32_t i = 0; i < count; ++i) values[i] = make.any();
        for (uint32_t i = 0; i < named; ++i)
            names[i] = in.pick(4) == 0 ? in.number() : static_cast<DISPID>(in.pick(8)) - 3;
        before.assign(values.get(), values.get() + count);
        params = {values.get(), names.get(), count, named};
        if (in.pick(64) == 0) params.rgvarg = nullptr;
        if (in.pick(64) == 0) params.rgdispidNamedArgs = nullptr;
    }
    ~arguments()
    {
        for (size_t i = 0; i < before.size(); ++i) {
            require(values[i].vt == before[i].vt && values[i].llVal == before[i].llVal);
            VariantClear(&values[i]);
        }
    }
};

/// Integer division by a pixel or number of 0 ends in the processor's fault by definition.
bool can_fault(const interface_info& table, DISPID id)
{
    return std::any_of(table.methods.begin(), table.methods.end(), [id](const method_info& m) {
        return m.id == id && std::string_view(m.name).find("Divide") != std::string_view::npos;
    });
}

void call(input& in, const objects& o)
{
    const com_ptr<IDispatch> callee = o.any_callee(in);
    const interface_info& table = *objects::table_of(callee.get());
    const bool described = !table.methods.empty() && in.pick(16) != 0;
    const method_info* m = described ? &table.methods[in.pick(table.methods.size())] : nullptr;
    const DISPID id = m ? m->id : in.number();
    if (can_fault(table, id)) return;
    const uint16_t flags = in.pick(8) == 0 ? in.take<uint16_t>() : m ? m->kind : uint16_t{1};
    value_maker make(in, o);
    arguments given(in, make, m);
    VARIANT result = empty_variant();
    EXCEPINFO exception{};
    uint32_t bad = 0;
    const HRESULT hr =
        callee->Invoke(id, GUID_NULL, LOCALE_USER_DEFAULT, flags, in.pick(32) == 0 ? nullptr : &given.params,
                       in.pick(8) == 0 ? nullptr : &result, in.pick(8) == 0 ? nullptr : &exception,
                       in.pick(8) == 0 ? nullptr : &bad);
    require(hr == DISP_E_EXCEPTION || (!exception.bstrDescription && exception.scode == 0));
    require(bad == 0 || bad < given.params.cArgs);
    for (BSTR text : {exception.bstrSource, exception.bstrDescription, exception.bstrHelpFile})
        SysFreeString(text);
    require(VariantClear(&result) == S_OK);
    o.tame();
}

void find_names(input& in, const objects& o)
{
    const com_ptr<IDispatch> callee = o.any_callee(in);
    const interface_info& table = *objects::table_of(callee.get());
    if (table.methods.empty()) return;
    const method_info& m = table.methods[in.pick(table.methods.size())];
    const auto count = static_cast<uint32_t>(in.pick(5));
    std::vector<std::wstring> texts;
    for (uint32_t i = 0; i < count; ++i) {
        const bool known = in.pick(3) != 0 && (i == 0 || !m.arguments.empty());
        texts.push_back(!known ? any_text(in)
                               : widen(i == 0 ? m.name : m.arguments[in.pick(m.arguments.size())].name));
        if (!texts.back().empty() && in.pick(4) == 0) texts.back()[in.pick(texts.back().size())] ^= 32;
    }
    std::vector<OLECHAR*> names;
    for (std::wstring& t : texts) names.push_back(in.pick(16) == 0 ? nullptr : t.data());
    std::vector<DISPID> ids(count, 77);
    const HRESULT hr = callee->GetIDsOfNames(GUID_NULL, names.data(), count, 0, ids.data());
    for (const DISPID id : ids) require(failed(hr) || (id != 77 && id != DISPID_UNKNOWN));
    GUID class_id;
    if (count > 0) CLSIDFromProgID(texts[0].c_str(), &class_id);
}

void change_type(input& in, const objects& o)
{
    value_maker make(in, o);
    VARIANT source = make.any();
    VARIANT target = make.any();
    const VARTYPE type = in.pick(8) == 0 ? in.take<VARTYPE>() : in.one_of(types);
    VARIANT* const place = in.chance() ? &target : &source;
    const VARIANT before = *place;
    const HRESULT hr = VariantChangeType(place, &source, 0, type);
    require(failed(hr) || place->vt == type);
    require(succeeded(hr) || (place->vt == before.vt && place->llVal == before.llVal));
    VARIANT copy = empty_variant();
    const HRESULT copied = in.chance() ? VariantCopy(&copy, &source) : VariantCopyInd(&copy, &source);
    require(succeeded(copied) || copy.vt == VT_EMPTY);
    for (VARIANT* v : {&source, &target, &copy}) VariantClear(v);
}

void use_array(input& in, const objects& o)
{
    value_maker make(in, o);
    SAFEARRAYBOUND bounds[4];
    const auto dimensions = static_cast<uint32_t>(in.pick(5));
    uint64_t count = dimensions > 0;
    for (uint32_t d = 0; d < dimensions; ++d) {
        bounds[d] = {in.pick(4) == 0 ? in.take<uint32_t>() : static_cast<uint32_t>(in.pick(20)), in.number()};
        count = bounds[d].cElements && count > 0xffffffffu / bounds[d].cElements
                    ? 0xffffffffu
                    : count * bounds[d].cElements;
    }
    // Either a few elements or more than any array may have.
    if (count > 100000 && count <= 0x7fffffff) return;
    const VARTYPE type = in.pick(8) == 0 ? in.take<VARTYPE>() : in.one_of(types);
    SAFEARRAY* const array = SafeArrayCreate(type, dimensions, bounds);
    require(!array || count <= 100000);

    int32_t indices[4];
    for (uint32_t d = 0; d < dimensions; ++d) indices[d] = in.pick(4) == 0 ? in.number() : bounds[d].lLbound;
    for (const uint32_t d : {0u, 1u, dimensions, dimensions + 1}) {
        int32_t bound = 0;
        SafeArrayGetLBound(array, d, &bound);
        SafeArrayGetUBound(array, d, &bound);
    }
    VARIANT value = make.any();
    VARIANT read = empty_variant();
    const bool pointer = type == VT_BSTR || type == VT_UNKNOWN || type == VT_DISPATCH;
    if (array && (type == VT_VARIANT || value.vt == type)) {
        const void* const content = type == VT_VARIANT ? static_cast<void*>(&value)
                                    : pointer          ? value.byref
                                                       : &value.llVal;
        const HRESULT put = SafeArrayPutElement(array, indices, content);
        void* const room = type == VT_VARIANT ? static_cast<void*>(&read) : &read.llVal;
        const HRESULT got = SafeArrayGetElement(array, indices, room);
        require(failed(put) || succeeded(got));
        if (type != VT_VARIANT && succeeded(got)) read.vt = type;
    }
    SAFEARRAY* copy = nullptr;
    require(!array || SafeArrayCopy(array, &copy) == S_OK);
    void* data = nullptr;
    if (succeeded(SafeArrayAccessData(array, &data))) {
        require(SafeArrayDestroy(array) == DISP_E_ARRAYISLOCKED);
        require(SafeArrayUnaccessData(array) == S_OK);
    }
    require(SafeArrayDestroy(array) == S_OK && SafeArrayDestroy(copy) == S_OK);
    VariantClear(&value);
    VariantClear(&read);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    input in(data, size);
    const objects o(in);
    for (int step = 0; step < 12 && !in.empty(); ++step) switch (in.pick(6)) {
        case 0: find_names(in, o); break;
        case 1: change_type(in, o); break;
        case 2: use_array(in, o); break;
        default: call(in, o);
        }
    SetErrorInfo(0, nullptr);
    return 0;
}
