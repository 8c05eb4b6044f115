#include "arithmetic_cases.h"

#include "arithmetic/kernels/expand_half_complex.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

constexpr int fastest = 1, wrap = 2, saturate = 3;
constexpr method complex_methods[] = {method::add,      method::subtract, method::reverse_subtract,
                                      method::multiply, method::divide,   method::reverse_divide,
                                      method::assign};

template <class Part>
complex_pixel<Part> as_complex(Part v)
{
    return {v, 0};
}
template <class Part>
complex_pixel<Part> as_complex(complex_pixel<Part> v)
{
    return v;
}

/// Both operands in the parts of the destination, then the textbook formula.
template <class Part, class A, class B>
complex_pixel<Part> by_definition(method m, A first, B second)
{
    const auto narrowed = [](auto v) {
        const auto c = as_complex(v);
        return complex_pixel<Part>{static_cast<Part>(c.real), static_cast<Part>(c.imaginary)};
    };
    auto a = narrowed(first), b = narrowed(second);
    if (m == method::reverse_subtract || m == method::reverse_divide) std::swap(a, b);
    switch (m) {
    case method::add: return {a.real + b.real, a.imaginary + b.imaginary};
    case method::subtract:
    case method::reverse_subtract: return {a.real - b.real, a.imaginary - b.imaginary};
    case method::multiply:
        return {a.real * b.real - a.imaginary * b.imaginary, a.imaginary * b.real + a.real * b.imaginary};
    case method::divide:
    case method::reverse_divide: {
        const Part d = b.real * b.real + b.imaginary * b.imaginary;
        return {(a.real * b.real + a.imaginary * b.imaginary) / d,
                (a.imaginary * b.real - a.real * b.imaginary) / d};
    }
    default: return b;
    }
}

template <class Part, class Other>
void check_complex()
{
    using P = complex_pixel<Part>;
    int turn = 0;
    for_each_size([&](size s) {
        for (const method m : complex_methods) {
            const auto l = static_cast<memory_layout>(++turn % 2 ? 0 : turn / 2 % memory_layout_count);
            const auto a = random_image<P>(s, l, 1, values::special);
            const auto b = random_image<Other>(s, rotated(l, turn % 2 ? 0 : 5), 3, values::special);
            for_each_level([&](level) {
                test_image<P> dst(s, l);
                for (const int rounding : {fastest, wrap, saturate}) {
                    ASSERT_EQ(Arithmetic::combine(m, rounding, image_of(a), image_of(b), image_of(dst)),
                              outcome::done);
                    expect_equal(
                        dst, [&](int x, int y) { return by_definition<Part>(m, a.at(x, y), b.at(x, y)); });
                }
                ASSERT_EQ(Arithmetic::combine(m, wrap, image_of(b), image_of(a), image_of(dst)),
                          outcome::done);
                expect_equal(dst,
                             [&](int x, int y) { return by_definition<Part>(m, b.at(x, y), a.at(x, y)); });
            });
        }
    });
}

TEST(ComplexArithmetic, FollowsTheTextbookInThePartsOfItsDestination)
{
    check_complex<float, float>();
    check_complex<float, double>();
    check_complex<float, complex_pixel<float>>();
    check_complex<double, float>();
    check_complex<double, complex_pixel<double>>();
    // The output has the type of pIA, or else of b; with both widths it follows the first operand that fits.
    const auto a = random_image<complex_pixel<float>>({67, 3}, memory_layout::padded, 1);
    const auto b = random_image<complex_pixel<double>>({67, 3}, memory_layout::packed, 2);
    for (const method m : complex_methods) {
        test_image<complex_pixel<float>> narrow({67, 3});
        test_image<complex_pixel<double>> wide({67, 3});
        ASSERT_EQ(Arithmetic::combine(m, wrap, image_of(a), image_of(b), image_of(narrow)), outcome::done);
        ASSERT_EQ(Arithmetic::combine(m, wrap, image_of(a), image_of(b), image_of(wide)), outcome::done);
        expect_equal(narrow, [&](int x, int y) { return by_definition<float>(m, a.at(x, y), b.at(x, y)); });
        expect_equal(wide, [&](int x, int y) { return by_definition<double>(m, a.at(x, y), b.at(x, y)); });
    }
}

