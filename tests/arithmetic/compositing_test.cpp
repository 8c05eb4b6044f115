// The kernels of compositing against their definitions, a pixel at a time.
#include "arithmetic/kernels/blend.h"
#include "arithmetic/kernels/equals.h"
#include "arithmetic/kernels/modulate.h"
#include "arithmetic/kernels/padding.h"
#include "arithmetic_cases.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

using Arithmetic::image;
constexpr double infinity = std::numeric_limits<double>::infinity();
constexpr double not_a_number = std::numeric_limits<double>::quiet_NaN();

template <class T>
double weight_of(T p)
{
    using limits = std::numeric_limits<T>;
    if constexpr (std::is_floating_point_v<T>) return static_cast<double>(p);
    const double range = static_cast<double>(limits::max()) - static_cast<double>(limits::min());
    return (static_cast<double>(p) - static_cast<double>(limits::min())) * (1.0 / range);
}

template <class T>
T blend_by_definition(T base, T other, T mask)
{
    const double w = weight_of(mask);
    const double v = static_cast<double>(base) * (1.0 - w) + static_cast<double>(other) * w;
    if constexpr (std::is_floating_point_v<T>) return static_cast<T>(v);
    return static_cast<T>(static_cast<int64_t>(v));
}

TEST(Combine, FollowsItsDefinitionInEachType)
{
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(
        values::special, []<class T>(const test_case<T>& c) {
            const auto& a = c.input;
            const auto b = random_image<T>(a.extent(), rotated(c.output_layout, 3), 8, values::special);
            const auto m = random_image<T>(a.extent(), c.output_layout, 9, values::special);
            const auto expected = [&](int x, int y) {
                return blend_by_definition(a.at(x, y), b.at(x, y), m.at(x, y));
            };
            auto out = random_image<T>(a.extent(), c.output_layout, 10), over_base = a, over_mask = m;
            Arithmetic::blend(image_of(a), image_of(b), image_of(m), image_of(out));
            expect_equal(out, expected);
            Arithmetic::blend(image_of(over_base), image_of(b), image_of(m), image_of(over_base));
            expect_equal(over_base, expected);
            Arithmetic::blend(image_of(a), image_of(b), image_of(over_mask), image_of(over_mask));
            expect_equal(over_mask, expected);
        });
}

TEST(Combine, HasEachOfSixteenMillionBytesRight)
{
    test_image<uint8_t> base({256, 256}), other({256, 256}), mask({256, 256}), out({256, 256});
    base.fill([](int x, int) { return static_cast<uint8_t>(x); });
    other.fill([](int, int y) { return static_cast<uint8_t>(y); });
    for_each_level([&](level) {
        for (int m = 0; m < 256; ++m) {
            mask.fill([m](int, int) { return static_cast<uint8_t>(m); });
            Arithmetic::blend(image_of(base), image_of(other), image_of(mask), image_of(out));
            for (int y = 0; y < 256; ++y)
                for (int x = 0; x < 256; ++x)
                    ASSERT_EQ(out.at(x, y), blend_by_definition(base.at(x, y), other.at(x, y), mask.at(x, y)))
                        << x << ", " << y << ", " << m;
        }
    });
}

TEST(Combine, TakesOneOfTheImagesWhereMasksAreHard)
{
    constexpr size s{600, 3};
    const auto a = random_image<uint8_t>(s, memory_layout::packed, 1),
               b = random_image<uint8_t>(s, memory_layout::padded, 2);
    test_image<uint8_t> mask(s), out(s);
    mask.fill([](int x, int y) {
        return static_cast<uint8_t>(x == 300 && y == 1 ? 85 : (x / (70 + 100 * y)) % 2 ? 255 : 0);
    });
    for_each_level([&](level) {
        Arithmetic::blend(image_of(a), image_of(b), image_of(mask), image_of(out));
        expect_equal(
            out, [&](int x, int y) { return blend_by_definition(a.at(x, y), b.at(x, y), mask.at(x, y)); });
    });
}

TEST(Margins, BlankAFrameThatIsThickerLeftAndAbove)
{
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(
        values::special, []<class T>(const test_case<T>& c) {
            using limits = std::numeric_limits<T>;
            for (const int64_t m : {int64_t{0}, int64_t{1}, int64_t{3}, int64_t{-1}, int64_t{-5},
                                    int64_t{INT32_MAX}, int64_t{INT32_MIN}}) {
                const auto expected = [&](int x, int y) {
                    const bool inside = x > m && x < c.input.width() - m && y > m && y < c.input.height() - m;
                    return inside ? c.input.at(x, y) : limits::min(); // of Float: least and positive
                };
                const auto run = [m](memory_2d src, memory_2d dst) {
                    const auto of = [](const memory_2d& v) {
                        return image{{v.width, v.height, GetPixmatBits(v.type), GetPixmatEncoding(v.type),
                                      static_cast<int32_t>(v.offset), static_cast<int32_t>(v.x_stride),
                                      static_cast<int32_t>(v.y_stride)},
                                     v.data};
                    };
                    Arithmetic::set_margins(of(src), static_cast<int32_t>(m), of(dst));
                };
                expect_equal(c.run(run), expected);
                expect_equal(c.run_in_place([&](memory_2d i) { run(i, i); }), expected);
            }
        });
}

