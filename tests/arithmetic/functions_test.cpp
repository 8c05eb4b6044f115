// Functions of a pixel: how far from the exact value, what special values give, and the same bits at every level.
#include "arithmetic/kernels/functions.h"
#include "support/cases.h"

#include <bit>
#include <functional>
#include <utility>

namespace Qor::Luxar::ZELT::Test {
namespace {

using Arithmetic::angle_function;

using function = std::function<void(const memory_2d&, const memory_2d&)>;

/// What is far better than T needs.
template <class T>
using better = std::conditional_t<std::is_same_v<T, float>, double, long double>;

template <class T>
struct known_function {
    std::string name;
    function map;
    std::function<better<T>(T)> exact;
    double units = 1; ///< how far from it results may be, in units in the last place
};

/// Single precision that is computed in double precision keeps to this.
constexpr double close = 0.6;

function mapped(angle_function f)
{
    return [f](const memory_2d& src, const memory_2d& dst) { Arithmetic::map(f, src, dst); };
}
template <class T>
known_function<T> power_function(double exponent)
{
    const T y = static_cast<T>(exponent);
    return {"power " + std::to_string(exponent),
            [exponent](const memory_2d& src, const memory_2d& dst) { Arithmetic::power(src, exponent, dst); },
            [y](T x) { return std::pow(better<T>{x}, better<T>{y}); }, std::is_same_v<T, float> ? close : 1};
}

const std::vector<known_function<float>> functions_of_angles = {
    {"sine", mapped(angle_function::sine), [](float x) { return std::sin(double{x}); }},
    {"cosine", mapped(angle_function::cosine), [](float x) { return std::cos(double{x}); }},
    {"tangent", mapped(angle_function::tangent), [](float x) { return std::tan(double{x}); }, close},
    {"arc sine", mapped(angle_function::arc_sine), [](float x) { return std::asin(double{x}); }},
    {"arc cosine", mapped(angle_function::arc_cosine), [](float x) { return std::acos(double{x}); }},
    {"arc tangent", mapped(angle_function::arc_tangent), [](float x) { return std::atan(double{x}); }, close},
};

constexpr double exponents[] = {2.2,  -2.2, 1 / 2.2, 0.5,  2,    3,        -3,     1,         -1,       1e-3,
                                -7.5, 40,   41,      1e30, -1e9, 16777215, 0x1p60, 0x1.8p-60, 1.0000001};
constexpr double unusual_exponents[] = {0, -0.0, INFINITY, -INFINITY, NAN};

template <class T>
std::vector<known_function<T>> functions_of_basic2()
{
    std::vector<known_function<T>> all = {
        {"exponential", Arithmetic::exponential, [](T x) { return std::exp(better<T>{x}); }},
        {"logarithm", Arithmetic::logarithm, [](T x) { return std::log(better<T>{x}); }}};
    for (const double y : exponents) all.push_back(power_function<T>(y));
    for (const double y : unusual_exponents) all.push_back(power_function<T>(y));
    return all;
}

template <class T>
test_image<T> row_of(const std::vector<T>& values)
{
    test_image<T> row({static_cast<int32_t>(values.size()), 1});
    row.fill([&](int x, int) { return values[static_cast<size_t>(x)]; });
    return row;
}

template <class T>
std::vector<T> special_values()
{
    using limits = std::numeric_limits<T>;
    std::vector<T> values;
    for (const T v : {T{0},
                      limits::denorm_min(),
                      limits::min() / 3,
                      limits::min(),
                      T(1e-5),
                      T(0.25),
                      T(0.5),
                      T(1),
                      std::nextafter(T(1), T(2)),
                      T(1.5),
                      T(2),
                      T(3),
                      T(88.7),
                      T(88.8),
                      T(103.9),
                      T(709.7),
                      T(745.2),
                      T(4194304),
                      T(4194305),
                      T(8e9),
                      limits::max(),
                      limits::infinity(),
                      limits::quiet_NaN(),
                      T(M_PI_4),
                      T(M_PI_2),
                      T(M_PI),
                      T(1e22)}) {
        values.push_back(v);
        values.push_back(-v);
    }
    return values;
}

/// Every n-th number of a type, in the order of its bits: first the positive ones, then the negative ones.
template <class T>
std::vector<T> sweep(uint64_t step)
{
    using word = std::conditional_t<sizeof(T) == 4, uint32_t, uint64_t>;
    std::vector<T> values = special_values<T>();
    word bits = 0;
    do values.push_back(std::bit_cast<T>(bits));
    while (!__builtin_add_overflow(bits, static_cast<word>(step), &bits));
    return values;
}

/// The distance between neighbours at a value of T.
template <class T>
better<T> unit_at(better<T> v)
{
    using limits = std::numeric_limits<T>;
    const int exponent = v == 0 ? limits::min_exponent : std::ilogb(v) + 1;
    return std::ldexp(better<T>{1}, std::max(exponent, limits::min_exponent) - limits::digits);
}

template <class T>
bool is_near(T got, better<T> exact, double units)
{
    const T rounded = static_cast<T>(exact);
    if (std::isnan(exact)) return std::isnan(got);
    if (std::isinf(rounded)) return got == rounded;
    if (exact == 0) return got == 0 && std::signbit(got) == std::signbit(exact);
    return std::abs(got - exact) <= static_cast<better<T>>(units) * unit_at<T>(exact);
}

/// Runs a function at each level; the results are those of the first, bit for bit.
template <class T>
test_image<T> same_at_each_level(const known_function<T>& f, const test_image<T>& in)
{
    std::optional<test_image<T>> first;
    for_each_level([&](level) {
        test_image<T> out(in.extent());
        f.map(in.view(), out.view());
        if (first)
            expect_equal(out, std::as_const(*first));
        else
            first = out;
    });
    return first ? *first : in; // after many failures no level runs
}

template <class T>
void expect_exact_enough(const known_function<T>& f, const std::vector<T>& values)
{
    step(f.name, [&] {
        const auto in = row_of(values);
        const auto out = same_at_each_level(f, in);
        for (int x = 0; x < in.width() && !enough_failures(); ++x) {
            const T v = in.at(x, 0);
            const better<T> exact = f.exact(v);
            EXPECT_TRUE(is_near(out.at(x, 0), exact, f.units))
                << show(v) << " gave " << show(out.at(x, 0)) << " for " << show(static_cast<T>(exact));
        }
    });
}

TEST(Functions, SinglePrecisionIsWithinAUnit)
{
    const auto values = sweep<float>(79999);
    for (const auto& f : functions_of_angles) expect_exact_enough(f, values);
    for (const auto& f : functions_of_basic2<float>()) expect_exact_enough(f, values);
}

TEST(Functions, AnglesNearMultiplesOfAQuarterTurnKeepTheirDigits)
{
    std::vector<float> values;
    for (int64_t n = 1; n < (int64_t{1} << 40); n += 1 + n / 50) {
        const auto near = static_cast<float>(static_cast<double>(n) * M_PI_2);
        for (const float v : {near, std::nextafter(near, 0.0f), std::nextafter(near, 1e30f)})
            values.push_back(v);
    }
    for (const float v : {0x1.f9cbe2p+7f, 0x1.f9cbe2p+8f})
        values.push_back(v); // the nearest below 2^22: 2^-27.8
    for (const auto& f : functions_of_angles) expect_exact_enough(f, values);
}

TEST(Functions, DoublePrecisionIsWithinAUnit)
{
    const auto values = sweep<double>(0x3234567890abd);
    for (const auto& f : functions_of_basic2<double>()) expect_exact_enough(f, values);
}

TEST(Functions, DoublesOfAUsualSizeAreWithinAUnit)
{
    generator random(5);
    std::vector<double> values;
    for (int i = 0; i < 3000; ++i) values.push_back(random_value<double>(random, values::plain) / 3);
    for (const auto& f : functions_of_basic2<double>()) expect_exact_enough(f, values);
}

TEST(Functions, DirectionsAreWithinSixTenthsOfAUnit)
{
    std::vector<float> y, x;
    for (const float a : special_values<float>())
        for (const float b : special_values<float>()) y.push_back(a), x.push_back(b);
    generator random(3);
    for (int i = 0; i < 60000; ++i) { // points of any size, and some near the diagonals and the axes
        y.push_back(std::bit_cast<float>(static_cast<uint32_t>(random())));
        x.push_back(i % 2 ? std::bit_cast<float>(static_cast<uint32_t>(random()))
                          : y.back() * random_value<float>(random, values::plain));
    }
    const auto ys = row_of(y), xs = row_of(x);
    const known_function<float> f{
        "direction",
        [&](const memory_2d& a, const memory_2d& dst) { Arithmetic::arc_tangent_2(a, xs.view(), dst); },
        {}};
    const auto out = same_at_each_level(f, ys);
    for (int i = 0; i < ys.width() && !enough_failures(); ++i)
        EXPECT_TRUE(is_near(out.at(i, 0),
                            std::atan2(double{y[static_cast<size_t>(i)]}, double{x[static_cast<size_t>(i)]}),
                            close))
            << show(ys.at(i, 0)) << ", " << show(xs.at(i, 0)) << " gave " << show(out.at(i, 0));
}

/// Puts special values among others, which have quicker forms of the functions where they are alone.
template <class T>
void expect_special_values_change_no_others(const std::vector<known_function<T>>& functions,
                                            uint64_t step_of_bits)
{
    auto values = sweep<T>(step_of_bits);
    const auto plain = row_of(values);
    for (size_t i = 5; i < values.size(); i += 97) values[i] = special_values<T>()[i % 50];
    const auto mixed = row_of(values);
    for (const auto& f : functions)
        step(f.name, [&] {
            const auto before = same_at_each_level(f, plain), after = same_at_each_level(f, mixed);
            expect_equal(after, [&](int x, int y) {
                return same_bits(plain.at(x, y), mixed.at(x, y)) ? before.at(x, y) : after.at(x, y);
            });
        });
}

TEST(Functions, ASpecialValueChangesNoOtherPixel)
{
    auto all = functions_of_angles;
    for (const auto& f : functions_of_basic2<float>()) all.push_back(f);
    expect_special_values_change_no_others(all, 1000003);
    expect_special_values_change_no_others(functions_of_basic2<double>(), 0x3234567890abcd);
}

TEST(Functions, PowersOfWholeNumbersAreExact)
{
    const auto in = row_of<float>({-3, -2, -1, 1, 2, 3, 10});
    for (const int n : {1, 2, 3, 4, 7}) {
        test_image<float> out(in.extent());
        Arithmetic::power(in.view(), n, out.view());
        expect_equal(out, [&](int x, int) { return static_cast<float>(std::pow(double{in.at(x, 0)}, n)); });
    }
}

/// The same function of the packed floats that the pixels are converted to.
template <class T>
test_image<float> of_packed_floats(const function& f, const test_image<T>& in)
{
    const forced_level plain(level::v1);
    test_image<float> floats(in.extent()), out(in.extent());
    floats.fill([&](int x, int y) { return static_cast<float>(in.at(x, y)); });
    f(floats.view(), out.view());
    return out;
}

TEST(Functions, AnyTypeAndLayoutGivesTheBitsOfItsFloats)
{
    const auto f = mapped(angle_function::sine);
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(
        values::special, [&]<class T>(const test_case<T>& c) {
            const level in_use = current_level();
            const auto expected = of_packed_floats(f, c.input);
            force_level(in_use);
            expect_equal(c.template run<float>(f), expected);
            if constexpr (std::is_same_v<T, float>) {
                const auto in_place = c.run_in_place([&](memory_2d image) { f(image, image); });
                expect_equal(in_place, expected);
            }
        });
}

TEST(Functions, AnyLayoutOfTwoImagesAndOfDoublesGivesTheSameBits)
{
    for_each_case<float>(values::special, [](const test_case<float>& c) {
        const auto& y = c.input;
        const auto x = random_image<float>(y.extent(), rotated(c.output_layout, 3), 9, values::special);
        const auto out =
            c.run([&](memory_2d src, memory_2d dst) { Arithmetic::arc_tangent_2(src, x.view(), dst); });
        expect_equal(out, [&](int i, int j) {
            const auto a = row_of<float>({y.at(i, j)}), b = row_of<float>({x.at(i, j)});
            test_image<float> one({1, 1});
            Arithmetic::arc_tangent_2(a.view(), b.view(), one.view());
            return one.at(0, 0);
        });
    });
    for_each_case<double>(values::special, [](const test_case<double>& c) {
        const auto f = [](memory_2d src, memory_2d dst) { Arithmetic::power(src, -1.7, dst); };
        const auto out = c.run(f);
        const auto in_place = c.run_in_place([&](memory_2d image) { f(image, image); });
        expect_equal(in_place, out);
        expect_equal(out, [&](int x, int y) {
            const auto in = row_of<double>({c.input.at(x, y)});
            test_image<double> one({1, 1});
            f(in.view(), one.view());
            return one.at(0, 0);
        });
    });
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
