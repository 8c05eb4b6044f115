#include "statistics/kernels/scalar_statistics.h"

#include "support/cases.h"

#include <array>

namespace Qor::Luxar::ZELT::Test {
namespace {

using namespace Statistics;

/// The sums as they are defined. Integers: doubles, one by one. Floats: 16 lanes in a row, folded by halves.
struct defined_sums {
    double sum = 0, squares = 0, moment_x = 0, moment_y = 0;

    static double folded(std::array<double, 16> lanes)
    {
        for (const int half : {8, 4, 2, 1})
            for (int l = 0; l < half; ++l) lanes[size_t(l)] += lanes[size_t(l + half)];
        return lanes[0];
    }
    template <bool Lanes, class At>
    void add_row(At at, int y, int width, int step)
    {
        std::array<double, 16> of_sum{}, of_squares{}, of_moment{};
        for (int i = 0, x = 0; x < width; ++i, x += step) {
            const double v = at(x, y);
            (Lanes ? of_sum[size_t(i % 16)] : sum) += v;
            (Lanes ? of_squares[size_t(i % 16)] : squares) += v * v;
            (Lanes ? of_moment[size_t(i % 16)] : moment_x) += x * v;
            if (!Lanes) moment_y += y * v;
        }
        if (!Lanes) return;
        const double row = folded(of_sum);
        sum += row;
        squares += folded(of_squares);
        moment_x += folded(of_moment);
        moment_y += y * row;
    }
};

/// The record of an area of at least one pixel, seen through at(x, y) as doubles from its corner.
template <bool Lanes, class At>
image_statistics by_definition(At at, size s, int step)
{
    image_statistics r;
    r.minimum = r.maximum = at(0, 0);
    r.minimum_count = r.maximum_count = 1;
    defined_sums sums;
    for (int y = 0; y < s.height; y += step) {
        for (int x = 0; x < s.width; x += step) {
            const double v = at(x, y);
            if (!(v >= r.minimum)) {
                r.minimum = v;
                r.minimum_count = 1;
                r.minimum_x = x;
                r.minimum_y = y;
            } else if (v == r.minimum) {
                ++r.minimum_count;
            }
            if (v == r.maximum || std::isnan(v) || std::isnan(r.maximum)) {
                ++r.maximum_count;
            } else if (v > r.maximum) {
                r.maximum = v;
                r.maximum_count = 1;
                r.maximum_x = x;
                r.maximum_y = y;
            }
        }
        sums.add_row<Lanes>(at, y, s.width, step);
    }
    r.gravity_x = sums.moment_x * (1 / sums.sum);
    r.gravity_y = sums.moment_y * (1 / sums.sum);
    r.mean = sums.sum / ((s.height / step) * (s.width / step));
    r.sum_squares = sums.squares * (step * step);
    return r;
}

void expect_same(const image_statistics& got, const image_statistics& want)
{
    const auto same = [](const char* what, auto a, auto b) {
        if (!same_bits(a, b)) ADD_FAILURE() << what << ": got " << show(a) << ", expected " << show(b);
    };
    same("minimum", got.minimum, want.minimum);
    same("minimum count", got.minimum_count, want.minimum_count);
    same("minimum x", got.minimum_x, want.minimum_x);
    same("minimum y", got.minimum_y, want.minimum_y);
    same("maximum", got.maximum, want.maximum);
    same("maximum count", got.maximum_count, want.maximum_count);
    same("maximum x", got.maximum_x, want.maximum_x);
    same("maximum y", got.maximum_y, want.maximum_y);
    same("gravity x", got.gravity_x, want.gravity_x);
    same("gravity y", got.gravity_y, want.gravity_y);
    same("mean", got.mean, want.mean);
    same("sum of squares", got.sum_squares, want.sum_squares);
    EXPECT_TRUE(got.minimum_valid && got.maximum_valid && got.gravity_valid && got.mean_valid &&
                got.sum_squares_valid);
    EXPECT_FALSE(got.range_min_valid || got.range_max_valid);
}

template <class T>
image_statistics measured(const test_image<T>& image, const image_layout& layout, rectangle area,
                          int step = 1)
{
    image_statistics got;
    measure(layout, image.data(), area, step, *find_value_format(layout.encoding, layout.bits), got);
    return got;
}
template <class T>
image_statistics measured(const test_image<T>& image)
{
    return measured(image, image.layout(), {0, 0, image.width(), image.height()});
}

/// Compares with the definition. `value` turns a stored pixel into a double.
template <class T, class Value>
void expect_defined(const test_image<T>& image, const image_layout& layout, Value value, rectangle area,
                    int step)
{
    if (area.right <= area.left || area.bottom <= area.top) return;
    const auto at = [&](int x, int y) { return value(image.at(area.left + x, area.top + y)); };
    constexpr bool lanes = std::is_floating_point_v<T>;
    auto want = by_definition<lanes>(at, {area.right - area.left, area.bottom - area.top}, step);
    want.minimum_x += area.left;
    want.minimum_y += area.top;
    want.maximum_x += area.left;
    want.maximum_y += area.top;
    want.gravity_x += area.left;
    want.gravity_y += area.top;
    expect_same(measured(image, layout, area, step), want);
}

/// Whole and in part, every pixel and some of them.
template <class T, class Value>
void expect_defined(const test_image<T>& image, const image_layout& layout, Value value)
{
    const int w = image.width(), h = image.height();
    for (const int pixels : {1, 2, 3, 4, 5, 100}) {
        expect_defined(image, layout, value, {0, 0, w, h}, pixels);
        expect_defined(image, layout, value, {w / 3, h / 2, w - w / 5, h}, pixels);
    }
}
template <class T>
void expect_defined(const test_image<T>& image)
{
    expect_defined(image, image.layout(), [](T v) { return static_cast<double>(v); });
}

/// An image in one layout, at every level.
template <class T, class F>
void check_image(size s, memory_layout l, F&& pixel_at)
{
    test_image<T> image(s, l);
    image.fill(pixel_at);
    step("type " + std::to_string(int(default_type<T>())) + ", " + name(s),
         [&] { for_each_level([&](level) { expect_defined(image); }); });
}

template <class... Types, class F>
void for_each_type(F&& f)
{
    (f(pixel<Types>{}), ...);
}
template <class F>
void for_each_real_type(F&& f)
{
    for_each_type<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(f);
}

const auto check_case = []<class T>(const test_case<T>& c) { expect_defined(c.input); };

TEST(Scalars, AreThoseOfTheDefinitionForEveryTypeLayoutAndLevel)
{
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(check_case);
}

TEST(Scalars, OfPlainAndOfSpecialFloatsAreThoseOfTheDefinition)
{
    for_each_case<float, double>(values::plain, check_case);
    for_each_case<float, double>(values::special, check_case);
    for_each_type<float, double>([]<class T>(pixel<T>) {
        generator random(5);
        check_image<T>({5003, 3}, memory_layout::padded,
                       [&](int, int) { return random_value<T>(random, values::plain); });
    });
}

/// Rows longer than what is summed at once and blocks of several short rows, with values that occur often.
TEST(Scalars, CountTiesAcrossLongRowsAndBlocksOfRows)
{
    for_each_real_type([]<class T>(pixel<T>) {
        for (const size s : {size{9001, 3}, size{2100, 5}, size{256, 41}, size{70, 130}})
            for (const auto l : {memory_layout::packed, memory_layout::mirrored})
                for (const int few : {1, 2, 57})
                    check_image<T>(s, l, [&](int x, int y) {
                        return static_cast<T>(100 + (x * 31 + y * 17 + x / 977) % few);
                    });
    });
}

/// Extremes of the type everywhere: the sums pass 2^53, where the order of additions shows, and come back.
TEST(Scalars, OfLargeIntegersAreThoseOfAddingDoublesOneByOne)
{
    for_each_type<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t>([]<class T>(pixel<T>) {
        using limits = std::numeric_limits<T>;
        const auto high = [](int x, int y) {
            return static_cast<T>(int64_t{limits::max()} - (x * 7 + y * 3) % 5);
        };
        const auto low = [](int x, int y) {
            return static_cast<T>(int64_t{limits::min()} / 3 + (x + y) % 100);
        };
        check_image<T>({3001, 9}, memory_layout::packed, high);
        check_image<T>({64, 300}, memory_layout::packed, high);
        check_image<T>({33, 300}, memory_layout::packed, low);
        check_image<T>({3001, 9}, memory_layout::packed,
                       [&](int x, int y) { return (x / 1000 + y) % 2 != 0 ? low(x, y) : high(x, y); });
    });
    // Long and narrow: the moments pass 2^53, the squares do not.
    for (const size s : {size{2, 740001}, size{1480001, 1}})
        check_image<uint16_t>(s, memory_layout::packed,
                              [](int x, int y) { return static_cast<uint16_t>(65535 - (x + y) % 3); });
    check_image<uint16_t>({2003, 1600}, memory_layout::padded,
                          [](int x, int y) { return static_cast<uint16_t>(65535 - (x + y) % 3); });
    check_image<int16_t>({1403, 7001}, memory_layout::packed,
                         [](int x, int y) { return static_cast<int16_t>(-32768 + (x + y) % 3); });
}

TEST(Scalars, FollowTheRulesWhereverNaNsInfinitiesAndZerosLie)
{
    for_each_type<float, double>([]<class T>(pixel<T>) {
        constexpr T nan = std::numeric_limits<T>::quiet_NaN(), infinity = std::numeric_limits<T>::infinity();
        const T placed[][2] = {{nan, nan},    {nan, -infinity},     {-T{0}, T{0}},
                               {T{0}, -T{0}}, {infinity, infinity}, {-infinity, infinity}};
        for (const auto& [a, b] : placed)
            for (const T ground : {T{3}, T{0}, T{-2}})
                for (int at = 0; at < 74; at += at < 4 ? 1 : 7)
                    for (const int distance : {1, 16, 37, 140})
                        check_image<T>({37, 4}, memory_layout::packed, [&, a = a, b = b](int x, int y) {
                            const int i = y * 37 + x;
                            return i == at ? a : i == at + distance ? b : ground + static_cast<T>(i % 3);
                        });
    });
}

/// Storage of one, two, three and four bytes for pixels that are seen as 16 or 32 bits.
TEST(Scalars, OfOddDepthsReadOnlyTheBytesOfAPixel)
{
    const auto check = []<class T>(pixel<T>, int bits, auto value) {
        for (const size s : {size{1, 1}, size{67, 5}, size{1030, 2}})
            for_each_layout([&](memory_layout l) {
                const auto image = random_image<T>(s, l, static_cast<uint64_t>(bits));
                image_layout layout = image.layout();
                layout.bits = bits;
                for (const bool sign : {false, true}) {
                    layout.encoding = sign ? PixmatEncoding_Signed : PixmatEncoding_Unsigned;
                    step("bits " + std::to_string(bits), [&] {
                        for_each_level([&](level) {
                            expect_defined(image, layout,
                                           [&](T v) { return static_cast<double>(value(v, sign)); });
                        });
                    });
                }
            });
    };
    const auto stored = [](auto v, bool sign) -> int64_t {
        if (sign) return static_cast<std::make_signed_t<decltype(v)>>(v);
        return v;
    };
    const auto three_bytes = [](colour_24 c, bool sign) {
        const int v = c.channel[0] | c.channel[1] << 8 | c.channel[2] << 16;
        return sign && c.channel[2] > 127 ? v - (1 << 24) : v;
    };
    for (int bits = 1; bits < 32; ++bits) {
        if (bits < 8) check(pixel<uint8_t>{}, bits, stored);
        if (bits > 8 && bits < 16) check(pixel<uint16_t>{}, bits, stored);
        if (bits > 16 && bits <= 24) check(pixel<colour_24>{}, bits, three_bytes);
        if (bits > 24) check(pixel<uint32_t>{}, bits, stored);
    }
}

TEST(Scalars, CountTheFirstPixelTwice)
{
    test_image<uint16_t> one({1, 1});
    one.set(0, 0, 7);
    const auto r = measured(one);
    EXPECT_EQ(r.minimum_count, 2u);
    EXPECT_EQ(r.maximum_count, 2u);
    EXPECT_EQ(r.mean, 7);

    test_image<uint16_t> three({3, 1});
    three.fill([](int x, int) { return static_cast<uint16_t>(x == 0 ? 5 : 2); });
    EXPECT_EQ(measured(three).minimum_count, 2u) << "found further on: not counted twice";
    EXPECT_EQ(measured(three).maximum_count, 2u);
}

TEST(Scalars, OfASampledImageDivideByTheFlooredSize)
{
    test_image<uint8_t> image({5, 5});
    image.fill([](int, int) { return uint8_t{8}; });
    const auto r = measured(image, image.layout(), {0, 0, 5, 5}, 2);
    EXPECT_EQ(r.mean, 9 * 8 / 4.0);
    EXPECT_EQ(r.sum_squares, 9 * 64 * 4);
    EXPECT_EQ(r.gravity_x, 2);
    EXPECT_TRUE(std::isinf(measured(image, image.layout(), {0, 0, 5, 5}, 6).mean)) << "25 / 36 is no pixel";
}

TEST(Scalars, OfAnEmptyAreaStartAtTheNearestPixel)
{
    auto image = random_image<int16_t>({6, 4}, memory_layout::inset, 3);
    const auto r = measured(image, image.layout(), {6, 2, 6, 4});
    EXPECT_EQ(r.minimum, image.at(5, 2));
    EXPECT_EQ(r.maximum, image.at(5, 2));
    EXPECT_EQ(r.minimum_count, 1u);
    EXPECT_EQ(r.minimum_x, 6);
    EXPECT_EQ(r.sum_squares, 0);
    EXPECT_TRUE(std::isnan(r.mean) && std::isnan(r.gravity_x));

    const auto none = measured(test_image<int16_t>({0, 4}));
    EXPECT_TRUE(std::isnan(none.minimum) && std::isnan(none.maximum));
    EXPECT_EQ(none.maximum_count, 0u);
}

TEST(ValueFormat, HasTheElementAndTheRangeOfADepth)
{
    const auto expect_format = [](PixmatEncoding encoding, int bits, pixel_type element, double low,
                                  double high) {
        const auto f = find_value_format(encoding, bits);
        ASSERT_TRUE(f) << bits;
        EXPECT_EQ(f->element, element) << bits;
        EXPECT_EQ(f->pixel_bytes, (bits + 7) / 8);
        EXPECT_EQ(f->range_min, low);
        EXPECT_EQ(f->range_max, high);
        EXPECT_EQ(range_minimum(encoding, bits), low);
        EXPECT_EQ(range_maximum(encoding, bits), high);
    };
    for (int bits = 1; bits <= 32; ++bits) {
        const int step = bits == 8 ? 0 : bits <= 16 ? 1 : 2;
        const double all = std::ldexp(1, bits);
        expect_format(PixmatEncoding_Unsigned, bits, static_cast<pixel_type>(step), 0, all - 1);
        expect_format(PixmatEncoding_Signed, bits, static_cast<pixel_type>(4 + step), -all / 2, all / 2 - 1);
    }
    expect_format(PixmatEncoding_Float, 32, pixel_type::float_32, 0, 1);
    expect_format(PixmatEncoding_Float, 64, pixel_type::float_64, 0, 1);
}

TEST(ValueFormat, IsAbsentForOtherEncodingsAndDepths)
{
    for (const auto encoding : {PixmatEncoding_Unsigned, PixmatEncoding_Signed, PixmatEncoding_Float})
        for (const int bits : {-8, 0, 33, 63, 128}) EXPECT_FALSE(find_value_format(encoding, bits)) << bits;
    EXPECT_FALSE(find_value_format(PixmatEncoding_Float, 16));
    EXPECT_FALSE(find_value_format(PixmatEncoding_Unsigned, 64));
    for (const auto encoding : {PixmatEncoding_RGB, PixmatEncoding_Complex_Float, PixmatEncoding_Data})
        EXPECT_FALSE(find_value_format(encoding, 32)) << encoding;
}

TEST(ValueRange, OfOtherEncodingsCountsTheirBitsModulo64)
{
    EXPECT_EQ(range_maximum(PixmatEncoding_RGB, 24), 16777215);
    EXPECT_EQ(range_maximum(PixmatEncoding_Complex_Float, 64), 0);
    EXPECT_EQ(range_maximum(PixmatEncoding_Complex_Float, 128), 0);
    EXPECT_EQ(range_minimum(PixmatEncoding_Complex_Float, 128), 0);
    EXPECT_EQ(range_minimum(PixmatEncoding_Signed, 64), -std::ldexp(1, 63));
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