TEST(Extend, PadsAndCutsOnEachSide)
{
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(
        values::special, []<class T>(const test_case<T>& c) {
            const int w = c.input.width(), h = c.input.height();
            const rectangle domains[] = {{-2, -2, w + 2, h + 2},
                                         {0, 0, w, h},
                                         {1, 1, w, h + 3},
                                         {-3, 1, 2, 4},
                                         {w, 0, w + 5, 2},
                                         {-9, -8, -4, -3},
                                         {0, 0, 0, 3},
                                         {INT32_MIN, 0, INT32_MIN + 3, 2},
                                         {INT32_MAX - 4, INT32_MAX - 3, INT32_MAX, INT32_MAX}};
            constexpr double pads[] = {0, 300.9, -1.5, 1e30, not_a_number, -infinity};
            int turn = 0;
            for (const rectangle& d : domains) {
                const double pad = pads[++turn % 6];
                T stored_pad;
                if constexpr (std::is_floating_point_v<T>)
                    stored_pad = static_cast<T>(pad);
                else
                    stored_pad = static_cast<T>(truncated(pad));
                auto out = random_image<T>({d.right - d.left, d.bottom - d.top}, c.output_layout, 4);
                ASSERT_EQ(Arithmetic::extend(image_of(c.input), {d.left, d.top}, pad, image_of(out)),
                          outcome::done);
                expect_equal(out, [&](int x, int y) {
                    const int64_t u = int64_t{x} + d.left, v = int64_t{y} + d.top;
                    const bool there = u >= 0 && u < w && v >= 0 && v < h;
                    return there ? c.input.at(static_cast<int>(u), static_cast<int>(v)) : stored_pad;
                });
            }
        });
}

template <class T>
bool equals(const test_image<T>& a, const test_image<T>& b)
{
    bool same = false;
    EXPECT_EQ(Arithmetic::equals(image_of(a), image_of(b), &same), outcome::done);
    return same;
}

TEST(Equals, SeesEachPixelInEachTypeAndLayout)
{
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double, colour_24, colour_32,
                  complex_pixel<float>, complex_pixel<double>>([]<class T>(const test_case<T>& c) {
        test_image<T> other(c.input.extent(), c.output_layout);
        other.fill([&](int x, int y) { return c.input.at(x, y); });
        EXPECT_TRUE(equals(c.input, other));
        const int w = c.input.width(), h = c.input.height();
        if (w == 0 || h == 0) return;
        for (const auto& [x, y] : {std::pair{0, 0}, {w - 1, h - 1}, {w / 2, h / 2}}) {
            const T before = other.at(x, y);
            T changed = before; // in its highest byte, that of an exponent
            reinterpret_cast<uint8_t*>(&changed)[sizeof(T) - 1] ^= 0x20;
            other.set(x, y, changed);
            EXPECT_FALSE(equals(c.input, other)) << x << ", " << y;
            other.set(x, y, before);
        }
    });
}

TEST(Equals, ComparesFloatsByValue)
{
    const auto check = []<class T>(T) {
        for_each_layout([](memory_layout l) {
            for_each_level([&](level) {
                constexpr size s{1500, 2};
                test_image<T> a(s, l), b(s, rotated(l, 1));
                a.set(1400, 1, T{-0.0});
                EXPECT_TRUE(equals(a, b)) << "0 and -0";
                a.set(3, 1, static_cast<T>(not_a_number));
                EXPECT_FALSE(equals(a, a)) << "NaN and itself";
            });
        });
        test_image<complex_pixel<T>> c({3, 2});
        c.set(2, 1, {T{0}, static_cast<T>(not_a_number)});
        EXPECT_FALSE(equals(c, c));
    };
    check(float{});
    check(double{});
}

/// The value before it is cut, and whether it is so close to a whole number that the last bits of pow decide.
struct shade {
    long double value;
    bool doubtful;
};

