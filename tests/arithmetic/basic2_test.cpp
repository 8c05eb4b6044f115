#include "arithmetic/arithmetic.h"

#include "arithmetic/kernels/expand_half_complex.h"
#include "arithmetic_cases.h"
#include "facet_images.h"
#include "frame/value_objects.h"
#include "support/facets.h"
#include "support/failing_new.h"
#include "support/failures.h"
#include "zelt/com/safe_array.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

using calls = std::vector<std::string>;
constexpr auto U = PixmatEncoding_Unsigned, S = PixmatEncoding_Signed, F = PixmatEncoding_Float;
constexpr auto C = PixmatEncoding_Complex_Float, Even = PixmatEncoding_Complex_Float_Half_Even,
               Odd = PixmatEncoding_Complex_Float_Half_Odd;

variant number_as(VARTYPE type, int value)
{
    variant v(value), converted;
    EXPECT_EQ(VariantChangeType(converted.get(), v.get(), 0, type), S_OK);
    return converted;
}

variant complex_object(double real, double imaginary)
{
    const auto c = make<Common::CoComplex>();
    c->real = real, c->imaginary = imaginary;
    return variant(static_cast<IDispatch*>(c.get()));
}

template <class T>
variant array_of(VARTYPE type, std::initializer_list<T> values)
{
    safe_array array = safe_array::vector(type, static_cast<uint32_t>(values.size()));
    std::copy(values.begin(), values.end(), safe_array_access<T>(array.get()).data());
    VARIANT v = empty_variant();
    v.vt = static_cast<VARTYPE>(VT_ARRAY | type);
    v.parray = array.detach();
    return variant::attach(v);
}

variant operand(const com_ptr<IPixmat2>& i) { return variant(i.get()); }
variant operand(const com_ptr<foreign_image>& i) { return variant(static_cast<IPixmat2*>(i.get())); }

using facet_method = HRESULT (IBasicOps2::*)(IPixmat2*, VARIANT, IPixmat2*, IPixmat2**) noexcept;
constexpr facet_method facet_methods[] = {
    &IBasicOps2::Add,      &IBasicOps2::Subtract, &IBasicOps2::ReverseSubtract,
    &IBasicOps2::Multiply, &IBasicOps2::Divide,   &IBasicOps2::ReverseDivide,
    &IBasicOps2::Min,      &IBasicOps2::Max};

class Basic2 : public ::testing::Test {
protected:
    com_ptr<CBasic2> object_{make<CBasic2>()};
    com_ptr<IBasicOps2> facet{object_};

    template <class T>
    T first_pixel(facet_method m, const com_ptr<IPixmat2>& a, const variant& b)
    {
        com_ptr<IPixmat2> result;
        EXPECT_EQ((facet.get()->*m)(a.get(), *b.get(), nullptr, result.put()), S_OK);
        return result ? pixel_of<T>(result) : T{};
    }
    void round(ZELT_Rounding mode) { object_->roundable().set(mode); }
};

TEST_F(Basic2, ComputesEachOperationUnderTheFacetsRounding)
{
    const auto a = image<uint8_t>(U, 200), b = image<uint8_t>(U, 60);
    const uint8_t wrapped[] = {4, 140, 116, 224, 3, 0, 60, 200},
                  saturated[] = {255, 140, 255, 255, 3, 0, 60, 200};
    for (size_t i = 0; i < std::size(facet_methods); ++i) {
        round(ZELT_Rounding_Wrap);
        EXPECT_EQ(first_pixel<uint8_t>(facet_methods[i], a, operand(b)), wrapped[i]) << i;
        round(ZELT_Rounding_Saturate);
        EXPECT_EQ(first_pixel<uint8_t>(facet_methods[i], a, operand(b)), saturated[i]) << i;
        EXPECT_EQ(first_pixel<uint8_t>(facet_methods[i], a, number_as(VT_UI1, 60)), saturated[i]) << i;
    }
    const auto f = image<float>(F, 0.7f);
    EXPECT_EQ(first_pixel<float>(&IBasicOps2::Max, f, variant(7.0f)), 7.0f) << "Max ignores Saturate";
    EXPECT_EQ(first_pixel<float>(&IBasicOps2::Add, f, variant(7.0f)), 1.0f);
}