TEST(ComplexArithmetic, TakesNumbersRealAndComplex)
{
    const auto a = random_image<complex_pixel<float>>({300, 2}, memory_layout::inset, 1);
    for (const Arithmetic::number n : {Arithmetic::number{storage::f64, 0.1, -3.0}, {storage::u8, 7, 0}})
        for (const method m : complex_methods) {
            test_image<complex_pixel<float>> dst({300, 2});
            ASSERT_EQ(Arithmetic::combine(m, saturate, image_of(a), n, image_of(dst)), outcome::done);
            expect_equal(dst, [&](int x, int y) {
                return by_definition<float>(m, a.at(x, y), complex_pixel<double>{n.real, n.imaginary});
            });
        }
}

TEST(ComplexArithmetic, RefusesIntegersComparisonAndUnknownModes)
{
    const test_image<complex_pixel<float>> c({4, 3});
    const test_image<complex_pixel<double>> wide({4, 3});
    const test_image<uint8_t> u8({4, 3});
    const test_image<float> f32({4, 3});
    const auto images = [](method m, int rounding, auto& a, auto& b, auto& dst) {
        return Arithmetic::combine(m, rounding, image_of(a), image_of(b), image_of(dst));
    };
    EXPECT_EQ(images(method::add, 0, c, u8, c), outcome::unsupported);
    EXPECT_EQ(images(method::add, 0, u8, c, c), outcome::unsupported);
    EXPECT_EQ(images(method::add, 0, u8, c, u8), outcome::unsupported);
    EXPECT_EQ(images(method::add, 0, f32, c, f32), outcome::unsupported);
    EXPECT_EQ(images(method::min, 0, c, c, c), outcome::unsupported);
    EXPECT_EQ(images(method::max, wrap, c, f32, c), outcome::unsupported);
    EXPECT_EQ(Arithmetic::combine(method::min, wrap, image_of(c), {storage::u8, 1, 0}, image_of(c)),
              outcome::unsupported);
    EXPECT_EQ(images(method::add, 0, c, f32, c), outcome::unknown_rounding);
    EXPECT_EQ(images(method::add, 4, c, c, c), outcome::unknown_rounding);
    EXPECT_EQ(Arithmetic::check_number_form(image_of(c), image_of(wide)), outcome::unsupported);
    EXPECT_EQ(Arithmetic::check_number_form(image_of(f32), image_of(c)), outcome::unsupported);
}

template <class Colour, class Real>
void check_colour(pixel_type type)
{
    for (const method m : all_methods)
        for (const auto l : {memory_layout::packed, memory_layout::flipped, memory_layout::every_second}) {
            auto colours = random_image<Colour>({300, 2}, l, 1, values::extreme, type);
            auto reals = random_image<Real>({300, 2}, memory_layout::padded, 2, values::special);
            const auto byte_of = [&](int x, int y) {
                return static_cast<uint8_t>(truncated(static_cast<double>(reals.at(x, y))));
            };
            for (int y = 0; y < 2; ++y)
                for (int x = 0; x < 300; ++x) {
                    if (byte_of(x, y) == 0) reals.set(x, y, Real{3});
                    auto p = colours.at(x, y);
                    for (auto& c : p.channel) c = c == 0 ? 1 : c; // no zero divisors
                    colours.set(x, y, p);
                }
            const auto check = [&](const auto& a, const auto& b, bool colour_first) {
                const auto before = random_image<Colour>({300, 2}, rotated(l, 3), 3, values::plain, type);
                auto dst = before;
                ASSERT_EQ(Arithmetic::combine(m, saturate, image_of(a), image_of(b), image_of(dst)),
                          outcome::done);
                expect_equal(dst, [&](int x, int y) {
                    auto p = before.at(x, y);
                    for (int i = 0; i < 3; ++i) {
                        const plain_value c{storage::u8, colours.at(x, y).channel[i], 0};
                        const plain_value r{storage::u8, byte_of(x, y), 0};
                        const auto v = colour_first ? by_definition(m, false, c, r, storage::u8, 8)
                                                    : by_definition(m, false, r, c, storage::u8, 8);
                        p.channel[i] = static_cast<uint8_t>(v.whole);
                    }
                    return p;
                });
            };
            step("method " + std::to_string(static_cast<int>(m)), [&] {
                check(colours, reals, true);
                check(reals, colours, false);
            });
        }
}