shade shade_by_definition(uint8_t c, double m, double weight)
{
    const long double v = std::pow(c / 255.0L, 1.0L - static_cast<long double>(weight)) * 255.0L *
                          std::pow(static_cast<long double>(m), static_cast<long double>(weight));
    return {v, std::fabs(v - std::round(v)) < 1e-9L * (1 + std::fabs(v))};
}

template <class T, class Colour>
void expect_modulated(size s, memory_layout l, double weight, pixel_type type)
{
    const auto colours = random_image<Colour>(s, l, 1, values::plain, type);
    const auto mask = random_image<T>(s, rotated(l, 3), 2, values::extreme);
    const auto before = random_image<Colour>(s, rotated(l, 5), 3, values::plain, type);
    auto out = before, in_place = colours;
    Arithmetic::modulate(image_of(colours), image_of(mask), weight, image_of(out));
    Arithmetic::modulate(image_of(in_place), image_of(mask), weight, image_of(in_place));
    int wrong = 0, doubtful = 0;
    for (int y = 0; y < s.height; ++y)
        for (int x = 0; x < s.width; ++x)
            for (size_t c = 0; c < sizeof(Colour); ++c) {
                const uint8_t got = out.at(x, y).channel[c];
                if (c == 3) {
                    wrong += got != before.at(x, y).channel[3] ||
                             in_place.at(x, y).channel[3] != colours.at(x, y).channel[3];
                    continue;
                }
                const shade want =
                    shade_by_definition(colours.at(x, y).channel[c], weight_of(mask.at(x, y)), weight);
                wrong += got != in_place.at(x, y).channel[c];
                doubtful += want.doubtful;
                const auto cut = truncated(static_cast<double>(want.value));
                if (!want.doubtful) wrong += got != static_cast<uint8_t>(cut);
            }
    EXPECT_EQ(wrong, 0) << "weight " << weight;
    EXPECT_LT(doubtful, s.width * s.height) << "too few were compared";
    expect_intact(out);
}

TEST(Modulate, FollowsItsDefinitionForEachMask)
{
    for (const double weight : {0.3, 0.75, -0.5, 1.7})
        for_each_layout([&](memory_layout l) {
            expect_modulated<uint8_t, colour_24>({37, 5}, l, weight, pixel_type::rgb);
            expect_modulated<int8_t, colour_32>({37, 5}, l, weight, pixel_type::rgba);
            expect_modulated<uint16_t, colour_24>({37, 5}, l, weight, pixel_type::bgr);
            expect_modulated<int16_t, colour_24>({37, 5}, l, weight, pixel_type::rgb);
            expect_modulated<uint32_t, colour_24>({37, 5}, l, weight, pixel_type::rgb);
            expect_modulated<int32_t, colour_32>({37, 5}, l, weight, pixel_type::rgba);
            expect_modulated<float, colour_24>({37, 5}, l, weight, pixel_type::rgb);
            expect_modulated<double, colour_32>({37, 5}, l, weight, pixel_type::rgba);
        });
}

TEST(Modulate, GivesTheSameByTables)
{
    for (const double weight : {0.3, -0.5}) {
        for (const memory_layout l : {memory_layout::packed, memory_layout::every_second}) {
            expect_modulated<uint8_t, colour_24>({200, 100}, l, weight, pixel_type::rgb);
            expect_modulated<int8_t, colour_32>({200, 100}, l, weight, pixel_type::rgba);
        }
        expect_modulated<uint8_t, colour_24>({90, 10}, memory_layout::packed, weight, pixel_type::rgb);
        expect_modulated<uint16_t, colour_24>({300, 220}, memory_layout::packed, weight, pixel_type::rgb);
        expect_modulated<int16_t, colour_32>({300, 220}, memory_layout::padded, weight, pixel_type::rgba);
    }
}

TEST(Modulate, KeepsExtremeWeightsHarmless)
{
    for (const double weight : {0.0, 1.0, not_a_number, infinity, -infinity, 1e300})
        for (const uint8_t m : {uint8_t{0}, uint8_t{128}, uint8_t{255}})
            for (const uint8_t c : {uint8_t{0}, uint8_t{100}, uint8_t{255}}) {
                test_image<colour_24> colours({1, 1}), out({1, 1});
                test_image<uint8_t> mask({1, 1});
                colours.set(0, 0, {{c, c, c}});
                mask.set(0, 0, m);
                Arithmetic::modulate(image_of(colours), image_of(mask), weight, image_of(out));
                const double v = std::pow(c / 255.0, 1.0 - weight) * 255.0 * std::pow(m / 255.0, weight);
                EXPECT_EQ(out.at(0, 0).channel[1], static_cast<uint8_t>(truncated(v)))
                    << weight << ", " << int{m} << ", " << int{c};
            }
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