TEST_F(Basic2, NewOutputsHaveTheDescriptorOfTheFirstOperand)
{
    const auto twelve = image<uint16_t>(U, 4000, small, 12);
    round(ZELT_Rounding_Saturate);
    com_ptr<IPixmat2> result;
    ASSERT_EQ(facet->Add(twelve.get(), *variant(200).get(), nullptr, result.put()), S_OK);
    image_layout layout;
    ASSERT_EQ(ReadLayout(result.get(), &layout), S_OK);
    EXPECT_EQ(layout, packed_layout(4, 3, 12, U));
    EXPECT_EQ(pixel_of<uint16_t>(result), 4095);
    EXPECT_EQ(result->AddRef(), 2u) << "one reference, the caller's";
    result->Release();

    const auto padded = random_image<uint8_t>(small, memory_layout::padded, 1);
    ASSERT_EQ(facet->Min(object(padded).get(), *variant(7).get(), nullptr, result.put()), S_OK);
    ASSERT_EQ(ReadLayout(result.get(), &layout), S_OK);
    EXPECT_EQ(layout, padded.layout()) << "strides and offset included";
}

TEST_F(Basic2, OpensTheOutputThenWhatIsNotTheOutput)
{
    auto x = random_image<uint8_t>(small, memory_layout::padded, 1), y = x, z = x;
    const auto a = object(x), b = object(y), out = object(z);
    const calls read{"read", "release read"}, written{"write", "commit", "release write"};
    const auto check = [&](IPixmat2* to, const variant& second, calls of_a, calls of_b, calls of_out) {
        a->calls.clear(), b->calls.clear(), out->calls.clear();
        ASSERT_EQ(facet->Add(a.get(), *second.get(), to, nullptr), S_OK);
        EXPECT_EQ(a->calls, of_a);
        EXPECT_EQ(b->calls, of_b);
        EXPECT_EQ(out->calls, of_out);
    };
    check(out.get(), operand(b), read, read, written);
    check(a.get(), operand(b), written, read, {});
    check(b.get(), operand(b), read, written, {});
    check(a.get(), operand(a), written, {}, {});
    check(a.get(), variant(3), written, {}, {});
    check(out.get(), operand(a), {"read", "read", "release read", "release read"}, {}, written);
}

TEST_F(Basic2, RefusesInItsOrder)
{
    const auto a = image<uint8_t>(U, 1), b = image<float>(F, 1), wide = image<int64_t>(S, 1);
    const auto third = image<int16_t>(S, 1), little = image<uint8_t>(U, 1, {3, 3});
    const auto full = image<complex_pixel<float>>(C, {}), half = image<complex_pixel<float>>(Even, {});
    const auto stranger = variant(static_cast<IDispatch*>(make<Common::CFloatVector2D>().get()));
    VARIANT nobody = empty_variant();
    nobody.vt = VT_UNKNOWN;
    VARIANT text = empty_variant();
    text.vt = VT_BSTR;
    for (const facet_method m : facet_methods) {
        com_ptr<IPixmat2> result;
        const auto refuses = [&](HRESULT code, const wchar_t* words, IPixmat2* first, const VARIANT& second,
                                 IPixmat2* out, bool wants_result = true) {
            expect_fails(code, words, [&] {
                return (facet.get()->*m)(first, second, out, wants_result ? result.put() : nullptr);
            });
            EXPECT_FALSE(result);
        };
        const VARIANT number = *variant(1).get();
        refuses(E_INVALIDARG, L"", nullptr, *stranger.get(), nullptr, false);
        refuses(E_POINTER, L"", a.get(), *stranger.get(), nullptr, false);
        refuses(E_NOINTERFACE, L"Right argument must be scalar or IPixmat2", half.get(), *stranger.get(),
                nullptr);
        refuses(E_POINTER, L"Right argument must be scalar or IPixmat2", a.get(), nobody, nullptr);
        refuses(E_NOTIMPL, L"Half-complex image must be first operand", little.get(), *operand(half).get(),
                nullptr);
        refuses(E_NOTIMPL, L"Half-complex image must be first operand", full.get(), *operand(half).get(),
                full.get());
        refuses(E_INVALIDARG, L"Can't operate on images of different size", a.get(), *operand(little).get(),
                third.get());
        refuses(E_INVALIDARG, L"", a.get(), *operand(a).get(), little.get());
        refuses(E_INVALIDARG,
                L"Supplied destination image must have same type as at least one of the arguments", a.get(),
                *operand(b).get(), third.get());
        refuses(E_INVALIDARG, L"", wide.get(), *operand(wide).get(), nullptr);
        refuses(E_INVALIDARG, L"", a.get(), *operand(wide).get(), a.get());
        refuses(E_INVALIDARG, L"", a.get(), *operand(full).get(), a.get());
        refuses(E_NOTIMPL, L"", a.get(), text, little.get());
        refuses(E_INVALIDARG, L"", wide.get(), number, nullptr);
        refuses(E_INVALIDARG, L"", third.get(), number, a.get());
        refuses(E_INVALIDARG, L"", a.get(), text, nullptr);
        refuses(E_INVALIDARG, L"", a.get(), *complex_object(1, 2).get(), nullptr);
    }
    EXPECT_EQ(pixel_of<int16_t>(third), 1);
}

