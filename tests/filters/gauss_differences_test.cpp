#include "filters/kernels/gauss.h"

#include "gauss_cases.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

using Filters::pole_set;
using Filters::recursion;

/// In single precision: the squares are exact in double, the root is rounded once.
float single_hypotenuse(double a, double b)
{
    const float x = static_cast<float>(a), y = static_cast<float>(b);
    if (std::isinf(x) || std::isinf(y)) return std::numeric_limits<float>::infinity();
    return static_cast<float>(std::sqrt(double{x} * x + double{y} * y));
}

/// Differences in the type of the scratch.
template <class Kept>
struct differences {
    const plane& p;
    Kept at(int x, int y) const { return static_cast<Kept>(p.clamped(x, y)); }
    Kept x1(int x, int y) const { return at(x + 1, y) - at(x - 1, y); }
    Kept y1(int x, int y) const { return at(x, y + 1) - at(x, y - 1); }
    Kept x2(int x, int y) const { return (at(x - 2, y) + at(x + 2, y) - 2 * at(x, y)) / 4; }
    Kept y2(int x, int y) const { return (at(x, y - 2) + at(x, y + 2) - 2 * at(x, y)) / 4; }
};

template <class Kept>
double gradient(const differences<Kept>& d, int x, int y)
{
    return single_hypotenuse(d.x1(x, y), d.y1(x, y));
}
template <class Kept>
double laplacian(const differences<Kept>& d, int x, int y)
{
    return single_hypotenuse(d.x2(x, y), d.y2(x, y));
}
template <class Kept>
double sdgd(const differences<Kept>& d, int x, int y)
{
    const auto gy_at = [&](int i) { return d.y1(std::clamp(i, 0, d.p.width - 1), y) / 2; };
    const double gx = d.x1(x, y) / 2, gy = gy_at(x), gxx = d.x2(x, y), gyy = d.y2(x, y);
    const double gxy = (gy_at(x + 1) - gy_at(x - 1)) / 2;
    const double v = (gx * gx * gxx + 2 * gx * gy * gxy + gy * gy * gyy) / (gx * gx + gy * gy + 0.1);
    // sqrt(2) |v|, the constant in two parts: correctly rounded.
    constexpr double sqrt_2 = 1.4142135623730951, rest = -9.667293313452913e-17;
    const double product = std::abs(v) * sqrt_2;
    if (!std::isfinite(product)) return product;
    return product + (std::fma(std::abs(v), sqrt_2, -product) + std::abs(v) * rest);
}

struct filter {
    const char* name;
    void (*run)(const memory_2d&, double, const memory_2d&);
    pole_set poles;
    double (*of_floats)(const differences<float>&, int, int);
    double (*of_doubles)(const differences<double>&, int, int);
};
const filter filters[] = {
    {"GaussDerivative", Filters::gauss_derivative, pole_set::first_derivative, gradient<float>,
     gradient<double>},
    {"LaplacianGaussian", Filters::laplacian_gaussian, pole_set::second_derivative, laplacian<float>,
     laplacian<double>},
    {"SDGDGaussian", Filters::sdgd_gaussian, pole_set::second_derivative, sdgd<float>, sdgd<double>},
};

/// The filter of a smoothed channel. Its result is a number of its own precision.
template <class T>
plane by_definition(const plane& in, const filter& f, const recursion& r)
{
    const plane s = rounded<kept<T>>(smoothed<kept<T>>(in, r));
    const differences<kept<T>> d{s};
    plane out = s;
    for (int y = 0; y < s.height; ++y)
        for (int x = 0; x < s.width; ++x) {
            if constexpr (std::is_same_v<T, double>)
                out(x, y) = f.of_doubles(d, x, y);
            else
                out(x, y) = f.of_floats(d, x, y);
        }
    return out;
}

template <class T>
void expect_definition(const test_image<T>& out, const test_image<T>& in, const filter& f, double sigma)
{
    const ::testing::ScopedTrace trace(__FILE__, __LINE__,
                                       f.name + std::string(", sigma ") + std::to_string(sigma));
    const recursion r = Filters::pole_scaled(sigma, f.poles);
    expect_channels(
        out, in, [&](const plane& p) { return by_definition<T>(p, f, r); },
        [](auto v) { return saturated<T>(v); });
}

template <class T>
void expect_definitions(const test_case<T>& c)
{
    const double sigma = next_sigma(&c.input);
    for (const filter& f : filters) {
        expect_definition(c.run([&](memory_2d src, memory_2d dst) { f.run(src, sigma, dst); }), c.input, f,
                          sigma);
        expect_definition(c.run_in_place([&](memory_2d image) { f.run(image, sigma, image); }), c.input, f,
                          sigma);
    }
}

TEST(GaussDifferences, AreThoseOfTheDefinition)
{
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double, colour_24>(
        []<class T>(const test_case<T>& c) { expect_definitions(c); });
    for_each_case<float, double>(values::special,
                                 []<class T>(const test_case<T>& c) { expect_definitions(c); });
}

TEST(GaussDifferences, AreThoseOfLargerImages)
{
    for (const size s : {size{1083, 7}, size{70, 129}})
        for (const filter& f : filters) {
            const auto in = random_image<float>(s, memory_layout::padded, 5, values::plain);
            const auto bytes = random_image<uint8_t>(s, memory_layout::packed, 6, values::plain);
            const auto wide = random_image<double>(s, memory_layout::packed, 6, values::plain);
            for_each_level([&](level) {
                const auto expect = [&]<class T>(const test_image<T>& image) {
                    test_image<T> out(s);
                    f.run(image.view(), 1.5, out.view());
                    expect_definition(out, image, f, 1.5);
                };
                expect(in);
                expect(bytes);
                expect(wide);
            });
        }
}

