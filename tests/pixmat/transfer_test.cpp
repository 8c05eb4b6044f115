#include "pixmat_objects.h"
#include "support/failing_new.h"

namespace Qor::Luxar::Test {
namespace {

using ZELT::Test::step;

com_ptr<IPixmatTransfer> transfer_between(const image_layout& from, const image_layout& to)
{
    com_ptr<IPixmatTransfer> t;
    EXPECT_EQ(create<IPixmatConverter>(CLSID_PixmatConverter)->ConvertCopy(from, to, t.put()), S_OK);
    return t;
}

image_layout row_of(size_t count, int bits, PixmatEncoding encoding)
{
    return packed_layout(static_cast<int32_t>(count), 1, bits, encoding);
}

constexpr auto grey = PixmatEncoding_Unsigned;
constexpr auto real = PixmatEncoding_Float;

struct four_levels {
    double contrast = 1, brightness = 0, gamma = 1, sigma = 1;
};

void set(IPixmatTransfer* t, four_levels l)
{
    EXPECT_EQ(t->SetContrast(l.contrast), S_OK);
    EXPECT_EQ(t->SetBrightness(l.brightness), S_OK);
    EXPECT_EQ(t->SetGamma(l.gamma), S_OK);
    EXPECT_EQ(t->SetSigma(l.sigma), S_OK);
}

double formula(double v, four_levels l)
{
    const double u = std::pow(std::clamp((v - 0.5) * l.contrast + 0.5 + l.brightness, 0.0, 1.0), 1 / l.gamma);
    return u < 0.5 ? 0.5 * std::pow(2 * u, l.sigma) : 1 - 0.5 * std::pow(2 * (1 - u), l.sigma);
}

const four_levels settings[] = {{},           {2, 0, 1, 1},    {1, 0.25, 1, 1},       {1, 0, 2.2, 1},
                                {1, 0, 1, 3}, {-1, 0, 0.5, 1}, {1.5, -0.1, 1.7, 0.6}, {0, 0, 1, 1}};

TEST(Levels, FollowTheFormulaOnEveryRange)
{
    // 70000 pixels are enough to tabulate all values of their type, 200 are not.
    for (const size_t count : {size_t{200}, size_t{70000}})
        for (const auto& l : settings) {
            std::vector<uint16_t> pixels(count);
            for (size_t i = 0; i < count; ++i)
                pixels[i] = static_cast<uint16_t>(i * 7919 % 4500); // beyond 4095, too
            const auto from = row_of(count, 12, grey);
            std::vector<double> reals(count);
            std::vector<int16_t> shorts(count);
            auto t = transfer_between(from, row_of(count, 64, real));
            set(t.get(), l);
            ASSERT_EQ(t->Run(pixels.data(), reals.data(), nullptr, nullptr), S_OK);
            t = transfer_between(from, row_of(count, 10, PixmatEncoding_Signed));
            set(t.get(), l);
            ASSERT_EQ(t->Run(pixels.data(), shorts.data(), nullptr, nullptr), S_OK);
            for (size_t i = 0; i < count; ++i) {
                const double u = formula(pixels[i] / 4095.0, l);
                ASSERT_NEAR(reals[i], u, 1e-14) << pixels[i]; // powers of two libraries
                const double place = -512 + u * 1023;
                ASSERT_NEAR(shorts[i], place, 0.5 + 1e-9) << pixels[i];
            }
        }
}

TEST(Levels, AtTheirDefaultsChangeNothingInTheSameRange)
{
    for (const auto& [encoding, bits] : {std::pair{grey, 8},
                                         {grey, 12},
                                         {grey, 32},
                                         {grey, 64},
                                         {PixmatEncoding_Signed, 64},
                                         {real, 32},
                                         {real, 64},
                                         {PixmatEncoding_BGRA, 32},
                                         {PixmatEncoding_RGB, 24},
                                         {PixmatEncoding_Complex_Float, 64}})
        step(std::to_string(encoding) + ", bits " + std::to_string(bits), [&, e = encoding, b = bits] {
            std::vector<uint8_t> pixels(16 * 40), copy(16 * 40);
            for (size_t i = 0; i < pixels.size(); ++i)
                pixels[i] = static_cast<uint8_t>(i * 37 % 11 + i % 3); // no NaN
            const auto layout = row_of(40, b, e);
            const auto t = transfer_between(layout, layout);
            set(t.get(), {});
            ASSERT_EQ(t->Run(pixels.data(), copy.data(), nullptr, nullptr), S_OK);
            const auto bytes = static_cast<size_t>(40 * layout.x_stride);
            EXPECT_EQ(std::memcmp(pixels.data(), copy.data(), bytes), 0);
        });
}

TEST(Levels, ScaleBetweenRangesAndActOnChannels)
{
    const uint16_t words[] = {0, 128, 257, 65535};
    uint8_t bytes[4] = {};
    auto t = transfer_between(row_of(4, 16, grey), row_of(4, 8, grey));
    set(t.get(), {});
    ASSERT_EQ(t->Run(words, bytes, nullptr, nullptr), S_OK);
    EXPECT_EQ(bytes[0] * 1000000 + bytes[1] * 10000 + bytes[2] * 1000 + bytes[3], 0 + 0 + 1000 + 255);

    const uint8_t rgba[] = {0, 100, 255, 77};
    uint8_t bgra[4] = {}, bgr[3] = {}, level = 0;
    t = transfer_between(row_of(1, 32, PixmatEncoding_RGBA), row_of(1, 32, PixmatEncoding_BGRA));
    set(t.get(), {-1, 0, 1, 1});
    ASSERT_EQ(t->Run(rgba, bgra, nullptr, nullptr), S_OK);
    EXPECT_EQ((std::vector<int>{0, 155, 255, 77}), (std::vector<int>(bgra, bgra + 4)));
    t = transfer_between(row_of(1, 32, PixmatEncoding_RGBA), row_of(1, 8, grey));
    set(t.get(), {-1, 0, 1, 1});
    ASSERT_EQ(t->Run(rgba, &level, nullptr, nullptr), S_OK);
    EXPECT_EQ(level, 255 - 88); // 0.587 * 100 + 0.114 * 255 = 87.77
    const float third = 1.0f / 3, not_a_number = std::nanf("");
    t = transfer_between(row_of(1, 32, real), row_of(1, 24, PixmatEncoding_BGR));
    set(t.get(), {1, 0.2, 1, 1});
    ASSERT_EQ(t->Run(&third, bgr, nullptr, nullptr), S_OK);
    EXPECT_EQ((std::vector<int>{136, 136, 136}), (std::vector<int>(bgr, bgr + 3)));
    ASSERT_EQ(t->Run(&not_a_number, bgr, nullptr, nullptr), S_OK);
    EXPECT_EQ(bgr[0], 0);
}

TEST(Levels, GiveTheSameBitsAloneAndInARow)
{
    std::vector<float> pixels(301);
    std::vector<double> row(301);
    for (size_t i = 0; i < pixels.size(); ++i) pixels[i] = static_cast<float>(i) / 300;
    const auto run = [](const float* from, double* to, size_t count) {
        const auto t = transfer_between(row_of(count, 32, real), row_of(count, 64, real));
        set(t.get(), {1.1, 0.01, 2.2, 1.3});
        ASSERT_EQ(t->Run(from, to, nullptr, nullptr), S_OK);
    };
    run(pixels.data(), row.data(), row.size());
    for (size_t i = 0; i < pixels.size(); ++i) {
        double alone = -1;
        run(&pixels[i], &alone, 1);
        EXPECT_EQ(alone, row[i]) << i;
    }
}

TEST(Levels, RefuseValuesWithoutMeaning)
{
    const auto t = transfer_between(row_of(1, 8, grey), row_of(1, 8, grey));
    const double infinity = std::numeric_limits<double>::infinity();
    for (const double bad : {infinity, -infinity, std::nan("")}) {
        EXPECT_EQ(t->SetContrast(bad), E_INVALIDARG);
        EXPECT_EQ(t->SetBrightness(bad), E_INVALIDARG);
    }
    for (const double bad : {infinity, std::nan(""), 0.0, -1.0}) {
        EXPECT_EQ(t->SetGamma(bad), E_INVALIDARG);
        EXPECT_EQ(t->SetSigma(bad), E_INVALIDARG);
    }
}

constexpr uint32_t ramp[] = {0x030201, 0x060504, 0x090807, 0xff0c0b0a}; // the top byte is nobody's

TEST(LookupTable, PicksTheEntryOfTheValue)
{
    const double values[] = {10, 12.49, 12.5, 19.99, 20, 1e300, -1e300, 9, std::nan(""), 17.5, 14.999999};
    const int entries[] = {0, 0, 1, 3, 3, 3, 0, 0, 0, 3, 1};
    uint8_t bgra[4 * std::size(values)] = {};
    const auto t = transfer_between(row_of(std::size(values), 64, real),
                                    row_of(std::size(values), 32, PixmatEncoding_BGRA));
    ASSERT_EQ(t->SetLookupTable(ramp, 4, 10, 20), S_OK);
    set(t.get(), {5, 5, 5, 5}); // the table decides alone
    ASSERT_EQ(t->Run(values, bgra, nullptr, nullptr), S_OK);
    for (size_t i = 0; i < std::size(values); ++i) {
        const int first = 1 + 3 * entries[i];
        EXPECT_EQ((std::vector<int>(bgra + 4 * i, bgra + 4 * i + 4)),
                  (std::vector<int>{first + 2, first + 1, first, 255}))
            << values[i];
    }
    const double flat[] = {4, 5, 6};
    const auto same = transfer_between(row_of(3, 64, real), row_of(3, 24, PixmatEncoding_RGB));
    ASSERT_EQ(same->SetLookupTable(ramp, 4, 5, 5), S_OK);
    ASSERT_EQ(same->Run(flat, bgra, nullptr, nullptr), S_OK);
    EXPECT_EQ((std::vector<int>{bgra[0], bgra[3], bgra[6]}), (std::vector<int>{1, 1, 10}));
}

/// Every value of a small type, once in a row too short for a tabulation and once in one that is long enough.
template <class T>
void check_tabulation(PixmatEncoding encoding)
{
    constexpr size_t all = size_t{1} << 8 * sizeof(T);
    std::vector<T> pixels(all + 1);
    for (size_t i = 0; i <= all; ++i) pixels[i] = static_cast<T>(i);
    const auto colours = [&](size_t first, size_t count) {
        std::vector<uint8_t> rgb(3 * count);
        const auto t =
            transfer_between(row_of(count, 8 * sizeof(T), encoding), row_of(count, 24, PixmatEncoding_RGB));
        EXPECT_EQ(t->SetLookupTable(ramp, 4, -50.3, 99.9), S_OK);
        EXPECT_EQ(t->Run(&pixels[first], rgb.data(), nullptr, nullptr), S_OK);
        return rgb;
    };
    auto halves = colours(0, all / 2);
    for (const uint8_t c : colours(all / 2, all + 1 - all / 2)) halves.push_back(c);
    EXPECT_EQ(colours(0, all + 1), halves);
}

TEST(LookupTable, GivesTheSameForLargeAndSmallImages)
{
    check_tabulation<uint8_t>(grey);
    check_tabulation<int8_t>(PixmatEncoding_Signed);
    check_tabulation<uint16_t>(grey);
    check_tabulation<int16_t>(PixmatEncoding_Signed);
}

TEST(Transfer, WithoutSettingsMovesPixelsThroughStrides)
{
    const uint8_t partial[] = {1, 2, 3, 4};
    uint8_t image[8] = {};
    const auto t =
        transfer_between(packed_layout(2, 2, 8, grey), {2, 2, 8, grey, 2, 1, 4}); // every second row
    ASSERT_EQ(t->Run(partial, image, nullptr, nullptr), S_OK);
    EXPECT_EQ((std::vector<int>(image, image + 8)), (std::vector<int>{0, 0, 1, 2, 0, 0, 3, 4}));
}

TEST(Transfer, RefusesBeforeItWrites)
{
    uint8_t pixels[64] = {}, target[64];
    std::memset(target, 42, sizeof target);
    const auto answer = [&](image_layout from, image_layout to, void (*prepare)(IPixmatTransfer*)) {
        const auto t = transfer_between(from, to);
        prepare(t.get());
        return t->Run(pixels, target, nullptr, nullptr);
    };
    const auto nothing = [](IPixmatTransfer*) {};
    const auto table = [](IPixmatTransfer* t) { EXPECT_EQ(t->SetLookupTable(ramp, 4, 0, 1), S_OK); };
    const auto levels = [](IPixmatTransfer* t) { EXPECT_EQ(t->SetContrast(2), S_OK); };
    const auto complex = row_of(4, 64, PixmatEncoding_Complex_Float);
    EXPECT_EQ(answer(row_of(4, 8, grey), row_of(5, 8, grey), nothing), E_INVALIDARG);
    EXPECT_EQ(answer(packed_layout(4, 2, 8, grey), row_of(4, 8, grey), levels), E_INVALIDARG);
    EXPECT_EQ(answer(row_of(4, 8, PixmatEncoding_Data), row_of(4, 8, grey), levels), E_NOTIMPL);
    EXPECT_EQ(answer(complex, row_of(4, 24, PixmatEncoding_RGB), nothing), E_NOTIMPL);
    EXPECT_EQ(answer(complex, row_of(4, 24, PixmatEncoding_RGB), table), E_NOTIMPL);
    EXPECT_EQ(answer(complex, row_of(4, 8, grey), levels), E_NOTIMPL);
    EXPECT_EQ(answer(row_of(4, 8, grey), complex, levels), E_NOTIMPL);
    EXPECT_EQ(answer(row_of(4, 8, grey), row_of(4, 8, grey), table), E_NOTIMPL);
    const auto t = transfer_between(row_of(4, 8, grey), row_of(4, 8, grey));
    const rectangle area{};
    const coordinate<int32_t> point{};
    EXPECT_EQ(t->Run(nullptr, target, nullptr, nullptr), E_POINTER);
    EXPECT_EQ(t->Run(pixels, nullptr, nullptr, nullptr), E_POINTER);
    EXPECT_EQ(t->Run(pixels, target, &area, nullptr), E_INVALIDARG);
    EXPECT_EQ(t->Run(pixels, target, nullptr, &point), E_INVALIDARG);
    EXPECT_EQ(t->SetLookupTable(nullptr, 4, 0, 1), E_POINTER);
    EXPECT_EQ(t->SetLookupTable(ramp, 0, 0, 1), E_INVALIDARG);
    EXPECT_EQ(create<IPixmatConverter>(CLSID_PixmatConverter)->ConvertCopy(complex, complex, nullptr),
              E_POINTER);
    for (const uint8_t byte : target) ASSERT_EQ(byte, 42);
}

TEST(Transfer, KeepsItsTableWhenMemoryRunsOut)
{
    const auto from = row_of(300, 8, grey), to = row_of(300, 24, PixmatEncoding_RGB);
    std::vector<uint8_t> pixels(300, 255), first(900), second(900);
    const auto t = transfer_between(from, to);
    ASSERT_EQ(t->SetLookupTable(ramp, 4, 0, 1), S_OK);
    ASSERT_EQ(t->Run(pixels.data(), first.data(), nullptr, nullptr), S_OK);
    const auto failing = [&](auto call) { return ZELT::Test::with_failing_allocation(1, call); };
    EXPECT_EQ(failing([&] { return t->SetLookupTable(ramp, 2, 0, 1); }), E_OUTOFMEMORY);
    EXPECT_EQ(failing([&] { return t->Run(pixels.data(), second.data(), nullptr, nullptr); }), E_OUTOFMEMORY);
    EXPECT_EQ(second[0], 0);
    ASSERT_EQ(t->Run(pixels.data(), second.data(), nullptr, nullptr), S_OK);
    EXPECT_EQ(first, second);
}

} // namespace
} // namespace Qor::Luxar::Test