TEST_F(Basic2, ReportsAsTheFirstGenerationsInterface)
{
    const auto a = image<uint8_t>(U, 1), little = image<uint8_t>(U, 1, {3, 3});
    EXPECT_EQ(facet->Add(a.get(), *operand(little).get(), a.get(), nullptr), E_INVALIDARG);
    const left_behind left = take_error();
    EXPECT_TRUE(left.interface_id == IBasicOps::iid);
    EXPECT_EQ(left.source, L"ZELT.Main");
}

TEST_F(Basic2, RefusesUnknownRoundingWithoutWriting)
{
    const auto a = image<uint8_t>(U, 5), f = image<float>(F, 1), c = image<complex_pixel<double>>(C, {});
    for (const int mode : {0, 4, -1}) {
        round(static_cast<ZELT_Rounding>(mode));
        for (const variant& b : {operand(a), operand(f), number_as(VT_UI1, 3)})
            expect_fails(E_UNEXPECTED, L"", [&] { return facet->Add(a.get(), *b.get(), a.get(), nullptr); });
        expect_fails(E_UNEXPECTED, L"",
                     [&] { return facet->Add(c.get(), *operand(c).get(), c.get(), nullptr); });
        EXPECT_EQ(facet->Min(a.get(), *variant(9).get(), a.get(), nullptr), S_OK);
    }
    EXPECT_EQ(pixel_of<uint8_t>(a), 5);
}

TEST_F(Basic2, PassesOnWhatImagesAnswerAndCommitsNothing)
{
    const auto x = random_image<uint8_t>(small, memory_layout::packed, 1);
    const auto y = random_image<uint8_t>(small, memory_layout::packed, 2);
    auto z = x;
    for (const auto where : {failing::descriptor, failing::descriptor_value, failing::open_read,
                             failing::open_write, failing::commit})
        for (int which = 0; which < 3; ++which) {
            const bool of_output = which == 2;
            if (where == failing::open_read ? of_output : where >= failing::open_write && !of_output)
                continue;
            const auto part = [&](int i) { return i == which ? where : failing::nothing; };
            const auto a = object(x, part(0)), b = object(y, part(1)), out = object(z, part(2));
            for (const facet_method m : {&IBasicOps2::Add, &IBasicOps2::Min})
                step("place " + std::to_string(int(where)) + ", image " + std::to_string(which), [&] {
                    com_ptr<IPixmat2> result;
                    expect_fails(E_ACCESSDENIED, L"", [&] {
                        return (facet.get()->*m)(a.get(), *operand(b).get(), out.get(), result.put());
                    });
                    EXPECT_FALSE(result);
                    if (where != failing::commit) {
                        EXPECT_EQ(std::ranges::count(out->calls, "commit"), 0);
                    }
                });
        }
}

TEST_F(Basic2, AnswersWhenMemoryEnds)
{
    const auto a = image<uint8_t>(U, 1), f = image<float>(F, 2);
    const auto half = image<complex_pixel<float>>(Even, {1, 2});
    const std::tuple<facet_method, IPixmat2*, variant> cases[] = {
        {&IBasicOps2::Add, a.get(), operand(f)},
        {&IBasicOps2::Divide, f.get(), operand(a)},
        {&IBasicOps2::Multiply, half.get(), complex_object(0, 1)}};
    for (const auto& [m, first, second] : cases)
        for (int n = 1;; ++n) {
            com_ptr<IPixmat2> result;
            HRESULT hr;
            bool reached;
            {
                const failing_allocation armed(n);
                hr = (facet.get()->*m)(first, *second.get(), nullptr, result.put());
                reached = armed.happened();
            }
            if (!reached) {
                EXPECT_EQ(hr, S_OK);
                break;
            }
            EXPECT_EQ(hr, E_OUTOFMEMORY) << n;
            EXPECT_FALSE(result);
            ASSERT_LT(n, 100);
        }
}

