// The facet of mathematical functions, and the functions of the facet of arithmetic: outputs, refusals, results.
#include "arithmetic/arithmetic.h"
#include "frame/image_access.h"
#include "support/cases.h"
#include "support/failures.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

constexpr auto U = PixmatEncoding_Unsigned, F = PixmatEncoding_Float, C = PixmatEncoding_Complex_Float;

template <class T>
com_ptr<IPixmat2> image(PixmatEncoding encoding, std::initializer_list<T> pixels,
                        int32_t bits = 8 * sizeof(T))
{
    com_ptr<IPixmat2> made;
    const auto width = static_cast<int32_t>(pixels.size());
    CheckHResult(CreateImageFromLayout(packed_layout(width, 1, bits, encoding), made.put()));
    ImageWriteAccess access(made.get());
    std::memcpy(access.view().data, std::data(pixels), pixels.size() * sizeof(T));
    CheckHResult(access.Commit());
    return made;
}

template <class T>
T pixel_of(const com_ptr<IPixmat2>& i, int x = 0)
{
    const ImageReadAccess access(i.get());
    T value;
    std::memcpy(&value, access.view().data + x * static_cast<int64_t>(sizeof(T)), sizeof value);
    return value;
}

image_layout layout_of(const com_ptr<IPixmat2>& i)
{
    image_layout layout;
    CheckHResult(ReadLayout(i.get(), &layout));
    return layout;
}

struct Math : ::testing::Test {
    com_ptr<IMath> math{make<CMath>()};
    com_ptr<IPixmat2> bytes = image<uint8_t>(U, {0, 1, 255}), words = image<uint16_t>(U, {0, 1, 9}),
                      floats = image<float>(F, {-1, 0.5f, 2}), doubles = image<double>(F, {1, 2, 3}),
                      complex = image<double>(C, {1, 2, 3}), two = image<float>(F, {1, 2}), out;
};

TEST_F(Math, EachMethodIsItsFunctionAsAFloatImage)
{
    using method = HRESULT (IMath::*)(IPixmat2*, IPixmat2*, IPixmat2**) noexcept;
    const struct {
        method call;
        double (*function)(double);
    } methods[] = {{&IMath::Sin, std::sin},   {&IMath::Cos, std::cos},   {&IMath::Tan, std::tan},
                   {&IMath::Asin, std::asin}, {&IMath::Acos, std::acos}, {&IMath::Atan, std::atan}};
    for (const auto& m : methods)
        for (const auto& in : {bytes, image<uint16_t>(U, {0, 1, 255}, 12), image<double>(F, {0, 1, 255})}) {
            ASSERT_EQ((math.get()->*m.call)(in.get(), nullptr, out.put()), S_OK);
            EXPECT_EQ(layout_of(out).encoding, F);
            EXPECT_EQ(layout_of(out).bits, 32);
            EXPECT_EQ(layout_of(out).width, 3);
            for (int x = 0; x < 3; ++x) {
                const auto want = static_cast<float>(m.function(x == 2 ? 255 : x));
                if (std::isnan(want))
                    EXPECT_TRUE(std::isnan(pixel_of<float>(out, x)));
                else
                    EXPECT_FLOAT_EQ(pixel_of<float>(out, x), want);
            }
        }
    ASSERT_EQ(math->Atan2(bytes.get(), image<uint8_t>(U, {0, 0, 255}).get(), nullptr, out.put()), S_OK);
    EXPECT_EQ(pixel_of<float>(out, 0), 0);
    EXPECT_FLOAT_EQ(pixel_of<float>(out, 1), static_cast<float>(M_PI_2));
    EXPECT_FLOAT_EQ(pixel_of<float>(out, 2), static_cast<float>(M_PI_4));
}

TEST_F(Math, WorksInPlaceAndTellsOfANullResultAfterwards)
{
    EXPECT_EQ(math->Acos(floats.get(), floats.get(), nullptr), E_POINTER);
    EXPECT_FLOAT_EQ(pixel_of<float>(floats), static_cast<float>(M_PI));
    EXPECT_TRUE(std::isnan(pixel_of<float>(floats, 2)));

    const auto y = image<float>(F, {1, -1, 0}), x = image<float>(F, {1, 1, -1});
    ASSERT_EQ(math->Atan2(y.get(), x.get(), x.get(), out.put()), S_OK);
    EXPECT_EQ(out.get(), x.get());
    EXPECT_FLOAT_EQ(pixel_of<float>(x, 1), static_cast<float>(-M_PI_4));
    EXPECT_FLOAT_EQ(pixel_of<float>(x, 2), static_cast<float>(M_PI));
}

