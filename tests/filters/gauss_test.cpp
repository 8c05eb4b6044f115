#include "filters/kernels/gauss.h"

#include "gauss_cases.h"
#include "threads/cancellation.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

using Filters::gauss;
using Filters::recursion;

template <class T>
void expect_smoothed(const test_image<T>& out, const test_image<T>& in, const recursion& f)
{
    expect_channels(
        out, in, [&](plane p) { return smoothed<kept<T>>(std::move(p), f); },
        [](auto v) { return cut<T>(v); });
}

template <class T>
void expect_definition(const test_case<T>& c)
{
    const double sigma = next_sigma(&c.input);
    const ::testing::ScopedTrace trace(__FILE__, __LINE__, "sigma " + std::to_string(sigma));
    const recursion f = Filters::young_van_vliet(sigma);
    expect_smoothed(c.run([&](memory_2d src, memory_2d dst) { gauss(src, sigma, dst, nullptr); }), c.input,
                    f);
    expect_smoothed(c.run_in_place([&](memory_2d image) { gauss(image, sigma, image, nullptr); }), c.input,
                    f);
}

TEST(Gauss, IsTheRecursionOfTheDefinition)
{
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double, colour_24>(
        []<class T>(const test_case<T>& c) { expect_definition(c); });
    for_each_case<float, double>(values::special,
                                 []<class T>(const test_case<T>& c) { expect_definition(c); });
}

/// Wider and higher than any block of rows, columns or pixels.
template <class T>
void expect_definition_of_an_image(size s, memory_layout l, pixel_type t = default_type<T>())
{
    const auto in = random_image<T>(s, l, 7, values::extreme, t);
    for_each_level([&](level) {
        test_image<T> out(s, rotated(l, 1), t);
        gauss(in.view(), 3, out.view(), nullptr);
        expect_smoothed(out, in, Filters::young_van_vliet(3));
    });
}
TEST(Gauss, IsTheRecursionForLargerImages)
{
    for (const size s : {size{1083, 5}, size{5, 1083}, size{531, 197}, size{128, 128}})
        for (const auto l : {memory_layout::packed, memory_layout::mirrored}) {
            expect_definition_of_an_image<uint8_t>(s, l);
            expect_definition_of_an_image<uint16_t>(s, l);
            expect_definition_of_an_image<uint32_t>(s, l);
            expect_definition_of_an_image<int32_t>(s, l);
            expect_definition_of_an_image<float>(s, l);
            expect_definition_of_an_image<double>(s, l);
            expect_definition_of_an_image<colour_24>(s, l, pixel_type::bgr);
        }
}

TEST(Gauss, IsTheRecursionForAnImageThatNoCacheHolds)
{
    expect_definition_of_an_image<uint8_t>({2111, 1003}, memory_layout::packed);
}

TEST(Gauss, ReadsAllOfASourceThatOverlapsTheOutputBeforeItIsOverwritten)
{
    const size s{37, 29};
    const auto whole = random_image<float>({s.width, s.height + 5}, memory_layout::padded, 3, values::plain);
    const rectangle upper{0, 0, s.width, s.height}, lower{0, 5, s.width, s.height + 5};
    for (const auto& [from, to] : {std::pair(upper, lower), std::pair(lower, upper)}) {
        test_image<float> image = whole, in(s), out(s);
        in.fill([&](int x, int y) { return image.at(x, y + from.top); });
        gauss(image.view().make_view(&from), 4, image.view().make_view(&to), nullptr);
        out.fill([&](int x, int y) { return image.at(x, y + to.top); });
        expect_smoothed(out, in, Filters::young_van_vliet(4));
    }
}

