#include "conversions/regions.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <limits>
#include <optional>
#include <random>

namespace Qor::Luxar::ZELT::Test {
namespace {

constexpr int32_t lowest = std::numeric_limits<int32_t>::min();
constexpr int32_t highest = std::numeric_limits<int32_t>::max();

image_layout layout(int32_t width, int32_t height) { return {width, height, 8, PixmatEncoding_Unsigned}; }

conversion_regions regions(size source, size target, std::optional<rectangle> area,
                           std::optional<coordinate<int32_t>> point)
{
    return compute_regions(layout(source.width, source.height), layout(target.width, target.height),
                           area ? &*area : nullptr, point ? &*point : nullptr);
}

void expect(const conversion_regions& got, rectangle source, coordinate<int32_t> point, rectangle target)
{
    EXPECT_EQ(got.source, source) << got.source.left << ' ' << got.source.top << ' ' << got.source.right
                                  << ' ' << got.source.bottom;
    EXPECT_EQ(got.target_point, point) << got.target_point.x << ' ' << got.target_point.y;
    EXPECT_EQ(got.target, target) << got.target.left << ' ' << got.target.top << ' ' << got.target.right
                                  << ' ' << got.target.bottom;
}

TEST(Regions, AreTheWholeSourceWithoutAreaAndPoint)
{
    expect(regions({8, 6}, {4, 3}, {}, {}), {0, 0, 8, 6}, {0, 0}, {0, 0, 8, 6});
}

TEST(Regions, AreNotClippedWithoutPoint)
{
    expect(regions({8, 6}, {4, 3}, rectangle{-2, 1, 9, 20}, {}), {-2, 1, 9, 20}, {0, 0}, {0, 0, 11, 19});
}

TEST(Regions, AreClippedToTheTargetWithAPoint)
{
    expect(regions({8, 6}, {4, 3}, {}, {{0, 0}}), {0, 0, 4, 3}, {0, 0}, {0, 0, 4, 3});
    expect(regions({8, 6}, {10, 9}, rectangle{2, 1, 7, 5}, {{6, 6}}), {2, 1, 6, 4}, {6, 6}, {6, 6, 10, 9});
}

TEST(Regions, NegativePointReplacesTheFirstEdge)
{
    expect(regions({30, 9}, {50, 50}, rectangle{10, 2, 20, 7}, {{-3, 0}}), {3, 2, 20, 7}, {0, 0},
           {0, 0, 17, 5});
    expect(regions({30, 9}, {50, 50}, rectangle{10, 2, 20, 7}, {{1, -4}}), {10, 4, 20, 7}, {1, 0},
           {1, 0, 11, 3});
}

TEST(Regions, PointBeyondTheTargetLeavesNothing)
{
    const auto r = regions({8, 6}, {4, 3}, {}, {{5, 1}});
    EXPECT_EQ(r.target, (rectangle{5, 1, 4, 3}));
    EXPECT_EQ(r.source.right - r.source.left, -1);
}

/// The rules as they are told, in numbers that cannot overflow; then limited to 32 bits.
conversion_regions by_definition(size source, size target, std::optional<rectangle> area,
                                 std::optional<coordinate<int32_t>> point)
{
    const rectangle given = area.value_or(rectangle{0, 0, source.width, source.height});
    int64_t left = given.left, top = given.top, right = given.right, bottom = given.bottom, px = 0, py = 0;
    if (point) {
        px = point->x;
        py = point->y;
        if (px < 0) left = -px, px = 0;
        if (py < 0) top = -py, py = 0;
        right = left + std::min(target.width - px, right - left);
        bottom = top + std::min(target.height - py, bottom - top);
    }
    const auto narrow = [](int64_t v) {
        return static_cast<int32_t>(std::clamp<int64_t>(v, lowest, highest));
    };
    return {{narrow(left), narrow(top), narrow(right), narrow(bottom)},
            {narrow(px), narrow(py)},
            {narrow(px), narrow(py), narrow(px + right - left), narrow(py + bottom - top)}};
}

TEST(Regions, FollowTheDefinitionForAnyNumbers)
{
    constexpr unsigned seed = 31;
    std::mt19937 random(seed);
    const int32_t edges[] = {lowest, lowest + 1, -7, -1, 0, 1, 5, 8, 9, highest - 1, highest};
    const auto any = [&] { return edges[random() % std::size(edges)]; };
    const auto length = [&] { return std::max(any(), 0); };
    for (int i = 0; i < 20000 && !::testing::Test::HasFailure(); ++i) {
        SCOPED_TRACE("seed " + std::to_string(seed) + ", case " + std::to_string(i));
        const size source{length(), length()}, target{length(), length()};
        std::optional<rectangle> area; // swapped ones among them
        std::optional<coordinate<int32_t>> point;
        if (random() % 4) area = rectangle{any(), any(), any(), any()};
        if (random() % 4) point = {any(), any()};
        const auto want = by_definition(source, target, area, point);
        const auto got = regions(source, target, area, point);
        expect(got, want.source, want.target_point, want.target);
        if (!point) continue;
        // What is left after clipping never reaches beyond the target.
        if (got.target.right > got.target.left) {
            EXPECT_LE(got.target.right, target.width);
        }
        EXPECT_GE(got.target.left, 0);
        EXPECT_GE(got.target.top, 0);
    }
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