TEST_F(Basic2, ReadsEightTypesOfNumbersAndNoOther)
{
    const auto a = image<int32_t>(S, 100);
    for (const VARTYPE type : {VT_I1, VT_UI1, VT_I2, VT_UI2, VT_I4, VT_UI4, VT_R4, VT_R8})
        EXPECT_EQ(first_pixel<int32_t>(&IBasicOps2::Add, a, number_as(type, 27)), 127) << type;
    round(ZELT_Rounding_Saturate); // the type of the number decides
    EXPECT_EQ(first_pixel<int32_t>(&IBasicOps2::Subtract, a, number_as(VT_I2, 27)), 73);
    EXPECT_EQ(first_pixel<int32_t>(&IBasicOps2::Subtract, a, number_as(VT_UI2, 27)), INT32_MIN);
    const auto u = image<uint8_t>(U, 5);
    EXPECT_EQ(first_pixel<uint8_t>(&IBasicOps2::Add, u, number_as(VT_I4, -10)), 255);
    EXPECT_EQ(first_pixel<uint8_t>(&IBasicOps2::Add, u, number_as(VT_R8, -10)), 0);
    com_ptr<IPixmat2> result;
    constexpr VARTYPE others[] = {VT_EMPTY, VT_NULL, VT_BSTR, VT_ERROR, VT_BOOL,
                                  VT_I8,    VT_UI8,  VT_INT,  VT_UINT,  VT_BYREF | VT_R8};
    for (const VARTYPE type : others) {
        VARIANT v = empty_variant();
        v.vt = static_cast<VARTYPE>(type);
        EXPECT_EQ(facet->Add(a.get(), v, nullptr, result.put()), E_INVALIDARG) << type;
    }
    EXPECT_EQ(facet->Add(a.get(), *array_of<double>(VT_R8, {1, 2}).get(), nullptr, result.put()),
              E_INVALIDARG);
}

TEST_F(Basic2, ReadsComplexNumbersInEachForm)
{
    using P = complex_pixel<double>;
    const auto a = image<P>(C, {10, 20});
    const auto expect = [&](const variant& b, P sum) {
        EXPECT_TRUE(same_bits(first_pixel<P>(&IBasicOps2::Add, a, b), sum));
    };
    expect(complex_object(1, 2), {11, 22});
    expect(array_of<float>(VT_R4, {1, 2}), {11, 22});
    expect(array_of<double>(VT_R8, {0.1, 2}), {10.1, 22});
    expect(number_as(VT_I1, -3), {7, 20});
    SAFEARRAYBOUND square[] = {{1, 0}, {2, 0}};
    VARIANT matrix = empty_variant();
    matrix.vt = VT_ARRAY | VT_R8;
    matrix.parray = SafeArrayCreate(VT_R8, 2, square);
    VARIANT none = empty_variant();
    none.vt = VT_ARRAY | VT_R8;
    VARIANT code = empty_variant();
    code.vt = VT_ERROR;
    code.llVal = 0x3a3a; // not to be taken for an array's address
    com_ptr<IPixmat2> result;
    for (const variant& b :
         {array_of<double>(VT_R8, {1, 2, 3}), array_of<double>(VT_R8, {1}), array_of<int32_t>(VT_I4, {1, 2}),
          variant::attach(matrix), variant::attach(none), variant::attach(code), variant(L"1")})
        EXPECT_EQ(facet->Add(a.get(), *b.get(), nullptr, result.put()), E_INVALIDARG);
}

