#include "flatfield/kernels/references.h"

#include "flatfield_cases.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

using FlatField::outcome;
using FlatField::to_dark_ref;
using FlatField::to_gain_ref;

constexpr int32_t offsets[] = {0, 5, -5, 300, 70000, -70000, 0x7FFFFFFF, -0x7FFFFFFF - 1};

template <class Body>
void for_all_types(Body&& body)
{
    for_types<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(body);
}

/// dst = src - offset over every size and layout, and in place.
template <class T, class S>
void sweep_dark()
{
    for_each_case<S>(values::special, [turn = 0](const test_case<S>& c) mutable {
        const int32_t offset = offsets[++turn % 8];
        const auto expected = [&](int x, int y) {
            if constexpr (std::is_floating_point_v<S>)
                return c.input.at(x, y) - static_cast<S>(offset);
            else
                return static_cast<T>(int64_t{c.input.at(x, y)} - offset);
        };
        test_image<T> out(c.input.extent(), c.output_layout);
        ASSERT_EQ(to_dark_ref(image_of(out), image_of(c.input), offset), outcome::done);
        expect_equal(out, expected);
        if constexpr (std::is_same_v<T, S>) {
            auto in_place = c.input;
            to_dark_ref(image_of(in_place), image_of(in_place), offset);
            expect_equal(in_place, expected);
        }
    });
}

TEST(ToDarkRef, SubtractsInTheKernelsOwnType)
{
    for_all_types([]<class T>(pixel<T>) { sweep_dark<T, T>(); });
    sweep_dark<int8_t, uint8_t>();
    sweep_dark<int16_t, uint16_t>();
    sweep_dark<int32_t, uint32_t>();
}

/// A one-pixel image of any declared type, for refusals. Its pixel is large enough for every type.
struct declared {
    int32_t bits;
    PixmatEncoding encoding;
    uint64_t memory[2] = {0, 0};

    FlatField::image view()
    {
        return {{1, 1, bits, encoding, 0, 16, 16}, reinterpret_cast<uint8_t*>(memory)};
    }
};
constexpr auto U = PixmatEncoding_Unsigned, S = PixmatEncoding_Signed, F = PixmatEncoding_Float;

TEST(ToDarkRef, RefusesOtherPairings)
{
    const auto run = [](declared dst, declared src) {
        src.memory[0] = 0x0101010101010101;
        const auto result = to_dark_ref(dst.view(), src.view(), 0);
        EXPECT_EQ(dst.memory[0] != 0, result == outcome::done);
        return result;
    };
    EXPECT_EQ(run({12, U}, {16, U}), outcome::done);
    EXPECT_EQ(run({24, S}, {32, U}), outcome::done);
    EXPECT_EQ(run({5, S}, {8, U}), outcome::done);
    EXPECT_EQ(run({16, U}, {16, S}), outcome::unsupported) << "though the opposite direction works";
    EXPECT_EQ(run({32, U}, {16, U}), outcome::unsupported);
    EXPECT_EQ(run({32, F}, {32, S}), outcome::unsupported);
    EXPECT_EQ(run({32, F}, {64, F}), outcome::unsupported);
    EXPECT_EQ(run({16, F}, {16, F}), outcome::unsupported);
    EXPECT_EQ(run({64, S}, {64, U}), outcome::unsupported);
    EXPECT_EQ(run({32, PixmatEncoding_RGBA}, {32, PixmatEncoding_RGBA}), outcome::unsupported);
    EXPECT_EQ(run({0, U}, {0, U}), outcome::unsupported);
}

/// The mean as a gain reference takes it: doubles added row after row.
template <class T>
double mean(const test_image<T>& i)
{
    double sum = 0;
    for (int y = 0; y < i.height(); ++y)
        for (int x = 0; x < i.width(); ++x) sum += static_cast<double>(i.at(x, y));
    return sum / (i.width() * i.height());
}

template <class T>
T real_gain(double p, double norm)
{
    double g = 50.0;
    if (p > 0) g = 50.0 < norm / p ? 50.0 : norm / p;
    return static_cast<T>(g);
}

template <class T>
T fixed_gain(T p, double norm, int32_t scale)
{
    const double range = std::ldexp(1.0, 8 * sizeof(T));
    const int32_t count = ((scale % 32) + 32) % 32;
    const double unit = count == 31 ? -std::ldexp(1.0, 31) : std::ldexp(1.0, count);
    const double g = p == 0 ? range - 1 : std::min(norm * range / (static_cast<double>(p) * unit), range - 1);
    return low_bits<T>(std::floor(g + 0.5));
}

constexpr double norms[] = {-1.0, 0.0, 100.0, 1e9, 0.25, NAN, HUGE_VAL, -HUGE_VAL};

/// A gain reference of type T of sources of type S, over every size and layout; a mean where the norm asks
/// for one.
template <class T, class S, class Expected>
void sweep_gain(Expected expected)
{
    int turn = 0;
    for (const auto kind : {values::plain, values::special})
        for_each_case<S>(kind, [&](const test_case<S>& c) {
            double norm = norms[++turn % 8];
            const int32_t scale = turn % 5 ? turn % 17 : scale_at(turn);
            test_image<T> out(c.input.extent(), c.output_layout);
            ASSERT_EQ(to_gain_ref(image_of(out), image_of(c.input), norm, scale), outcome::done);
            if (!(norm >= 0)) norm = mean(c.input);
            expect_equal(out, [&](int x, int y) { return expected(c.input.at(x, y), norm, scale); });
        });
}

