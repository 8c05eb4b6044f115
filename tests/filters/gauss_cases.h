// The Gaussian family as its definition says it, a number at a time.
#pragma once

#include "filter_cases.h"
#include "filters/kernels/gauss_design.h"

namespace Qor::Luxar::ZELT::Test {

/// One channel of an image, or what has become of it.
struct plane {
    int width, height;
    std::vector<double> values;

    double& operator()(int x, int y) { return values[static_cast<size_t>(y * width + x)]; }
    double clamped(int x, int y) const
    {
        return values[static_cast<size_t>(std::clamp(y, 0, height - 1) * width +
                                          std::clamp(x, 0, width - 1))];
    }
};

template <class T>
plane plane_of(const test_image<T>& image, [[maybe_unused]] size_t channel)
{
    plane p{image.width(), image.height(), {}};
    for (int y = 0; y < p.height; ++y)
        for (int x = 0; x < p.width; ++x) {
            if constexpr (std::is_same_v<T, colour_24>)
                p.values.push_back(image.at(x, y).channel[channel]);
            else
                p.values.push_back(static_cast<double>(image.at(x, y)));
        }
    return p;
}

/// What keeps the results of a pass: double for double images, else float.
template <class T>
using kept = std::conditional_t<std::is_same_v<T, double>, double, float>;

/// Forward and backward along one line, whose n-th number is line(n). Only the way back may keep unrounded results.
template <class Kept, class Line>
void recur(const Filters::recursion& f, int count, bool round_the_way_back, Line&& line)
{
    if (count == 0) return;
    double y1 = line(0), y2 = y1, y3 = y1;
    const auto pass = [&](int n, bool round) {
        const double y = f.b * line(n) + f.a1 * y1 + f.a2 * y2 + f.a3 * y3;
        y3 = y2;
        y2 = y1;
        y1 = y;
        line(n) = round ? static_cast<Kept>(y) : y;
    };
    for (int n = 0; n < count; ++n) pass(n, true);
    y2 = y3 = y1;
    for (int n = count - 1; n >= 0; --n) pass(n, round_the_way_back);
}

/// The last pass is not rounded.
template <class Kept>
plane smoothed(plane p, const Filters::recursion& f)
{
    for (int y = 0; y < p.height; ++y)
        recur<Kept>(f, p.width, true, [&](int x) -> double& { return p(x, y); });
    for (int x = 0; x < p.width; ++x)
        recur<Kept>(f, p.height, false, [&](int y) -> double& { return p(x, y); });
    return p;
}
/// Rounded to what a scratch keeps.
template <class Kept>
plane rounded(plane p)
{
    for (double& v : p.values) v = static_cast<Kept>(v);
    return p;
}

/// Toward zero, low bits kept; 0 for what 64 bits cannot hold.
template <class T>
T cut(double v)
{
    if constexpr (std::is_integral_v<T>)
        return std::abs(v) < 0x1p63 ? static_cast<T>(static_cast<int64_t>(v)) : T{0};
    else
        return static_cast<T>(v);
}
/// Expects each channel of an image to be what `expected` makes of that channel of the input.
template <class T, class Expected, class Convert>
void expect_channels(const test_image<T>& out, const test_image<T>& in, Expected&& expected,
                     Convert&& convert)
{
    std::vector<plane> planes;
    for (size_t c = 0; c < (std::is_same_v<T, colour_24> ? 3 : 1); ++c)
        planes.push_back(expected(plane_of(in, c)));
    expect_equal(out, [&](int x, int y) {
        if constexpr (std::is_same_v<T, colour_24>) {
            T pixel;
            for (size_t c = 0; c < 3; ++c) pixel.channel[c] = saturated<uint8_t>(planes[c](x, y));
            return pixel;
        } else {
            return convert(planes[0](x, y));
        }
    });
}

/// A sigma for the case at hand: the same at all levels, another at the next input.
inline double next_sigma(const void* input)
{
    static const void* previous = nullptr;
    static size_t turn = 0;
    constexpr double sigmas[] = {0.5, 2, 0.6, 2.5, 7, 2.499, 1, 50, 1e4, 1.7};
    if (std::exchange(previous, input) != input) ++turn;
    return sigmas[turn % std::size(sigmas)];
}

} // namespace Qor::Luxar::ZELT::Test