TEST_F(Math, RefusesInDocumentedOrder)
{
    const auto fails = [&](const wchar_t* text, IPixmat2* in, IPixmat2* given) {
        expect_fails(E_INVALIDARG, text, [&] { return math->Sin(in, given, out.put()); });
    };
    fails(L"null IPixmat2", nullptr, floats.get());
    fails(L"ZELT::Math images must have the same size", complex.get(), image<uint8_t>(U, {1}).get());
    fails(L"Math result image must be float", complex.get(), bytes.get());
    fails(L"Math result image must be float", bytes.get(), doubles.get());
    fails(L"ZELT::Math: unsupported pixel type", complex.get(), floats.get());

    const auto fails_2 = [&](const wchar_t* text, const com_ptr<IPixmat2>& a, const com_ptr<IPixmat2>& b,
                             const com_ptr<IPixmat2>& given) {
        expect_fails(E_INVALIDARG, text,
                     [&] { return math->Atan2(a.get(), b.get(), given.get(), out.put()); });
    };
    fails_2(L"null IPixmat2", bytes, nullptr, floats);
    fails_2(L"null IPixmat2", nullptr, bytes, floats);
    fails_2(L"ZELT::Math images must have the same pixel type", bytes, image<uint16_t>(U, {1}), bytes);
    fails_2(L"ZELT::Math images must have the same size", floats, two, bytes);
    fails_2(L"ZELT::Math images must have the same size", complex, complex, two);
    fails_2(L"ZELT::Math result image must be float", complex, complex, bytes);
    fails_2(L"ZELT::Math: unsupported pixel type", complex, complex, floats);
    EXPECT_EQ(pixel_of<float>(floats), -1) << "a refused call wrote";
}

struct Basic2Functions : Math {
    com_ptr<IBasicOps2> basic{make<CBasic2>()};
};

TEST_F(Basic2Functions, KeepTheTypeOfFloats)
{
    ASSERT_EQ(basic->Exp(floats.get(), nullptr, out.put()), S_OK);
    EXPECT_FLOAT_EQ(pixel_of<float>(out, 2), static_cast<float>(std::exp(2.0)));
    ASSERT_EQ(basic->Log(doubles.get(), nullptr, out.put()), S_OK);
    EXPECT_DOUBLE_EQ(pixel_of<double>(out, 2), std::log(3.0));
    ASSERT_EQ(basic->Power(doubles.get(), 0.1, nullptr, out.put()), S_OK);
    EXPECT_DOUBLE_EQ(pixel_of<double>(out, 2), std::pow(3.0, 0.1));
    ASSERT_EQ(basic->Power(floats.get(), 0.1, nullptr, out.put()), S_OK);
    EXPECT_EQ(pixel_of<float>(out, 2), static_cast<float>(std::pow(2.0, double{0.1f})));
    EXPECT_TRUE(std::isnan(pixel_of<float>(out, 0)));
    ASSERT_EQ(basic->Log(image<float>(F, {0, -0.0f, -1}).get(), nullptr, out.put()), S_OK);
    EXPECT_EQ(pixel_of<float>(out, 0), -INFINITY);
    EXPECT_EQ(pixel_of<float>(out, 1), -INFINITY);
    EXPECT_TRUE(std::isnan(pixel_of<float>(out, 2)));
}

TEST_F(Basic2Functions, WorkInPlaceAndTellOfANullResultAfterwards)
{
    EXPECT_EQ(basic->Exp(floats.get(), floats.get(), nullptr), E_POINTER);
    EXPECT_FLOAT_EQ(pixel_of<float>(floats), static_cast<float>(std::exp(-1.0)));
    EXPECT_EQ(basic->Log(floats.get(), floats.get(), nullptr), E_POINTER);
    EXPECT_FLOAT_EQ(pixel_of<float>(floats), -1);
    EXPECT_EQ(basic->Power(floats.get(), -2, floats.get(), nullptr), E_POINTER);
    EXPECT_FLOAT_EQ(pixel_of<float>(floats, 1), 4);
    EXPECT_EQ(basic->Exp(floats.get(), nullptr, nullptr), E_POINTER);
}

TEST_F(Basic2Functions, RefuseInDocumentedOrder)
{
    using method = HRESULT (IBasicOps2::*)(IPixmat2*, IPixmat2*, IPixmat2**) noexcept;
    for (const auto& [name, call] : {std::pair<std::wstring, method>{L"Exp", &IBasicOps2::Exp},
                                     std::pair<std::wstring, method>{L"Log", &IBasicOps2::Log}}) {
        const auto fails = [&, m = call](HRESULT code, const std::wstring& text, IPixmat2* in,
                                         IPixmat2* given) {
            expect_fails(code, text, [&] { return (basic.get()->*m)(in, given, out.put()); });
        };
        const std::wstring other = name + L"(): Output image must have same format as input image";
        fails(E_INVALIDARG, L"null IPixmat2", nullptr, floats.get());
        fails(E_INVALIDARG, other, bytes.get(), floats.get());
        fails(E_INVALIDARG, other, floats.get(), doubles.get());
        fails(E_INVALIDARG, other, floats.get(), two.get());
        for (const auto& in : {bytes, words, complex}) {
            fails(E_NOTIMPL, L"", in.get(), nullptr);
            fails(E_NOTIMPL, L"", in.get(), in.get());
        }
    }
    const auto fails = [&](const wchar_t* text, IPixmat2* in, IPixmat2* given) {
        expect_fails(E_INVALIDARG, text, [&] { return basic->Power(in, 2, given, out.put()); });
    };
    fails(L"null IPixmat2", nullptr, nullptr);
    fails(L"null IPixmat2", nullptr, floats.get());
    fails(L"Power: src and dst pixel types must be identical", bytes.get(), two.get());
    fails(L"Power: unsupported pixel type", words.get(), image<uint16_t>(U, {1}).get());
    fails(L"Power: src and dst must have the same size", floats.get(), two.get());
    EXPECT_EQ(pixel_of<float>(two), 1) << "a refused call wrote";
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
