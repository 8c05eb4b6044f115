// Threshold, AutoThreshold, Normalize and Abs as methods: outputs, coerced values, codes and texts.
#include "arithmetic/arithmetic.h"

#include "frame/image_access.h"
#include "support/cases.h"
#include "support/failures.h"
#include "support/foreign_image.h"
#include "zelt/interfaces/zelt.h"

#include <array>
#include <functional>

namespace Qor::Luxar::ZELT::Test {
namespace {

constexpr auto Unsigned = PixmatEncoding_Unsigned, Signed = PixmatEncoding_Signed,
               Float = PixmatEncoding_Float;

/// An image of one row with these values.
template <class T>
com_ptr<IPixmat2> row_of(std::vector<T> values, int32_t bits, PixmatEncoding encoding)
{
    image_layout layout = packed_layout(static_cast<int32_t>(values.size()), 1, bits, encoding);
    layout.x_stride = sizeof(T); // depths of 17 to 24 bits in words of four bytes
    layout.y_stride = static_cast<int32_t>(layout.x_stride * layout.width);
    com_ptr<IPixmat2> image;
    CheckHResult(CreateImageFromLayout(layout, image.put()));
    com_ptr<IPixmatLock> lock;
    CheckHResult(image->OpenWrite(lock.put()));
    std::memcpy(lock->Data(0), values.data(), values.size() * sizeof(T));
    CheckHResult(lock->Commit(nullptr));
    return image;
}

template <class T>
std::vector<T> values_of(const com_ptr<IPixmat2>& image)
{
    image_layout layout;
    CheckHResult(ReadLayout(image.get(), &layout));
    com_ptr<IPixmatLock> lock;
    CheckHResult(image->OpenRead(nullptr, 1.0, lock.put()));
    std::vector<T> values(static_cast<size_t>(layout.width));
    std::memcpy(values.data(), lock->Data(0), values.size() * sizeof(T));
    return values;
}

int32_t bits_of(const com_ptr<IPixmat2>& image)
{
    image_layout layout;
    CheckHResult(ReadLayout(image.get(), &layout));
    return layout.bits;
}

com_ptr<IPixmat2> empty_image(int32_t width, int32_t bits, PixmatEncoding encoding)
{
    com_ptr<IPixmat2> image;
    CheckHResult(CreateImageFromLayout(packed_layout(width, 1, bits, encoding), image.put()));
    return image;
}

using three_bytes = std::array<uint8_t, 3>;

class Thresholds : public ::testing::Test {
protected:
    com_ptr<IBasicOps2> facet{make<CBasic2>()};
    com_ptr<IBasicOps> first{make<CBasic>()};
    com_ptr<IPixmat2> result;

    HRESULT threshold(const com_ptr<IPixmat2>& in, const variant& low, const variant& low_value,
                      const variant& high, const variant& high_value, IPixmat2* out = nullptr)
    {
        return facet->Threshold(in.get(), *low.get(), *low_value.get(), *high.get(), *high_value.get(), out,
                                result.put());
    }
    HRESULT auto_threshold(const com_ptr<IPixmat2>& in, const variant& below, const variant& above)
    {
        return facet->AutoThreshold(in.get(), *below.get(), *above.get(), ZELT_AutoThreshold_Basic_Global,
                                    nullptr, result.put());
    }