TEST(GaussDifferences, BelowOneHalfAreZeroOrNotWritten)
{
    for (const double sigma : {0.499, 0.0, -3.0}) {
        const auto in = random_image<uint16_t>({9, 8}, memory_layout::packed, 1);
        for (const filter& f : filters) {
            test_image<uint16_t> out({9, 8});
            out.fill([](int, int) { return uint16_t{7}; });
            f.run(in.view(), sigma, out.view());
            const uint16_t expected = f.run == Filters::sdgd_gaussian ? 7 : 0;
            expect_equal(out, [&](int, int) { return expected; });
        }
    }
}

TEST(GaussDifferences, OfConstantsAreZero)
{
    test_image<int16_t> flat({21, 17}), out({21, 17});
    flat.fill([](int, int) { return int16_t{-1234}; });
    for (const filter& f : filters) {
        f.run(flat.view(), 3, out.view());
        expect_equal(out, [](int, int) { return int16_t{0}; });
    }
}

TEST(GaussDifferences, RefuseInTheirOrder)
{
    const test_image<uint8_t> bytes({3, 4});
    const test_image<uint16_t> words({4, 4});
    const test_image<uint64_t> wide({4, 3}), wider({3, 3});
    const auto expect = [&](auto run, const std::string& name) {
        const std::string types = name + ": src and dst pixel types must be identical";
        expect_throws<std::invalid_argument>([&] { run(words.view(), wide.view()); }, types);
        expect_throws<std::invalid_argument>([&] { run(wide.view(), wider.view()); },
                                             name + ": unsupported pixel type");
        auto shorter = bytes.view();
        shorter.height = 3;
        expect_throws<std::invalid_argument>([&] { run(bytes.view(), shorter); },
                                             "ZELT " + (name == "Gauss" ? "GaussDerivative" : name) +
                                                 " input and output images must have the same size");
    };
    for (const double sigma : {0.3, 1.0}) {
        for (const filter& f : filters) expect([&](auto src, auto dst) { f.run(src, sigma, dst); }, f.name);
        expect([&](auto src, auto dst) { Filters::gauss(src, sigma, dst, nullptr); }, "Gauss");
    }
}

TEST(GaussXYDerivatives, AreHalfTheDifferencesOfTheSmoothedImage)
{
    int turn = 0;
    const auto check = [&]<class T>(const test_case<T>& c) {
        const pole_set poles = ++turn % 2 ? pole_set::first_derivative : pole_set::second_derivative;
        const double sigma = next_sigma(&c.input);
        const size s = c.input.extent();
        const plane exact = smoothed<kept<T>>(plane_of(c.input, 0), Filters::pole_scaled(sigma, poles));
        const plane kept_values = rounded<kept<T>>(exact);
        const differences<kept<T>> d{kept_values};
        const auto view_of_exact = [&](int x, int y) { return static_cast<float>(exact.clamped(x, y)); };
        test_image<float> dst_x(s, memory_layout::every_second), dst_y(s, c.output_layout), blurred(s);
        Filters::gauss_xy_derivatives(c.input.view(), sigma, poles, dst_x.view(), dst_y.view());
        Filters::gauss_smooth(c.input.view(), sigma, poles, blurred.view());
        expect_equal(dst_x, [&](int x, int y) { return static_cast<float>(d.x1(x, y) / 2); });
        expect_equal(dst_y, [&](int x, int y) { return static_cast<float>(d.y1(x, y) / 2); });
        expect_equal(blurred, view_of_exact);
    };
    for_each_case<uint8_t, int32_t, float, double>(check);
}

TEST(GaussXYDerivatives, AreZeroBelowOneHalfAndRefuseOtherImages)
{
    const auto in = random_image<uint8_t>({5, 4}, memory_layout::packed, 1);
    auto dst_x = random_image<float>({5, 4}, memory_layout::packed, 2), dst_y = dst_x, blurred = dst_x;
    const auto poles = pole_set::first_derivative;
    Filters::gauss_xy_derivatives(in.view(), 0.4, poles, dst_x.view(), dst_y.view());
    Filters::gauss_smooth(in.view(), 0.4, poles, blurred.view());
    for (const auto* image : {&dst_x, &dst_y, &blurred}) expect_equal(*image, [](int, int) { return 0.0f; });

    const test_image<float> small({4, 4});
    const test_image<colour_24> colour({5, 4});
    const auto xy = [&](auto& a, auto& b, auto& c) {
        return [&] { Filters::gauss_xy_derivatives(a.view(), 1, poles, b.view(), c.view()); };
    };
    const std::string unsupported = "GaussXYDerivatives: unsupported pixel type";
    const std::string sizes = "ZELT GaussXYDerivatives input and output images must have the same size";
    expect_throws<std::invalid_argument>(xy(colour, dst_x, dst_y), unsupported);
    expect_throws<std::invalid_argument>(xy(in, in, dst_y), unsupported);
    expect_throws<std::invalid_argument>(xy(in, dst_x, in), unsupported);
    expect_throws<std::invalid_argument>(xy(in, small, dst_y), sizes);
    expect_throws<std::invalid_argument>(xy(in, dst_x, small), sizes);
    expect_throws<std::invalid_argument>([&] { Filters::gauss_smooth(in.view(), 1, poles, in.view()); },
                                         "GaussSmooth: unsupported pixel type");
    expect_throws<std::invalid_argument>([&] { Filters::gauss_smooth(in.view(), 1, poles, small.view()); },
                                         "ZELT GaussSmooth input and output images must have the same size");
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
