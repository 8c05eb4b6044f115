#include "com/describe.h"
#include "com/implements.h"
#include "frame/operation.h"
#include "frame/value_objects.h"
#include "support/failures.h"
#include "zelt/interfaces/enums.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

/// One method for each way in which arguments and results travel.
struct IProbe : IDispatch {
    static constexpr GUID iid = guid("5a1e00ff-0001-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IProbe";
    using base = IDispatch;

    virtual HRESULT Image(IPixmat2* image, LONG n, double d, IPixmat2* out, IPixmat2** result) noexcept = 0;
    virtual HRESULT Plain(LONG n, double d, IRectangle* area, double* sum) noexcept = 0;
    virtual HRESULT Operand(IPixmat2* image, VARIANT b, LONG r, LONG* type) noexcept = 0;
    virtual HRESULT Several(LONG n, double* half, SAFEARRAY** array, BSTR* text, LONG* twice) noexcept = 0;
    virtual HRESULT get_Mode(ZELT_Rounding* mode) noexcept = 0;
    virtual HRESULT put_Mode(ZELT_Rounding mode) noexcept = 0;
    virtual HRESULT Fail(LONG code) noexcept = 0;
};

class probe : public automation<IProbe> {
public:
    com_ptr<IPixmat2> seen;
    com_ptr<IPixmat2> seen_out;
    LONG n = -1;
    double d = -1;
    ZELT_Rounding mode = ZELT_Rounding_Wrap;
    rectangle area{};

    HRESULT Image(IPixmat2* image, LONG number, double real, IPixmat2* out,
                  IPixmat2** result) noexcept override
    {
        seen = com_ptr(image);
        seen_out = com_ptr(out);
        n = number;
        d = real;
        seen.copy_to(result);
        return S_OK;
    }
    HRESULT Plain(LONG number, double real, IRectangle* box, double* sum) noexcept override
    {
        n = number;
        if (box) Common::ReadValue(box, &area);
        *sum = number + real;
        return S_OK;
    }
    HRESULT Operand(IPixmat2*, VARIANT b, LONG r, LONG* type) noexcept override
    {
        n = r;
        *type = is_missing(b) ? -1 : b.vt;
        return S_OK;
    }
    HRESULT Several(LONG number, double* half, SAFEARRAY** array, BSTR* text, LONG* twice) noexcept override
    {
        *half = number / 2.0;
        *array = SafeArrayCreateVector(VT_R8, 0, static_cast<uint32_t>(number));
        *text = SysAllocString(L"text");
        *twice = 2 * number;
        return S_OK;
    }
    HRESULT get_Mode(ZELT_Rounding* value) noexcept override { return Common::read_field(mode, value); }
    HRESULT put_Mode(ZELT_Rounding value) noexcept override { return Common::write_field(mode, value); }
    HRESULT Fail(LONG code) noexcept override
    {
        if (code == 1)
            return run_frame(IProbe::iid, []() -> HRESULT { throw std::invalid_argument("broken"); });
        return code;
    }
};

constexpr auto rows = std::tuple(
    method<&IProbe::Image>("Image", "", in("image"), in("n"), opt("d", 2.5), opt("out"), result("result")),
    method<&IProbe::Plain>("Plain", "", in("n"), opt("d", 0.5), opt("area"), result("sum")),
    method<&IProbe::Operand>("Operand", "", in("image"), in("b"), opt("r", 3), result("type")),
    method<&IProbe::Several>("Several", "", in("n"), out("half"), out("array"), out("text"), result("twice")),
    get<&IProbe::get_Mode>("Mode", "", result("mode")), put<&IProbe::put_Mode>("Mode", "", in("mode")),
    method<&IProbe::Fail>("Fail", "", in("code")));

} // namespace
} // namespace Qor::Luxar::ZELT::Test

template <>
const Qor::interface_info& Qor::table_of<Qor::Luxar::ZELT::Test::IProbe>() noexcept
{
    return interface_table<Luxar::ZELT::Test::IProbe, Luxar::ZELT::Test::rows>::info("");
}