TEST(ColourArithmetic, ActsOnThreeBytesAndWraps)
{
    check_colour<colour_24, float>(pixel_type::rgb);
    check_colour<colour_24, double>(pixel_type::bgr);
    check_colour<colour_32, float>(pixel_type::rgba);
}

TEST(ColourArithmetic, TakesNothingButFloat)
{
    const test_image<colour_24> rgb({4, 3});
    const test_image<colour_32> bgra({4, 3}, memory_layout::packed, pixel_type::bgra);
    const test_image<uint8_t> u8({4, 3});
    const test_image<float> f32({4, 3});
    const auto add = [](int rounding, auto& a, auto& b, auto& dst) {
        return Arithmetic::combine(method::add, rounding, image_of(a), image_of(b), image_of(dst));
    };
    EXPECT_EQ(add(0, rgb, u8, rgb), outcome::unsupported);
    EXPECT_EQ(add(wrap, rgb, rgb, rgb), outcome::unsupported);
    EXPECT_EQ(add(wrap, bgra, f32, bgra), outcome::unsupported);
    EXPECT_EQ(add(wrap, rgb, f32, f32), outcome::unsupported);
    EXPECT_EQ(add(0, rgb, f32, rgb), outcome::unknown_rounding);
    EXPECT_EQ(Arithmetic::check_number_form(image_of(rgb), image_of(rgb)), outcome::unsupported);
}

template <class Part>
void check_expansion(pixel_type even, pixel_type odd, pixel_type full)
{
    using P = complex_pixel<Part>;
    for (int width = 1; width <= 9; ++width)
        for (const int height : {1, 2, 3, 6})
            for_each_layout([&](memory_layout l) {
                const auto half =
                    random_image<P>({width / 2 + 1, height}, l, 1, values::extreme, width % 2 ? odd : even);
                const auto before = random_image<P>({width, height}, rotated(l, 3), 2, values::extreme, full);
                auto dst = before;
                ExpandHalfComplex(half.view(), dst.view());
                expect_equal(dst, [&](int x, int y) {
                    if (x <= width / 2) return half.at(x, y);
                    if (width - x >= width / 2) return before.at(x, y); // the column without a writer
                    const P p = half.at(width - x, (height - y) % height);
                    return P{p.real, -p.imaginary};
                });
            });
}

TEST(ExpandHalfComplex, MirrorsAllButOneColumnOfOddWidths)
{
    check_expansion<float>(pixel_type::half_even_32, pixel_type::half_odd_32, pixel_type::complex_32);
    check_expansion<double>(pixel_type::half_even_64, pixel_type::half_odd_64, pixel_type::complex_64);
}

TEST(ExpandHalfComplex, RefusesSizesThenTypes)
{
    using P = complex_pixel<float>;
    const auto of = [](size s, pixel_type t) { return test_image<P>(s, memory_layout::packed, t).view(); };
    const auto refuses = [&](size s, size d, pixel_type from, pixel_type to, const char* text) {
        expect_throws<std::invalid_argument>([&] { ExpandHalfComplex(of(s, from), of(d, to)); }, text);
    };
    constexpr auto half = pixel_type::half_odd_32, full = pixel_type::complex_32;
    for (const size d : {size{7, 2}, {10, 2}, {9, 3}})
        refuses({5, 2}, d, full, half, "ExpandHalfComplex: src and dst size mismatch");
    for (const auto& [from, to] : {std::pair{full, full},
                                   {half, half},
                                   {half, pixel_type::complex_64},
                                   {pixel_type::half_even_64, full},
                                   {pixel_type::float_32, full}})
        refuses({5, 2}, {9, 2}, from, to, "ExpandHalfComplex: unsupported pixel type");
    ExpandHalfComplex(of({1, 2}, pixel_type::half_even_32), of({0, 2}, full)); // nothing to write
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