TEST_F(Basic2, ExpandsHalfComplexFirstOperandsIntoANewOutput)
{
    using P = complex_pixel<float>;
    const auto spectrum =
        random_image<P>({3, 4}, memory_layout::padded, 1, values::plain, pixel_type::half_even_32);
    const auto full = random_image<P>({4, 4}, memory_layout::packed, 2, values::plain);
    test_image<P> expected({4, 4}), unused({4, 4});
    ExpandHalfComplex(spectrum.view(), expected.view());
    const auto a = object(spectrum), b = object(full), out = object(unused);
    com_ptr<IPixmat2> result;
    const auto check = [&](auto plus) {
        ASSERT_TRUE(result);
        image_layout layout;
        ASSERT_EQ(ReadLayout(result.get(), &layout), S_OK);
        EXPECT_EQ(layout, packed_layout(4, 4, 64, C));
        for (int y = 0; y < 4; ++y)
            for (int x = 0; x < 4; ++x) {
                const P p = expected.at(x, y), q = plus(x, y);
                EXPECT_TRUE(
                    same_bits(pixel_of<P>(result, x, y), P{p.real + q.real, p.imaginary + q.imaginary}));
            }
    };
    ASSERT_EQ(facet->Add(a.get(), *operand(b).get(), out.get(), result.put()), S_OK);
    check([&](int x, int y) { return full.at(x, y); });
    EXPECT_EQ(out->calls, calls{}) << "the output is not used";
    for (const variant& n : {complex_object(1, 2), array_of<double>(VT_R8, {1, 2})}) {
        ASSERT_EQ(facet->Add(a.get(), *n.get(), nullptr, result.put()), S_OK);
        check([](int, int) { return P{1, 2}; });
    }

    // What keeps a spectrum a spectrum needs no expansion.
    ASSERT_EQ(facet->Add(a.get(), *variant(1).get(), nullptr, result.put()), S_OK);
    image_layout layout;
    ASSERT_EQ(ReadLayout(result.get(), &layout), S_OK);
    EXPECT_EQ(layout.encoding, Even);
    ASSERT_EQ(facet->Multiply(a.get(), *operand(a).get(), nullptr, result.put()), S_OK);
    ASSERT_EQ(ReadLayout(result.get(), &layout), S_OK);
    EXPECT_EQ(layout.width, 3);

    const auto odd = image<complex_pixel<double>>(Odd, {1, 0}, {3, 2}), real = image<double>(F, 2, {5, 2});
    ASSERT_EQ(facet->Multiply(odd.get(), *operand(real).get(), nullptr, result.put()), S_OK);
    ASSERT_EQ(ReadLayout(result.get(), &layout), S_OK);
    EXPECT_EQ(layout, packed_layout(5, 2, 128, C));
    expect_fails(E_INVALIDARG, L"Can't operate on images of different size",
                 [&] { return facet->Add(odd.get(), *operand(b).get(), nullptr, result.put()); });
}

TEST_F(Basic2, SetsWholeImagesAndRectangles)
{
    com_ptr<IRectangle> area;
    ASSERT_EQ(Common::MakeRectangle(1, 2, 4, 5, area.put()), S_OK);
    for (const VARTYPE type : {VT_I1, VT_UI1, VT_I2, VT_UI2, VT_I4, VT_UI4, VT_R4, VT_R8})
        for_each_layout([&](memory_layout l) {
            const auto before = random_image<uint16_t>({6, 7}, l, 1);
            auto pixels = before;
            const auto whole = object(pixels);
            ASSERT_EQ(facet->SetTo(whole.get(), *number_as(type, 77).get(), area.get()), S_OK);
            expect_equal(pixels, [&](int x, int y) {
                return x >= 1 && x < 4 && y >= 2 && y < 5 ? uint16_t{77} : before.at(x, y);
            });
            EXPECT_EQ(whole->calls, (calls{"write", "commit", "release write"}));
            ASSERT_EQ(facet->SetTo(whole.get(), *number_as(type, 78).get(), nullptr), S_OK);
            expect_equal(pixels, [](int, int) { return uint16_t{78}; });
        });

    auto pixels = random_image<uint8_t>({6, 7}, memory_layout::flipped, 1);
    const auto before = pixels;
    const auto patch = random_image<float>({3, 3}, memory_layout::packed, 2, values::plain);
    round(ZELT_Rounding_Saturate); // has no say
    ASSERT_EQ(facet->SetTo(object(pixels).get(), *operand(object(patch)).get(), area.get()), S_OK);
    expect_equal(pixels, [&](int x, int y) {
        return x >= 1 && x < 4 && y >= 2 && y < 5
                   ? static_cast<uint8_t>(static_cast<int64_t>(patch.at(x - 1, y - 2)))
                   : before.at(x, y);
    });
    const auto a = image<uint8_t>(U, 1);
    ASSERT_EQ(facet->SetTo(a.get(), *variant(300).get(), nullptr), S_OK);
    EXPECT_EQ(pixel_of<uint8_t>(a), 44);
    ASSERT_EQ(facet->SetTo(a.get(), *operand(image<uint8_t>(U, 9)).get(), nullptr), S_OK);
    EXPECT_EQ(pixel_of<uint8_t>(a), 9);
    const auto c = image<complex_pixel<float>>(C, {});
    ASSERT_EQ(facet->SetTo(c.get(), *complex_object(1, 2).get(), nullptr), S_OK);
    EXPECT_TRUE(same_bits(pixel_of<complex_pixel<float>>(c), {1, 2}));
}