namespace Qor::Luxar::ZELT::Test {
namespace {

DISPID id_of(IDispatch* object, const wchar_t* name)
{
    auto* n = const_cast<OLECHAR*>(name);
    DISPID id = DISPID_UNKNOWN;
    EXPECT_EQ(object->GetIDsOfNames(GUID_NULL, &n, 1, LOCALE_USER_DEFAULT, &id), S_OK) << narrow(name);
    return id;
}

/// A script's call: arguments in reading order; named ones behind them.
struct late_call {
    std::vector<variant> arguments;
    std::vector<DISPID> names{};
    uint16_t flags = DISPATCH_METHOD;
    variant result{};
    EXCEPINFO exception{};
    uint32_t bad = 99;

    HRESULT on(IDispatch* object, const wchar_t* method)
    {
        std::vector<VARIANT> reversed;
        for (size_t i = arguments.size(); i-- > 0;) reversed.push_back(*arguments[i].get());
        std::vector<DISPID> reversed_names(names.rbegin(), names.rend());
        DISPPARAMS params{reversed.data(), reversed_names.data(), static_cast<uint32_t>(reversed.size()),
                          static_cast<uint32_t>(names.size())};
        return object->Invoke(id_of(object, method), GUID_NULL, LOCALE_USER_DEFAULT, flags, &params,
                              result.put(), &exception, &bad);
    }
    ~late_call()
    {
        for (BSTR text : {exception.bstrSource, exception.bstrDescription, exception.bstrHelpFile})
            SysFreeString(text);
    }
};

com_ptr<IPixmat2> small_image()
{
    com_ptr<IPixmat2> image;
    EXPECT_EQ(CreateImageFromLayout(packed_layout(2, 2, 8, PixmatEncoding_Unsigned), image.put()), S_OK);
    return image;
}

variant missing() { return variant::attach(missing_argument()); }

TEST(Dispatch, ScriptsMayLeaveOptionalImagesOut)
{
    const auto object = make<scripting<probe>>();
    const auto image = small_image();
    late_call call{{image.get(), 7}};
    ASSERT_EQ(call.on(object.get(), L"image"), S_OK);
    EXPECT_TRUE(object->seen == image);
    EXPECT_FALSE(object->seen_out);
    EXPECT_EQ(object->n, 7);
    EXPECT_EQ(object->d, 2.5);
    ASSERT_EQ(call.result.type(), VT_DISPATCH);
    EXPECT_TRUE(same_object(call.result->pdispVal, image.get()));

    late_call full{{static_cast<IUnknown*>(image.get()), variant(L"8"), missing(), image.get()}};
    ASSERT_EQ(full.on(object.get(), L"Image"), S_OK);
    EXPECT_EQ(object->n, 8);
    EXPECT_EQ(object->d, 2.5);
    EXPECT_TRUE(object->seen_out == image);

    late_call null{{static_cast<IDispatch*>(nullptr), 1}}; // a null reference passes as null
    EXPECT_EQ(null.on(object.get(), L"Image"), S_OK);
    EXPECT_FALSE(object->seen);
}

TEST(Dispatch, StandardFormWantsEveryObject)
{
    const auto object = make<probe>();
    const auto image = small_image();
    EXPECT_EQ((late_call{{image.get(), 7}}).on(object.get(), L"Image"), DISP_E_PARAMNOTOPTIONAL);
    EXPECT_EQ((late_call{{image.get(), 7, 1.5, static_cast<IDispatch*>(nullptr)}}).on(object.get(), L"Image"),
              S_OK);
    EXPECT_EQ((late_call{{5}}).on(object.get(), L"Image"), DISP_E_TYPEMISMATCH);
    const auto scripted = make<scripting<probe>>(); // the same for its methods without images
    EXPECT_EQ((late_call{{7}}).on(scripted.get(), L"Plain"), DISP_E_PARAMNOTOPTIONAL);
}

TEST(Dispatch, RefusesWhatDoesNotFit)
{
    const auto object = make<scripting<probe>>();
    const auto image = small_image();
    com_ptr<IRectangle> box;
    ASSERT_EQ(Common::MakeRectangle(0, 0, 1, 1, box.put()), S_OK);
    const struct {
        const char* name;
        std::vector<variant> arguments;
        HRESULT code;
    } cases[] = {
        {"too many", {image.get(), 1, 1.0, image.get(), 5}, DISP_E_BADPARAMCOUNT},
        {"number for an image", {3, 1}, E_INVALIDARG},
        {"nothing for an image", {variant(), 1}, E_INVALIDARG},
        {"text for an image", {L"image.tif", 1}, E_INVALIDARG},
        {"another object for an image", {box.get(), 1}, E_NOINTERFACE},
        {"text for a number", {image.get(), L"seven"}, DISP_E_TYPEMISMATCH},
        {"too large", {image.get(), 3e9}, DISP_E_OVERFLOW},
        {"missing", {image.get()}, DISP_E_PARAMNOTOPTIONAL},
        {"missing for an image", {missing(), 1}, E_INVALIDARG},
        {"missing for a number", {image.get(), missing()}, DISP_E_PARAMNOTOPTIONAL},
    };
    for (const auto& c : cases) {
        object->n = -1;
        late_call call{c.arguments};
        EXPECT_EQ(call.on(object.get(), L"Image"), c.code) << c.name;
        EXPECT_EQ(object->n, -1) << c.name << ": the method was called";
    }
    late_call bad{{image.get(), L"seven"}};
    bad.on(object.get(), L"Image");
    EXPECT_EQ(bad.bad, 0u); // arguments count from the last one
}

TEST(Dispatch, TakesNamedArguments)
{
    const auto object = make<scripting<probe>>();
    OLECHAR* names[] = {const_cast<OLECHAR*>(L"PLAIN"), const_cast<OLECHAR*>(L"area"),
                        const_cast<OLECHAR*>(L"N")};
    DISPID ids[3];
    ASSERT_EQ(object->GetIDsOfNames(GUID_NULL, names, 3, 0, ids), S_OK);
    EXPECT_EQ(ids[1], 2);
    EXPECT_EQ(ids[2], 0);
    com_ptr<IRectangle> box;
    ASSERT_EQ(Common::MakeRectangle(1, 2, 3, 4, box.put()), S_OK);
    late_call call{{box.get(), 4}, {2, 0}};
    ASSERT_EQ(call.on(object.get(), L"Plain"), S_OK);
    EXPECT_EQ(object->area, (rectangle{1, 2, 3, 4}));
    EXPECT_EQ(call.result->dblVal, 4.5);
    EXPECT_EQ((late_call{{1, 2}, {0}}).on(object.get(), L"Plain"), DISP_E_PARAMNOTFOUND) << "given twice";
    EXPECT_EQ((late_call{{1}, {3}}).on(object.get(), L"Plain"), DISP_E_PARAMNOTFOUND) << "no such argument";
    names[1] = const_cast<OLECHAR*>(L"nonsense");
    EXPECT_EQ(object->GetIDsOfNames(GUID_NULL, names, 2, 0, ids), DISP_E_UNKNOWNNAME);
    EXPECT_EQ(ids[1], DISPID_UNKNOWN);
    EXPECT_EQ(object->GetIDsOfNames(GUID_NULL, nullptr, 1, 0, ids), E_POINTER);
}

TEST(Dispatch, HandsVariantsOnAsTheyAre)
{
    const auto object = make<scripting<probe>>();
    const auto image = small_image();
    const auto type_of = [&](variant b) {
        late_call call{{image.get(), std::move(b)}};
        EXPECT_EQ(call.on(object.get(), L"Operand"), S_OK);
        EXPECT_EQ(object->n, 3);
        return call.result->lVal;
    };
    EXPECT_EQ(type_of(0.5f), VT_R4);
    EXPECT_EQ(type_of(L"x"), VT_BSTR);
    EXPECT_EQ(type_of(image.get()), VT_DISPATCH);
    EXPECT_EQ(type_of(variant()), VT_EMPTY);
    EXPECT_EQ(type_of(missing()), -1);
    VARIANT inner = *variant(0.5).get();
    VARIANT reference = empty_variant();
    reference.vt = VT_BYREF | VT_VARIANT;
    reference.byref = &inner;
    EXPECT_EQ(type_of(variant::attach(reference)), VT_R8);
}

TEST(Dispatch, WritesSeveralResultsWhereReferencesPoint)
{
    const auto object = make<probe>();
    float half = 0; // narrower than the method's double: converted
    VARIANT array = empty_variant();
    BSTR text = nullptr;
    const auto reference = [](VARTYPE type, void* to) {
        VARIANT v = empty_variant();
        v.vt = static_cast<VARTYPE>(VT_BYREF | type);
        v.byref = to;
        return variant::attach(v);
    };
    std::vector<variant> arguments;
    arguments.emplace_back(5);
    arguments.push_back(reference(VT_R4, &half));
    arguments.push_back(reference(VT_VARIANT, &array));
    arguments.push_back(reference(VT_BSTR, &text));
    late_call call{std::move(arguments)};
    ASSERT_EQ(call.on(object.get(), L"Several"), S_OK);
    EXPECT_EQ(half, 2.5f);
    EXPECT_EQ(array.vt, VT_ARRAY | VT_R8);
    EXPECT_EQ(SysStringLen(text), 4u);
    EXPECT_EQ(call.result->lVal, 10);
    VariantClear(&array);
    SysFreeString(text);
    EXPECT_EQ((late_call{{5}}).on(object.get(), L"Several"), S_OK) << "results that nobody wants";
    EXPECT_EQ((late_call{{5, 1.0}}).on(object.get(), L"Several"), DISP_E_TYPEMISMATCH);
}

TEST(Dispatch, ReadsAndWritesPropertiesUnderOneNumber)
{
    const auto object = make<scripting<probe>>();
    late_call read{{}, {}, DISPATCH_METHOD | DISPATCH_PROPERTYGET};
    EXPECT_EQ(read.on(object.get(), L"Mode"), S_OK);
    EXPECT_EQ(read.result->lVal, ZELT_Rounding_Wrap);
    EXPECT_EQ((late_call{{3}, {DISPID_PROPERTYPUT}, DISPATCH_PROPERTYPUT}).on(object.get(), L"Mode"), S_OK);
    EXPECT_EQ(object->mode, ZELT_Rounding_Saturate);
    EXPECT_EQ((late_call{{}}).on(object.get(), L"Mode"), DISP_E_MEMBERNOTFOUND) << "a property is no method";
}

TEST(Dispatch, FailuresGoIntoTheCallersRecord)
{
    const auto object = make<probe>();
    ReportError(GUID_NULL, L"of an earlier call", IProbe::iid, E_FAIL);
    late_call silent{{E_NOTIMPL}};
    EXPECT_EQ(silent.on(object.get(), L"Fail"), DISP_E_EXCEPTION);
    EXPECT_EQ(silent.exception.scode, E_NOTIMPL);
    EXPECT_EQ(SysStringLen(silent.exception.bstrDescription), 0u);
    late_call told{{1}};
    EXPECT_EQ(told.on(object.get(), L"Fail"), DISP_E_EXCEPTION);
    EXPECT_EQ(told.exception.scode, E_INVALIDARG);
    EXPECT_STREQ(told.exception.bstrDescription, L"broken");
    DISPPARAMS none{};
    EXPECT_EQ(object->Invoke(12345, GUID_NULL, 0, DISPATCH_METHOD, &none, nullptr, nullptr, nullptr),
              DISP_E_MEMBERNOTFOUND);
}

TEST(Dispatch, DescribesItself)
{
    const auto object = make<probe>();
    uint32_t count = 0;
    EXPECT_EQ(object->GetTypeInfoCount(&count), S_OK);
    EXPECT_EQ(count, 1u);
    com_ptr<ITypeInfo> type;
    EXPECT_EQ(object->GetTypeInfo(1, 0, type.put()), DISP_E_BADINDEX);
    ASSERT_EQ(object->GetTypeInfo(0, 0, type.put()), S_OK);
    const interface_info& info = *type->Describe();
    EXPECT_STREQ(info.name, "IProbe");
    EXPECT_EQ(info.id, IProbe::iid);
    ASSERT_EQ(info.methods.size(), 7u);
    const argument_info& mode = info.methods[5].arguments[0];
    EXPECT_STREQ(mode.type_name, "ZELT_Rounding");
    EXPECT_EQ(mode.enumeration->values.size(), 4u);
    EXPECT_EQ(info.methods[4].id, info.methods[5].id);
    EXPECT_TRUE(info.methods[0].takes_image);
    EXPECT_FALSE(info.methods[1].takes_image);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
