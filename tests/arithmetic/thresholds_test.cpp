// Thresholds, normalisation and absolute values of views, held against their definitions.
#include "arithmetic/kernels/thresholds.h"

#include "support/cases.h"

#include <array>

namespace Qor::Luxar::ZELT::Test {
namespace {

using Arithmetic::threshold_limits;

template <class T>
constexpr bool is_real = std::is_floating_point_v<T>;
template <class T>
constexpr bool is_narrow = !is_real<T> && sizeof(T) < 4;
template <class T>
using limits_of = std::numeric_limits<T>;

template <class T>
double lowest_of()
{
    return static_cast<double>(limits_of<T>::lowest());
}
template <class T>
double highest_of()
{
    return static_cast<double>(limits_of<T>::max());
}

template <class T>
T threshold_by_definition(T p, threshold_limits l)
{
    if (p < static_cast<T>(l.low_limit)) return static_cast<T>(l.low_value);
    if (p > static_cast<T>(l.high_limit)) return static_cast<T>(l.high_value);
    return p;
}

template <class T>
struct least_and_greatest {
    T least = is_real<T> ? limits_of<T>::infinity() : limits_of<T>::max();
    T greatest = is_real<T> ? -limits_of<T>::infinity() : limits_of<T>::lowest();

    explicit least_and_greatest(const test_image<T>& i)
    {
        for (int y = 0; y < i.height(); ++y)
            for (int x = 0; x < i.width(); ++x) {
                if (i.at(x, y) < least) least = i.at(x, y);
                if (i.at(x, y) > greatest) greatest = i.at(x, y);
            }
    }
};

/// Truncated and limited to 0 .. n - 1; NaN is 0.
int bin_within(double bin, int n) { return std::isnan(bin) || bin < 0 ? 0 : bin < n ? int(bin) : n - 1; }

template <class T, class Bin>
std::vector<double> histogram_of(const test_image<T>& i, int n, Bin&& bin)
{
    std::vector<double> h(static_cast<size_t>(n));
    for (int y = 0; y < i.height(); ++y)
        for (int x = 0; x < i.width(); ++x) ++h[static_cast<size_t>(bin(i.at(x, y)))];
    return h;
}

/// A difference in the pixel's own arithmetic, where 32 bits wrap.
template <class T>
double own_difference(T a, T b)
{
    if constexpr (is_real<T> || is_narrow<T>)
        return a - b;
    else
        return static_cast<T>(int64_t{a} - int64_t{b});
}

double mean_of(const std::vector<double>& h, int from, int to, double former)
{
    double weight = 0, sum = 0;
    for (int i = from; i < to; ++i) {
        weight += h[static_cast<size_t>(i)];
        sum += h[static_cast<size_t>(i)] * i;
    }
    return weight > 0 ? sum / weight : former;
}

template <class T>
double limit_by_definition(const test_image<T>& image)
{
    const least_and_greatest<T> e(image);
    const double range = own_difference(e.greatest, e.least);
    const bool many = range >= 65536;
    const int64_t bins = many ? 65537 : std::isfinite(range) ? static_cast<int64_t>(range) + 1 : 0;
    double scale = 1;
    int n = static_cast<int>(bins);
    const bool spans_type = is_narrow<T> && !std::is_same_v<T, uint8_t> &&
                            range >= static_cast<double>(highest_of<T>() - lowest_of<T>());
    if (many)
        scale = 0, n = 65536; // a whole quotient of 65536 and more
    else if (range < 127 || std::isnan(range) || spans_type) {
        scale = sizeof(T) == 1 ? static_cast<double>(128 / bins) : 128.0 / static_cast<double>(bins);
        n = 128;
    }
    const auto h =
        histogram_of(image, n, [&](T p) { return bin_within(own_difference(p, e.least) * scale, n); });
    int first = 0, last = n - 1;
    while (h[static_cast<size_t>(first)] == 0) ++first;
    while (h[static_cast<size_t>(last)] == 0) --last;
    double m1 = first, m2 = last, t = (first + last) * 0.5;
    for (;;) {
        m1 = mean_of(h, first, int(t), m1);
        m2 = mean_of(h, int(t), last + 1, m2);
        const double next = (m1 + m2) * 0.5;
        const bool moved = std::fabs(t - next) > 0.1;
        t = next;
        if (!moved) break;
    }
    if constexpr (is_real<T>) return static_cast<double>(static_cast<T>(t));
    return static_cast<double>(static_cast<T>(static_cast<int64_t>(t)));
}

/// What normalisation does to a pixel.
template <class T>
struct normalize_by_definition {
    double offset = 0, factor = 1;