/// Expanding drops the output, so nothing comes of it; the part is still read where it lies, at any offset.
TEST_F(Basic2, SetToOfSpectraWithComplexNumbersHasNoEffect)
{
    test_image<complex_pixel<float>> pixels({6, 2}, memory_layout::packed, pixel_type::half_even_32);
    auto layout = pixels.layout();
    const int64_t away = int64_t{INT32_MAX} - layout.offset;
    layout.offset = INT32_MAX;
    const auto half = make<foreign_image>(layout, static_cast<uint8_t*>(pixels.data()) - away);
    com_ptr<IRectangle> area;
    ASSERT_EQ(Common::MakeRectangle(2, 1, 5, 2, area.put()), S_OK);
    EXPECT_EQ(facet->SetTo(half.get(), *complex_object(1, 2).get(), area.get()), S_OK);
    EXPECT_EQ(half->calls, (calls{"read", "release read"}));
    expect_equal(pixels, [](int, int) { return complex_pixel<float>{}; });
}

TEST_F(Basic2, SetToRefusesRectanglesAndSizes)
{
    const auto a = image<uint8_t>(U, 1), little = image<uint8_t>(U, 2, {3, 3});
    const VARIANT zero = *variant(0).get();
    expect_fails(E_POINTER, L"", [&] { return facet->SetTo(nullptr, zero, nullptr); });
    for (const rectangle r :
         {rectangle{-1, 0, 2, 2}, {0, -1, 2, 2}, {0, 0, 5, 2}, {0, 0, 2, 4}, {3, 0, 2, 2}, {0, 2, 2, 1}}) {
        com_ptr<IRectangle> area;
        ASSERT_EQ(Common::MakeRectangle(r.left, r.top, r.right, r.bottom, area.put()), S_OK);
        expect_fails(E_INVALIDARG, L"", [&] { return facet->SetTo(a.get(), zero, area.get()); });
    }
    expect_fails(E_INVALIDARG, L"Can't operate on images of different size",
                 [&] { return facet->SetTo(a.get(), *operand(little).get(), nullptr); });
    expect_fails(E_INVALIDARG, L"",
                 [&] { return facet->SetTo(a.get(), *complex_object(1, 2).get(), nullptr); });
    EXPECT_EQ(pixel_of<uint8_t>(a), 1);
    com_ptr<IRectangle> empty;
    ASSERT_EQ(Common::MakeRectangle(2, 3, 2, 3, empty.put()), S_OK);
    EXPECT_EQ(facet->SetTo(a.get(), zero, empty.get()), S_OK);
    EXPECT_EQ(pixel_of<uint8_t>(a), 1);
}

TEST(Basic2ByName, LeavesOutTheOptionalArguments)
{
    const auto facet = make<CBasic2Disp>();
    const auto& table = table_of<IBasicOps2>();
    const auto a = image<uint8_t>(U, 5);
    variant result;
    ASSERT_EQ(late_call(facet.get(), table.methods[0], {operand(a), variant(3)})(&result), S_OK);
    EXPECT_EQ(pixel_of<uint8_t>(query<IPixmat2>(result->pdispVal)), 8);
    ASSERT_EQ(late_call(facet.get(), table.methods[6], {operand(a), variant(7.5)})(&result), S_OK);
    EXPECT_EQ(pixel_of<uint8_t>(a), 7);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