TEST(Gauss, CutsAndKeepsTheLowBitsOfWhatLeavesTheType)
{
    // NaN coefficients: all pixels are NaN. Colours are limited, NaN being lowest.
    const auto in = random_image<int32_t>({19, 5}, memory_layout::packed, 1);
    for (const double sigma : {std::nan(""), 1e300, std::numeric_limits<double>::infinity()}) {
        test_image<int32_t> out = in;
        gauss(in.view(), sigma, out.view(), nullptr);
        expect_equal(out, [](int, int) { return 0; });
    }
    // A step between the ends of the type leaves it on one side at least.
    test_image<uint32_t> step({40, 1}), out({40, 1});
    step.fill([](int x, int) { return x < 20 ? 0 : ~uint32_t{0}; });
    for (const double sigma : {0.5, 1.0, 3.0, 10.0}) {
        gauss(step.view(), sigma, out.view(), nullptr);
        expect_smoothed(out, step, Filters::young_van_vliet(sigma));
    }
}

TEST(Gauss, KeepsConstantsButForTheCut)
{
    for (const double sigma : {0.5, 0.8, 2.5, 10.0, 200.0}) {
        test_image<float> image({50, 40}), out({50, 40});
        image.fill([](int, int) { return 100.0f; });
        gauss(image.view(), sigma, out.view(), nullptr);
        for (int y = 0; y < 40; ++y)
            for (int x = 0; x < 50; ++x)
                ASSERT_NEAR(out.at(x, y), 100.0f, 2e-5) << sigma; // two roundings to float
        test_image<uint8_t> bytes({50, 40});
        bytes.fill([](int, int) { return uint8_t{100}; });
        gauss(bytes.view(), sigma, bytes.view(), nullptr);
        for (int y = 0; y < 40; ++y)
            for (int x = 0; x < 50; ++x) ASSERT_TRUE(bytes.at(x, y) == 99 || bytes.at(x, y) == 100);
    }
}

TEST(Gauss, SpreadsASpotLikeAGaussianOfItsSigma)
{
    constexpr double accuracy = 0.1; // of the peak: what a filter of the third order reaches at sigma 1
    const double pi = std::acos(-1.0);
    for (const double sigma : {0.7, 1.0, 2.0, 2.5, 5.0, 12.0}) {
        test_image<double> image({201, 1});
        image.set(100, 0, 1.0);
        gauss(image.view(), sigma, image.view(), nullptr);
        double sum = 0;
        for (int x = 0; x < 201; ++x) {
            const double t = (x - 100) / sigma, peak = 1 / (std::sqrt(2 * pi) * sigma);
            EXPECT_NEAR(image.at(x, 0), peak * std::exp(-t * t / 2), accuracy * peak) << sigma;
            EXPECT_NEAR(image.at(x, 0), image.at(200 - x, 0), 1e-5) << sigma;
            sum += image.at(x, 0);
        }
        EXPECT_NEAR(sum, 1.0, 1e-5) << sigma;
    }
}

/// The smallest sigmas take nine weights, clamped at the border.
template <class T>
void expect_nine_weights(const test_case<T>& c)
{
    constexpr double sigmas[] = {0.49999, 0.3, 0.1, -0.4};
    static size_t turn = 0;
    const double sigma = sigmas[turn++ / 3 % 4];
    const auto kernel = Filters::gaussian_3x3(sigma);
    const auto weighted = [&](const plane& p) {
        plane sums = p;
        for (int y = 0; y < p.height; ++y)
            for (int x = 0; x < p.width; ++x) {
                double sum = 0;
                for (int j = 0; j < 3; ++j)
                    for (int i = 0; i < 3; ++i)
                        sum += kernel.values[3 * j + i] * p.clamped(x + 1 - i, y + 1 - j);
                sums(x, y) = sum;
            }
        return sums;
    };
    const auto expect = [&](const test_image<T>& out) {
        expect_channels(out, c.input, weighted, [](auto v) { return saturated<T>(v); });
    };
    expect(c.run([&](memory_2d src, memory_2d dst) { gauss(src, sigma, dst, pool_of(2)); }));
    expect(c.run_in_place([&](memory_2d image) { gauss(image, sigma, image, nullptr); }));
}
TEST(Gauss, ConvolvesWithNineWeightsBelowOneHalf)
{
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double, colour_24>(
        []<class T>(const test_case<T>& c) { expect_nine_weights(c); });
}