    normalize_by_definition(const test_image<T>& image, double low, double high)
    {
        const least_and_greatest<T> e(image);
        double minimum = lowest_of<T>(), scale = 1;
        int n = 1 << (8 * sizeof(T) & 31); // 256 or 65536
        if constexpr (!is_narrow<T>) {
            minimum = static_cast<double>(e.least);
            const double range = static_cast<double>(e.greatest) - minimum;
            const bool many = range + 1 >= 65537;
            n = many ? 65536 : std::isnan(range) ? 0 : static_cast<int>(std::max(range + 1, 0.0));
            if (many) scale = 65536.0 / (range + 1);
            if (is_real<T> && n < 1024) n = 1024, scale = 1023 / range;
        }
        const auto h = histogram_of(
            image, n, [&](T p) { return bin_within((static_cast<double>(p) - minimum) * scale, n); });

        const double pixels = double(image.width()) * image.height();
        const double a = std::floor(pixels * low), b = std::ceil(pixels * high);
        double sum = 0;
        int lo = 0;
        for (; lo < n; ++lo)
            if ((sum += h[static_cast<size_t>(lo)]) > a) break;
        int hi = lo;
        while (sum < b && hi + 1 < n) sum += h[static_cast<size_t>(++hi)];
        if (!(hi > lo && (lo != 0 || hi < n))) return;

        if constexpr (is_narrow<T>) {
            offset = lo + lowest_of<T>();
            factor = (highest_of<T>() - lowest_of<T>()) / (hi - lo);
        } else if constexpr (!is_real<T>) {
            const auto from = int64_t(minimum) + int64_t(lo / scale);
            const auto to = int64_t(minimum) + int64_t(hi / scale);
            offset = static_cast<double>(from);
            factor = static_cast<double>(4294967295u / static_cast<uint32_t>(to - from));
        } else {
            offset = minimum + lo / scale;
            factor = 1 / ((minimum + hi / scale) - offset);
        }
    }