TEST(ToGainRef, GivesFloatMapsOfAllTypes)
{
    for_all_types([]<class S>(pixel<S>) {
        sweep_gain<float, S>(
            [](S p, double norm, int32_t) { return real_gain<float>(static_cast<double>(p), norm); });
    });
    sweep_gain<double, double>([](double p, double norm, int32_t) { return real_gain<double>(p, norm); });
}

TEST(ToGainRef, GivesFixedPointMaps)
{
    for_types<uint8_t, uint16_t, uint32_t>([]<class T>(pixel<T>) { sweep_gain<T, T>(fixed_gain<T>); });
}

TEST(ToGainRef, GivesTheDocumentedExamples)
{
    test_image<uint16_t> flat({40, 30});
    flat.fill([](int, int) { return uint16_t{100}; });
    test_image<float> ones({40, 30});
    to_gain_ref(image_of(ones), image_of(flat), -1.0, 1);
    expect_equal(ones, [](int, int) { return 1.0f; });
    test_image<uint16_t> halves({40, 30});
    to_gain_ref(image_of(halves), image_of(flat), -1.0, 1);
    expect_equal(halves, [](int, int) { return uint16_t{32768}; });

    flat.set(3, 2, 0); // a norm of 0 is not replaced
    to_gain_ref(image_of(ones), image_of(flat), 0.0, 1);
    expect_equal(ones, [](int x, int y) { return x == 3 && y == 2 ? 50.0f : 0.0f; });
    to_gain_ref(image_of(halves), image_of(flat), 0.0, 1);
    expect_equal(halves, [](int x, int y) { return uint16_t(x == 3 && y == 2 ? 65535 : 0); });
}

TEST(ToGainRef, ReadsAnySourceOfEightBytesAsFloat)
{
    for (const auto encoding : {U, S, F, PixmatEncoding_Complex_Float}) {
        declared src{64, encoding}, dst{64, F};
        const double p = 4.0;
        std::memcpy(src.memory, &p, sizeof p);
        EXPECT_EQ(to_gain_ref(dst.view(), src.view(), 10.0, 1), outcome::done);
        double g;
        std::memcpy(&g, dst.memory, sizeof g);
        EXPECT_EQ(g, 2.5);
        EXPECT_EQ(to_gain_ref(dst.view(), src.view(), -1.0, 1),
                  encoding == F ? outcome::done : outcome::unsupported)
            << "the mean exists for the eight types only";
    }
}

TEST(ToGainRef, RefusesOtherPairings)
{
    const auto run = [](declared dst, declared src) {
        const auto result = to_gain_ref(dst.view(), src.view(), 1.0, 1);
        EXPECT_EQ(dst.memory[0] != 0, result == outcome::done);
        return result;
    };
    EXPECT_EQ(run({12, U}, {16, U}), outcome::done);
    EXPECT_EQ(run({24, F}, {17, S}), outcome::done);
    EXPECT_EQ(run({16, U}, {8, U}), outcome::unsupported);
    EXPECT_EQ(run({16, U}, {16, S}), outcome::unsupported);
    EXPECT_EQ(run({16, S}, {16, U}), outcome::unsupported);
    EXPECT_EQ(run({16, F}, {16, U}), outcome::unsupported);
    EXPECT_EQ(run({64, F}, {32, F}), outcome::unsupported);
    EXPECT_EQ(run({64, U}, {64, U}), outcome::unsupported);
    EXPECT_EQ(run({32, F}, {64, U}), outcome::unsupported);
    EXPECT_EQ(run({32, F}, {32, PixmatEncoding_RGBA}), outcome::unsupported);
}

TEST(References, WalkTheSourcesRectangle)
{
    const auto src = random_image<uint16_t>({7, 5}, memory_layout::padded, 1);
    test_image<uint16_t> dark({9, 8});
    test_image<float> gain({9, 8});
    EXPECT_EQ(to_dark_ref(image_of(dark), image_of(src), 1), outcome::done);
    EXPECT_EQ(to_gain_ref(image_of(gain), image_of(src), 3.0, 1), outcome::done);
    expect_equal(dark, [&](int x, int y) { return uint16_t(x < 7 && y < 5 ? src.at(x, y) - 1 : 0); });
    expect_equal(gain,
                 [&](int x, int y) { return x < 7 && y < 5 ? real_gain<float>(src.at(x, y), 3.0) : 0; });

    for (const size small : {size{6, 5}, size{7, 4}, size{0, 0}}) {
        test_image<uint16_t> little(small);
        test_image<float> little_gain(small);
        EXPECT_EQ(to_dark_ref(image_of(little), image_of(src), 1), outcome::too_small);
        EXPECT_EQ(to_gain_ref(image_of(little_gain), image_of(src), -1.0, 1), outcome::too_small);
        expect_equal(little, [](int, int) { return uint16_t{0}; });
    }
}

TEST(References, RefusePixelsThatTheirStorageWouldLeave) // 24 bits in three bytes each, read as four
{
    std::vector<uint8_t> memory(24);
    const FlatField::image three{packed_layout(4, 2, 24, U), memory.data()};
    EXPECT_EQ(to_dark_ref(three, three, 1), outcome::unsupported);
    EXPECT_EQ(to_gain_ref(three, three, 1.0, 1), outcome::unsupported);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