    struct named_call {
        const char* name;
        std::function<HRESULT(IPixmat2*, IPixmat2*, IPixmat2**)> call;
    };
    const variant one{1}, two{2}, eight{8}, nine{9};
    const std::vector<named_call> calls{
        {"Threshold",
         [this](IPixmat2* in, IPixmat2* out, IPixmat2** r) {
             return facet->Threshold(in, *two.get(), *one.get(), *eight.get(), *nine.get(), out, r);
         }},
        {"AutoThreshold",
         [this](IPixmat2* in, IPixmat2* out, IPixmat2** r) {
             return facet->AutoThreshold(in, *one.get(), *nine.get(), ZELT_AutoThreshold_Basic_Global, out,
                                         r);
         }},
        {"Normalize",
         [this](IPixmat2* in, IPixmat2* out, IPixmat2** r) { return facet->Normalize(in, 0, 1, out, r); }},
        {"Abs", [this](IPixmat2* in, IPixmat2* out, IPixmat2** r) { return facet->Abs(in, out, r); }},
    };
};

TEST_F(Thresholds, GiveOnePictureInEveryOutput)
{
    const std::vector<int16_t> values{-5, 0, 3, 7, 12, 40};
    const std::vector<int16_t> expected[] = {
        {1, 1, 3, 7, 9, 9},
        {1, 1, 1, 1, 1, 1}, // 46 values in 128 bins: the limit is 73
        {-32768, -25486, -21117, -15292, -8010, 32767},
        {5, 0, 3, 7, 12, 40},
    };
    for (size_t i = 0; i < calls.size(); ++i) {
        const auto in = row_of(values, 16, Signed), out = row_of(std::vector<int16_t>(6, 99), 12, Signed);
        const ::testing::ScopedTrace trace(__FILE__, __LINE__, calls[i].name);
        ASSERT_EQ(calls[i].call(in.get(), nullptr, result.put()), S_OK);
        const auto made = values_of<int16_t>(result);
        EXPECT_EQ(made, expected[i]);
        EXPECT_EQ(values_of<int16_t>(in), values);
        ASSERT_EQ(calls[i].call(in.get(), out.get(), result.put()), S_OK);
        EXPECT_TRUE(same_object(result.get(), out.get()));
        EXPECT_EQ(values_of<int16_t>(out), made);
        ASSERT_EQ(calls[i].call(in.get(), in.get(), nullptr), S_OK);
        EXPECT_EQ(values_of<int16_t>(in), made);
        EXPECT_EQ(calls[i].call(in.get(), nullptr, nullptr), S_OK) << "nobody asked for the result";
    }
}

TEST_F(Thresholds, StretchToTheWholeRangeOfTheType)
{
    ASSERT_EQ(
        facet->Normalize(row_of<uint8_t>({10, 20, 60, 61}, 8, Unsigned).get(), 0, 1, nullptr, result.put()),
        S_OK);
    EXPECT_EQ(values_of<uint8_t>(result), (std::vector<uint8_t>{0, 50, 250, 255}));
    ASSERT_EQ(facet->Normalize(row_of<int8_t>({-20, 0, 31}, 8, Signed).get(), 0, 1, nullptr, result.put()),
              S_OK);
    EXPECT_EQ(values_of<int8_t>(result), (std::vector<int8_t>{-128, -28, 127}));
    ASSERT_EQ(facet->Normalize(row_of<uint8_t>({10, 110}, 8, Unsigned).get(), 0, 1, nullptr, result.put()),
              S_OK);
    EXPECT_EQ(values_of<uint8_t>(result), (std::vector<uint8_t>{0, 254})) << "the factor is rounded first";
    ASSERT_EQ(facet->Normalize(row_of<float>({1, 2, 3}, 32, Float).get(), 0, 1, nullptr, result.put()), S_OK);
    EXPECT_EQ(values_of<float>(result), (std::vector<float>{0x1p-126f, 0.5f, 1}));

    ASSERT_EQ(facet->Normalize(row_of<uint8_t>({7, 7}, 8, Unsigned).get(), 0.4, 0.4, nullptr, result.put()),
              S_OK);
    EXPECT_EQ(values_of<uint8_t>(result), (std::vector<uint8_t>{7, 7})) << "nothing to stretch";
    ASSERT_EQ(facet->Normalize(row_of<int8_t>({7, 7}, 8, Signed).get(), 0, 1, nullptr, result.put()), S_OK);
    EXPECT_EQ(values_of<int8_t>(result), (std::vector<int8_t>{-121, -121})) << "lowered all the same";
}

TEST_F(Thresholds, KeepTheAutomaticLimitInBins)
{
    ASSERT_EQ(auto_threshold(row_of<uint8_t>({0, 0, 0}, 8, Unsigned), 5, 6), S_OK);
    EXPECT_EQ(values_of<uint8_t>(result), (std::vector<uint8_t>{0, 0, 0})) << "equal to the limit";
    ASSERT_EQ(auto_threshold(row_of<uint8_t>({0, 10, 30, 200, 220}, 8, Unsigned), 5, 6), S_OK);
    EXPECT_EQ(values_of<uint8_t>(result), (std::vector<uint8_t>{5, 5, 5, 6, 6}));
    ASSERT_EQ(auto_threshold(row_of<uint8_t>({0, 19, 36, 123, 140, 182, 243, 248}, 8, Unsigned), 5, 6), S_OK);
    EXPECT_EQ(values_of<uint8_t>(result), (std::vector<uint8_t>{5, 5, 5, 6, 6, 6, 6, 6}))
        << "a step of 0.15 is not the last one";
    ASSERT_EQ(auto_threshold(row_of<uint8_t>({100, 110, 100}, 8, Unsigned), 5, 6), S_OK);
    EXPECT_EQ(values_of<uint8_t>(result), (std::vector<uint8_t>{6, 6, 6})) << "the limit is 55 of 128 bins";
}

TEST_F(Thresholds, TakeNominalDepthsAsTheirStorage)
{
    ASSERT_EQ(threshold(row_of<uint16_t>({5, 4000, 60000}, 12, Unsigned), 10, 11, 50000, 50001), S_OK);
    EXPECT_EQ(values_of<uint16_t>(result), (std::vector<uint16_t>{11, 4000, 50001}));
    EXPECT_EQ(bits_of(result), 12);
    ASSERT_EQ(threshold(row_of<int32_t>({-5, 7, 70000}, 20, Signed), -1, -2, 10, 2147483647), S_OK);
    EXPECT_EQ(values_of<int32_t>(result), (std::vector<int32_t>{-2, 7, 2147483647}));
    ASSERT_EQ(
        facet->Normalize(row_of<uint16_t>({100, 4095}, 12, Unsigned).get(), 0, 1, nullptr, result.put()),
        S_OK);
    EXPECT_EQ(values_of<uint16_t>(result), (std::vector<uint16_t>{0, 65535}));
}

TEST_F(Thresholds, CoerceTheirValues)
{
    // What low and high value become when every pixel is replaced.
    const auto replaced = [&]<class T>(T, int32_t bits, PixmatEncoding e, const variant& value) {
        const auto in = row_of<T>({1, 100}, bits, e);
        EXPECT_EQ(threshold(in, 50, value, 60, value), S_OK);
        const auto got = values_of<T>(result);
        return std::pair{got[0], got[1]};
    };
    variant missing;
    missing.put()->vt = VT_ERROR;
    const double inf = std::numeric_limits<double>::infinity();
    for (const auto& v : {variant(300), variant(-1), variant(L"no number"), missing, variant(std::nan("")),
                          variant(facet.get()), variant(inf)})
        EXPECT_EQ(replaced(uint8_t{}, 8, Unsigned, v), std::pair(uint8_t{0}, uint8_t{255}));
    EXPECT_EQ(replaced(int8_t{}, 8, Signed, 128), std::pair(int8_t{-128}, int8_t{127}));
    EXPECT_EQ(replaced(uint16_t{}, 12, Unsigned, 70000), std::pair(uint16_t{0}, uint16_t{65535}));
    EXPECT_EQ(replaced(int16_t{}, 16, Signed, missing), std::pair(int16_t{-32768}, int16_t{32767}));
    EXPECT_EQ(replaced(uint32_t{}, 32, Unsigned, 5e9), std::pair(uint32_t{0}, 4294967295u));
    EXPECT_EQ(replaced(int32_t{}, 32, Signed, 5e9), std::pair(-2147483647 - 1, 2147483647));
    EXPECT_EQ(replaced(float{}, 32, Float, 1e39),
              std::pair(std::numeric_limits<float>::lowest(), std::numeric_limits<float>::max()));
    EXPECT_EQ(replaced(double{}, 64, Float, missing),
              std::pair(std::numeric_limits<double>::lowest(), std::numeric_limits<double>::max()));

    for (const auto& [value, expected] : {std::pair{variant(2.5), 2},
                                          {variant(3.5), 4},
                                          {variant(L" 17 "), 17},
                                          {variant(), 0},
                                          {variant(254.6), 255}})
        EXPECT_EQ(replaced(uint8_t{}, 8, Unsigned, value), std::pair(uint8_t(expected), uint8_t(expected)));
    EXPECT_EQ(replaced(float{}, 32, Float, inf).first, std::numeric_limits<float>::infinity());
    EXPECT_EQ(replaced(float{}, 32, Float, 0.1).first, 0.1f);

    // A limit that cannot be converted keeps its side open.
    ASSERT_EQ(threshold(row_of<uint8_t>({0, 255}, 8, Unsigned), L"low", 7, L"high", 9), S_OK);
    EXPECT_EQ(values_of<uint8_t>(result), (std::vector<uint8_t>{0, 255}));
}

TEST_F(Thresholds, RefuseOtherPixelsAndOtherOutputs)
{
    const std::pair<int32_t, PixmatEncoding> others[] = {{7, Unsigned},
                                                         {64, Unsigned},
                                                         {64, Signed},
                                                         {16, Float},
                                                         {64, PixmatEncoding_Complex_Float},
                                                         {24, PixmatEncoding_RGB},
                                                         {8, PixmatEncoding_Data}};
    for (const auto& c : calls) {
        const ::testing::ScopedTrace trace(__FILE__, __LINE__, c.name);
        expect_fails(E_INVALIDARG, L"", [&] { return c.call(nullptr, nullptr, result.put()); });
        for (const auto& [bits, encoding] : others) {
            if (bits == 7 && c.name == std::string("Abs")) continue;
            const auto in = empty_image(3, bits, encoding);
            expect_fails(E_NOTIMPL, L"", [&] { return c.call(in.get(), nullptr, result.put()); });
            EXPECT_FALSE(result);
        }
        const auto in = row_of<float>({-1, 0, 3}, 32, Float);
        for (const auto& [bits, encoding] : {std::pair{64, Float}, {32, Signed}, {64, Unsigned}}) {
            const auto out = empty_image(3, bits, encoding);
            expect_fails(E_INVALIDARG, L"", [&] { return c.call(in.get(), out.get(), result.put()); });
            EXPECT_EQ(values_of<uint32_t>(out), std::vector<uint32_t>(3)) << "nothing was written";
        }
        for (const int32_t width : {2, 4}) {
            const auto out = empty_image(width, 32, Float);
            expect_fails(E_INVALIDARG,
                         c.name == std::string("Abs")
                             ? L"Abs(): Output image must have same format as input image"
                             : L"",
                         [&] { return c.call(in.get(), out.get(), result.put()); });
        }
    }
    const auto in = row_of<uint8_t>({1, 2}, 8, Unsigned);
    for (const auto& [low, high] : {std::pair{-0.1, 1.0}, {0.0, 1.001}, {-HUGE_VAL, 0.5}, {0.5, HUGE_VAL}})
        expect_fails(E_INVALIDARG, L"Normalize(): low, high must be in [0, 1] range",
                     [&] { return facet->Normalize(in.get(), low, high, nullptr, result.put()); });
    EXPECT_EQ(facet->AutoThreshold(in.get(), *one.get(), *two.get(),
                                   static_cast<ZELT_AutoThreshold_Method>(1), nullptr, result.put()),
              E_INVALIDARG);
    // Three bytes each: a word would reach into the neighbour.
    const auto packed = empty_image(3, 20, Unsigned);
    expect_fails(E_NOTIMPL, L"", [&] { return threshold(packed, 1, 2, 3, 4); });
}

TEST_F(Thresholds, AbsCopiesUnsignedAndKnowsExactDepthsOnly)
{
    const auto narrow = row_of<uint16_t>({5, 300, 4095}, 12, Unsigned);
    ASSERT_EQ(facet->Abs(narrow.get(), nullptr, result.put()), S_OK);
    EXPECT_EQ(values_of<uint16_t>(result), values_of<uint16_t>(narrow));
    const auto bytes = empty_image(3, 8, Unsigned);
    ASSERT_EQ(facet->Abs(narrow.get(), bytes.get(), nullptr), S_OK);
    EXPECT_EQ(values_of<uint8_t>(bytes), (std::vector<uint8_t>{5, 255, 255})) << "values are carried over";

    ASSERT_EQ(facet->Abs(row_of<uint8_t>({1, 15}, 4, Unsigned).get(), nullptr, result.put()), S_OK);
    EXPECT_EQ(values_of<uint8_t>(result), (std::vector<uint8_t>{1, 15}));
    const auto packed = empty_image(3, 20, Unsigned);
    com_ptr<IPixmatLock> lock;
    ASSERT_EQ(packed->OpenWrite(lock.put()), S_OK);
    for (uint8_t i = 0; i < 9; ++i) lock->Data(0)[i] = i;
    lock = {};
    ASSERT_EQ(facet->Abs(packed.get(), nullptr, result.put()), S_OK);
    EXPECT_EQ(values_of<three_bytes>(result), values_of<three_bytes>(packed));

    expect_fails(E_NOTIMPL, L"",
                 [&] { return facet->Abs(row_of<int16_t>({-5}, 12, Signed).get(), nullptr, result.put()); });
}

TEST_F(Thresholds, LockAnImageOnceWhenItIsBoth)
{
    const auto layout = packed_layout(3, 1, 8, Signed);
    for (const auto& c : calls) {
        int8_t in[3] = {-3, 4, 100}, out[3] = {};
        const auto image = make<foreign_image>(layout, in), other = make<foreign_image>(layout, out);
        ASSERT_EQ(c.call(image.get(), other.get(), nullptr), S_OK) << c.name;
        EXPECT_EQ(image->calls, (std::vector<std::string>{"read", "release read"})) << c.name;
        EXPECT_EQ(other->calls, (std::vector<std::string>{"write", "commit", "release write"})) << c.name;
        ASSERT_EQ(c.call(image.get(), image.get(), nullptr), S_OK) << c.name;
        EXPECT_TRUE(std::equal(in, in + 3, out)) << c.name;
        for (const failing where : {failing::descriptor, failing::open_write, failing::commit}) {
            const auto broken = make<foreign_image>(layout, out, where);
            EXPECT_EQ(c.call(image.get(), broken.get(), nullptr), E_ACCESSDENIED) << c.name;
        }
        const auto shut = make<foreign_image>(layout, in, failing::open_read);
        EXPECT_EQ(c.call(shut.get(), other.get(), nullptr), E_ACCESSDENIED) << c.name;
    }
}

TEST_F(Thresholds, ReadImagesThatShareMemoryBeforeTheyChangeThem)
{
    const auto layout = packed_layout(200, 1, 8, Signed);
    for (const auto& c : calls) {
        int8_t memory[201], apart[200];
        for (int i = 0; i < 201; ++i) memory[i] = static_cast<int8_t>(i % 23 - 4);
        ASSERT_EQ(c.call(make<foreign_image>(layout, memory).get(), make<foreign_image>(layout, apart).get(),
                         nullptr),
                  S_OK);
        ASSERT_EQ(c.call(make<foreign_image>(layout, memory).get(),
                         make<foreign_image>(layout, memory + 1).get(), nullptr),
                  S_OK);
        EXPECT_TRUE(std::equal(apart, apart + 200, memory + 1)) << c.name;
    }
}

TEST_F(Thresholds, FirstGenerationWorksInPlaceOrIntoANewImage)
{
    const auto image = row_of<int8_t>({-128, -3, 4}, 8, Signed);
    ASSERT_EQ(first->AbsEx(image.get(), nullptr, result.put()), S_OK);
    EXPECT_EQ(values_of<int8_t>(result), (std::vector<int8_t>{-128, 3, 4}));
    EXPECT_EQ(values_of<int8_t>(image), (std::vector<int8_t>{-128, -3, 4}));
    ASSERT_EQ(first->Abs(image.get()), S_OK);
    EXPECT_EQ(values_of<int8_t>(image), (std::vector<int8_t>{-128, 3, 4}));
    const VARIANT low = *variant(0).get(), high = *variant(3).get(), value = *variant(77).get();
    ASSERT_EQ(first->ThresholdEx(image.get(), low, low, high, value, nullptr, result.put()), S_OK);
    EXPECT_EQ(values_of<int8_t>(result), (std::vector<int8_t>{0, 3, 77}));
    ASSERT_EQ(first->Threshold(image.get(), low, low, high, value), S_OK);
    EXPECT_EQ(values_of<int8_t>(image), (std::vector<int8_t>{0, 3, 77}));
    EXPECT_EQ(first->Abs(nullptr), E_INVALIDARG);
    EXPECT_EQ(first->ThresholdEx(image.get(), low, low, high, value, nullptr, nullptr), E_POINTER);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