    T operator()(T p) const
    {
        const double v = (static_cast<double>(p) - offset) * factor;
        if constexpr (is_real<T>)
            return static_cast<T>(v + static_cast<double>(limits_of<T>::min()));
        else
            return static_cast<T>(std::clamp(v + lowest_of<T>(), lowest_of<T>(), highest_of<T>()));
    }
};

/// Images whose values span so much, each in another layout: few pixels, and enough for real histograms.
/// A negative span: two values and nothing between.
template <class... Types, class Body>
void for_each_span(Body&& body)
{
    const auto images_of = [&]<class T>(pixel<T>) {
        std::vector<double> spans{0, 1, 10, 126, 127, 130, 200, 255, -40};
        if (sizeof(T) > 1) spans.insert(spans.end(), {1000, 4095, 65534, 65535});
        if (sizeof(T) > 2)
            spans.insert(spans.end(), {65536, 1e5, 2147483647, 2147483648, 4294967294, 4294967295});
        if (is_real<T>) spans.insert(spans.end(), {0.3, 126.6, 1e-30, 65535.5, 1e30, -1e30});
        int turn = 0;
        for (const double span : spans)
            for (const size s : {size{20, 19}, size{80, 67}}) {
                const memory_layout l = rotated(memory_layout::packed, turn++);
                test_image<T> image(s, l);
                generator random(7);
                const double width = std::fabs(span);
                const double start = std::is_unsigned_v<T>
                                         ? std::min(30.0, highest_of<T>() - width)
                                         : std::clamp(-width / 3, lowest_of<T>(), highest_of<T>() - width);
                image.fill([&](int x, int y) {
                    double u = std::ldexp(static_cast<double>(random() >> 11), -53);
                    u *= u; // more dark than bright
                    if (span < 0) u = u < 0.3 ? 0 : 1;
                    if (y == 0 && x < 2) u = x;
                    const double v = u * width;
                    return static_cast<T>(start + (is_real<T> ? v : std::floor(v)));
                });
                step("span " + std::to_string(span) + ", size " + name(s) + ", " + name(l), [&] {
                    body(image);
                    if constexpr (is_real<T>) {
                        image.set(3, 0, limits_of<T>::quiet_NaN());
                        body(image);
                    }
                });
            }
        if constexpr (is_real<T>)
            for (const std::array<T, 3>& values :
                 {std::array<T, 3>{limits_of<T>::quiet_NaN(), limits_of<T>::quiet_NaN(), T(NAN)},
                  {limits_of<T>::infinity(), limits_of<T>::infinity(), limits_of<T>::infinity()},
                  {-limits_of<T>::infinity(), 1, limits_of<T>::infinity()},
                  {limits_of<T>::lowest(), 2, limits_of<T>::max()},
                  {0, limits_of<T>::denorm_min(), limits_of<T>::denorm_min() * 3},
                  {T{-0.0}, 0, limits_of<T>::quiet_NaN()}}) {
                test_image<T> image({5, 3});
                image.fill([&](int x, int y) { return values[static_cast<size_t>(x + y) % 3]; });
                step("special values from " + show(values[0]), [&] { body(image); });
            }
    };
    (images_of(pixel<Types>{}), ...);
}

TEST(Threshold, EqualsItsDefinition)
{
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(
        values::special, []<class T>(const test_case<T>& c) {
            const double low = lowest_of<T>(), high = highest_of<T>(), nan = limits_of<double>::quiet_NaN();
            std::vector<threshold_limits> all{{40, 7, 90, 99},          {90, 7, 40, 99},   {50, 0, 50, 1},
                                              {low, high, high, low},   {high, 1, low, 2}, {20, 100, 101, 30},
                                              {low + 1, 5, high - 1, 6}};
            if (is_real<T>) all.insert(all.end(), {{nan, 1, 5, 2}, {5, 1, nan, 2}, {-0.0, nan, 0.0, -0.0}});
            for (const auto& l : all) {
                const auto expected = [&](int x, int y) {
                    return threshold_by_definition(c.input.at(x, y), l);
                };
                expect_equal(c.run([&](auto src, auto dst) { Arithmetic::threshold(src, l, dst); }),
                             expected);
                expect_equal(c.run_in_place([&](auto i) { Arithmetic::threshold(i, l, i); }), expected);
            }
        });
}

TEST(Abs, EqualsItsDefinitionAndWraps)
{
    for_each_case<int8_t, int16_t, int32_t, float, double>(
        values::special, []<class T>(const test_case<T>& c) {
            const auto expected = [&](int x, int y) {
                const T p = c.input.at(x, y);
                if constexpr (is_real<T>)
                    return std::fabs(p);
                else
                    return static_cast<T>(p < 0 ? -int64_t{p} : int64_t{p});
            };
            expect_equal(c.run([](auto src, auto dst) { Arithmetic::absolute(src, dst); }), expected);
            expect_equal(c.run_in_place([](auto i) { Arithmetic::absolute(i, i); }), expected);
        });
}

TEST(AutoThreshold, FindsTheLimitOfItsDefinition)
{
    for_each_span<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(
        []<class T>(const test_image<T>& image) {
            const double expected = limit_by_definition(image);
            for_each_level([&](level) { EXPECT_EQ(Arithmetic::find_threshold(image.view()), expected); });
        });
}

TEST(Normalize, EqualsItsDefinition)
{
    const double nan = std::nan("");
    const std::pair<double, double> fractions[] = {{0, 1},   {0.01, 0.99}, {0.25, 0.5}, {0, 0.7},
                                                   {0.3, 1}, {0.9, 0.1},   {1, 1},      {0, 0},
                                                   {nan, 1}, {0, nan},     {7, 1},      {0, -3}};
    for_each_span<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(
        [&]<class T>(const test_image<T>& image) {
            for (const auto& [low, high] : fractions) {
                if (image.width() == 80 && low != 0.01 && high != 0.7) continue; // once each way is enough
                const normalize_by_definition<T> f(image, low, high);
                const auto expected = [&](int x, int y) { return f(image.at(x, y)); };
                for_each_level([&](level) {
                    const ::testing::ScopedTrace trace(__FILE__, __LINE__, show(low) + " to " + show(high));
                    test_image<T> out(image.extent(), memory_layout::inset), in_place = image;
                    Arithmetic::normalize(image.view(), low, high, out.view());
                    expect_equal(out, expected);
                    Arithmetic::normalize(in_place.view(), low, high, in_place.view());
                    expect_equal(in_place, expected);
                });
            }
        });
}

TEST(AutoThresholdAndNormalize, CountBigSixteenBitImagesByValue)
{
    const auto check = [&]<class T>(pixel<T>, int values) {
        test_image<T> image({1031, 1021}, memory_layout::padded), out(image.extent());
        generator random(3);
        image.fill([&](int, int) {
            return static_cast<T>(lowest_of<T>() + 100 + double(random() % uint64_t(values)));
        });
        EXPECT_EQ(Arithmetic::find_threshold(image.view()), limit_by_definition(image));
        Arithmetic::normalize(image.view(), 0.1, 0.8, out.view());
        const normalize_by_definition<T> f(image, 0.1, 0.8);
        expect_equal(out, [&](int x, int y) { return f(image.at(x, y)); });
    };
    for (const int values : {60, 4096, 65436}) {
        check(pixel<uint16_t>{}, values);
        check(pixel<int16_t>{}, values);
    }
}

TEST(ThresholdsAndNormalization, LeaveEmptyImagesAlone)
{
    for_each_case<uint8_t, int32_t, float>([]<class T>(const test_case<T>& c) {
        if (c.input.width() * c.input.height() > 0) return;
        c.run([](auto src, auto dst) {
            Arithmetic::find_threshold(src);
            Arithmetic::normalize(src, 0.1, 0.9, dst);
        });
    });
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
