#include "filters/kernels/gradients.h"

#include "filter_cases.h"

#include <functional>

namespace Qor::Luxar::ZELT::Test {
namespace {

/// Differences of integers are exact, those of floats are taken in their own type.
template <class N>
using difference = std::conditional_t<std::is_integral_v<N>, int64_t, N>;

template <class D>
using neighbours = std::function<D(int dx, int dy)>;

template <class D>
double sobel(const neighbours<D>& p)
{
    const D a = p(-1, -1) + 2 * p(0, -1) + p(1, -1) - p(-1, 1) - 2 * p(0, 1) - p(1, 1);
    const D b = p(-1, -1) + 2 * p(-1, 0) + p(-1, 1) - p(1, -1) - 2 * p(1, 0) - p(1, 1);
    return std::hypot(static_cast<double>(a), static_cast<double>(b));
}
template <class D>
double prewitt(const neighbours<D>& p)
{
    const D a = p(-1, -1) + p(0, -1) + p(1, -1) - p(-1, 1) - p(0, 1) - p(1, 1);
    const D b = p(-1, -1) + p(-1, 0) + p(-1, 1) - p(1, -1) - p(1, 0) - p(1, 1);
    return std::hypot(static_cast<double>(a), static_cast<double>(b));
}
template <class D>
double derivative(const neighbours<D>& p)
{
    return std::hypot(static_cast<double>(p(0, -1) - p(0, 1)), static_cast<double>(p(-1, 0) - p(1, 0)));
}

template <class T, class Magnitude>
T by_definition(const test_image<T>& in, int x, int y, Magnitude&& magnitude)
{
    return each_channel<T>([&](auto channel) {
        using N = decltype(channel(T{}));
        const neighbours<difference<N>> p = [&](int dx, int dy) {
            return static_cast<difference<N>>(channel(in.clamped(x + dx, y + dy)));
        };
        return saturated<N>(magnitude(p));
    });
}

#define ZELT_EXPECT_GRADIENT(c, name)                                                                        \
    expect_equal((c).run(Filters::name), [&](int x, int y) {                                                 \
        return by_definition((c).input, x, y, [](const auto& p) { return name(p); });                        \
    })

template <class... Types>
void expect_definitions(values kind)
{
    for_each_case<Types...>(kind, []<class T>(const test_case<T>& c) {
        ZELT_EXPECT_GRADIENT(c, sobel);
        ZELT_EXPECT_GRADIENT(c, prewitt);
        ZELT_EXPECT_GRADIENT(c, derivative);
    });
}

TEST(Gradients, AreThoseOfTheDefinitionForEveryType)
{
    expect_definitions<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double, colour_24>(
        values::extreme);
}

TEST(Gradients, AreThoseOfTheDefinitionForFloatsOfEveryKind)
{
    expect_definitions<float, double>(values::special);
}

template <class T>
void expect_derivative(const test_image<T>& in)
{
    test_image<T> out(in.extent());
    Filters::derivative(in.view(), out.view());
    expect_equal(out, [&](int x, int y) {
        return by_definition(in, x, y, [](const auto& n) { return derivative(n); });
    });
}

/// Right triangles with whole sides and such as have one side longer by 1. A hypotenuse of the first is for integers where
/// cutting begins, for floats in the middle between two of them.
template <class T>
void expect_magnitudes_of_triangles()
{
    constexpr int count = 143;
    for (const uint32_t q : {2900u, 2901u})
        for (const uint32_t more : {0u, 1u}) {
            test_image<T> in({4 * count, 3});
            for (int i = 0; i < count; ++i) {
                const uint32_t p = 3000 + 7 * static_cast<uint32_t>(i);
                in.set(4 * i + 1, 0, static_cast<T>(p * p - q * q + more));
                in.set(4 * i, 1, static_cast<T>(2 * p * q));
            }
            expect_derivative(in);
        }
}
TEST(Gradients, AreRoundedAsThoseOfTheDefinitionWhereRoundingTurns)
{
    for_each_level([](level) {
        expect_magnitudes_of_triangles<float>();
        expect_magnitudes_of_triangles<uint32_t>();
        expect_magnitudes_of_triangles<int32_t>();
    });
}

TEST(Gradients, OfFloatsAreThoseOfTheDefinitionWhateverTheirExponents)
{
    generator random(3);
    for (int exponent = -80; exponent < 80; ++exponent) {
        test_image<float> in({131, 4});
        in.fill([&](int, int) {
            const double unit = std::ldexp(static_cast<double>(random() >> 11), -53);
            return static_cast<float>(std::ldexp(unit, exponent - static_cast<int>(random() % 20)));
        });
        for_each_level([&](level) { expect_derivative(in); });
    }
}

TEST(Gradients, SaturateAtASteepEdgeAndVanishOnAPlane)
{
    test_image<uint8_t> edge({6, 6}), out({6, 6});
    edge.fill([](int, int y) { return static_cast<uint8_t>(y < 3 ? 50 : 150); });
    const auto expect_band = [&](auto filter, uint8_t height) {
        filter(edge.view(), out.view());
        expect_equal(out, [&](int, int y) { return static_cast<uint8_t>(y == 2 || y == 3 ? height : 0); });
    };
    expect_band(Filters::sobel, 255);
    expect_band(Filters::prewitt, 255);
    expect_band(Filters::derivative, 100);
}

TEST(Gradients, RefuseInTheirOrder)
{
    const test_image<uint8_t> bytes({3, 4});
    const test_image<uint16_t> words({4, 4});
    const test_image<uint64_t> wide({4, 3}), wider({3, 3});
    auto part = words.view();
    part.width = 2;
    const auto expect_texts = [&](auto filter, const std::string& types, const std::string& unsupported,
                                  const std::string& sizes, const std::string& in_place) {
        expect_throws<std::invalid_argument>([&] { filter(wide.view(), words.view()); }, types);
        expect_throws<std::invalid_argument>([&] { filter(wide.view(), wider.view()); }, unsupported);
        expect_throws<std::invalid_argument>([&] { filter(words.view(), part); }, sizes);
        expect_throws<std::invalid_argument>([&] { filter(bytes.view(), bytes.view()); }, in_place);
    };
    expect_texts(Filters::sobel, "Sobel: src and dst pixel types must be identical",
                 "Sobel: unsupported pixel type", "Sobel: src and dst pixel types must be identical",
                 "Sobel: filter can not be used in place");
    expect_texts(Filters::prewitt, "Prewitt: src and dst pixel types must be identical",
                 "Prewitt: unsupported pixel type", "Prewitt: src and dst pixel types must be identical",
                 "Prewitt: filter can not be used in place");
    expect_texts(Filters::derivative, "Derivative: src and dst pixel types must be identical",
                 "Derivative: unsupported pixel type",
                 "ZELT Derivative input and output images must have the same size",
                 "ZELT Derivative can not be used in place");
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