TEST(Gauss, MakesNanOfItsWeightsForSigmaZero)
{
    const auto in = random_image<float>({5, 4}, memory_layout::packed, 1, values::plain);
    test_image<float> out({5, 4});
    gauss(in.view(), 0, out.view(), nullptr);
    expect_equal(out, [](int, int) { return std::nanf(""); });
}

TEST(Gauss, IsCancelledBelowOneHalfOnly)
{
    test_image<uint8_t> image({4, 4});
    RequestCancel();
    gauss(image.view(), 1, image.view(), nullptr);
    EXPECT_TRUE(IsCancelled());
    EXPECT_THROW(gauss(image.view(), 0.4, image.view(), nullptr), Cancelled);
    EXPECT_FALSE(IsCancelled());
}

TEST(GaussDesign, HasNineWeightsOfSumOne)
{
    const auto kernel = Filters::gaussian_3x3(0.4);
    double sum = 0;
    for (int j = -1; j <= 1; ++j)
        for (int i = -1; i <= 1; ++i) sum += std::exp(-(i * i + j * j) / 0.32);
    for (int j = -1; j <= 1; ++j)
        for (int i = -1; i <= 1; ++i)
            EXPECT_NEAR(kernel.values[3 * (j + 1) + i + 1], std::exp(-(i * i + j * j) / 0.32) / sum, 1e-15);
}

TEST(GaussDesign, HasTheCoefficientsOfTheDefinition)
{
    const auto expect = [](const recursion& got, double b, double a1, double a2, double a3) {
        EXPECT_NEAR(got.b, b, 1e-14); // what is left of a sum of numbers of about 3
        EXPECT_DOUBLE_EQ(got.a1, a1);
        EXPECT_DOUBLE_EQ(got.a2, a2);
        EXPECT_DOUBLE_EQ(got.a3, a3);
    };
    for (const double sigma : {0.5, 1.0, 2.0, 2.4999, 2.5, 9.0, 100.0}) {
        const double q =
            sigma < 2.5 ? 3.97156 - 4.14554 * std::sqrt(1 - 0.26891 * sigma) : 0.98711 * sigma - 0.9633;
        const double b0 = 1.57825 + q * (2.44413 + q * (1.4281 + q * 0.422205));
        const double a1 = q * (2.44413 + q * (2.85619 + q * 1.26661)) / b0;
        const double a2 = -q * q * (1.4281 + q * 1.26661) / b0, a3 = 0.422205 * q * q * q / b0;
        expect(Filters::young_van_vliet(sigma), 1 - (a1 + a2 + a3), a1, a2, a3);
    }
    struct poles {
        Filters::pole_set name;
        double re, im, magnitude, angle, d;
    };
    for (const poles& at_2 : {poles{Filters::pole_set::first_derivative, 1.31553, 0.97057, 1.6348165969918462,
                                    0.635633478432331, 1.77635},
                              poles{Filters::pole_set::second_derivative, 1.22886, 0.93058,
                                    1.5414525733865445, 0.6481383099251729, 1.70493}})
        for (const double sigma : {0.5, 1.0, 2.0, 3.3, 40.0}) {
            const double p = 2 / sigma, m = std::pow(at_2.magnitude, p), d = std::pow(at_2.d, p);
            const double re = sigma == 2 ? at_2.re : m * std::cos(at_2.angle * p);
            const double im = sigma == 2 ? at_2.im : m * std::sin(at_2.angle * p);
            const double n = re * re + im * im, a3 = 1 / (n * d);
            const double a1 = (2 * d * re + n) * a3, a2 = (2 * re + d) * a3;
            expect(Filters::pole_scaled(sigma, at_2.name), 1 - a1 + a2 - a3, a1, -a2, a3);
        }
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
