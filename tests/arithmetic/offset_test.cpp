// Images added at a position against the definition, a pixel at a time; and all of compositing in shared memory.
#include "arithmetic/kernels/offset.h"

#include "arithmetic/kernels/blend.h"
#include "arithmetic/kernels/padding.h"
#include "arithmetic/kernels/plane.h"
#include "arithmetic_cases.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

using Arithmetic::image;
constexpr double infinity = std::numeric_limits<double>::infinity();
constexpr double not_a_number = std::numeric_limits<double>::quiet_NaN();

/// A double as it is stored: cut toward zero, or rounded to the width of a Float.
plain_value stored(storage type, double v) { return {type, truncated(v), v}; }

double real_at(const real_image& i, int64_t x, int64_t y)
{
    const plain_value v = i.at(static_cast<int>(x), static_cast<int>(y));
    return is_integer(v.type) ? static_cast<double>(v.whole) : v.real;
}

real_image filled(storage type, size s, memory_layout l, uint64_t seed)
{
    real_image i(type, s, l);
    i.fill(seed);
    return i;
}

/// What AddOffset leaves at (x, y): neighbours without weight do not count, untouched pixels stay.
plain_value offset_by_definition(const real_image& a, const real_image& b, size b_size,
                                 coordinate<double> position, double fa, double fb, int x, int y)
{
    const double fx = position.x - std::floor(position.x), fy = position.y - std::floor(position.y);
    double sum = 0;
    bool touched = false;
    for (const auto& [dx, dy] : {std::pair{0, 0}, {1, 0}, {0, 1}, {1, 1}}) {
        const double weight = (dx ? fx : 1 - fx) * (dy ? fy : 1 - fy);
        const double u = x - std::floor(position.x) - dx, v = y - std::floor(position.y) - dy;
        if (!(u >= 0 && u < b_size.width && v >= 0 && v < b_size.height) || weight == 0) continue;
        const double term = weight * real_at(b, static_cast<int64_t>(u), static_cast<int64_t>(v));
        sum = touched ? sum + term : term;
        touched = true;
    }
    return touched ? stored(a.type(), fa * real_at(a, x, y) + fb * sum) : a.at(x, y);
}

void offset(const image& a, const image& b, coordinate<double> position, double fa, double fb)
{
    if (Arithmetic::reaches(a.layout, b.layout, position)) Arithmetic::add_offset(a, b, position, fa, fb);
}

struct offset_case {
    double x, y, fa, fb;
};

TEST(AddOffset, FollowsItsDefinitionForEachPairOfTypes)
{
    constexpr size a_size{19, 7}, b_size{11, 5};
    constexpr offset_case cases[] = {
        {0, 0, 1, 1},         {3, 1, 1, -1},          {2.25, 1.5, 0.5, 0.75},
        {-4.75, -2, 1, 1},    {16.5, 6.9, -2.5, 3},   {5, -3.125, 1e5, 1},
        {-10.999, 2, 0.3, 1}, {-1e-20, -1e-20, 1, 1}, {4.5, 2.5, not_a_number, 1}};
    int turn = 0;
    for (const storage ta : real_types)
        for (const storage tb : real_types)
            for_each_layout([&](memory_layout l) {
                const auto a = filled(ta, a_size, l, 5), b = filled(tb, b_size, rotated(l, ++turn), 6);
                for (const auto& [x, y, fa, fb] : cases)
                    step(name(ta) + " + " + name(tb) + " at " + std::to_string(x),
                         [&, p = coordinate{x, y}, fa = fa, fb = fb] {
                             for_each_level([&](level) {
                                 auto target = a;
                                 offset(target.view(), b.view(), p, fa, fb);
                                 target.expect([&](int i, int j) {
                                     return offset_by_definition(a, b, b_size, p, fa, fb, i, j);
                                 });
                             });
                         });
            });
}

TEST(AddOffset, CrossesBlocksAtAnyPlace)
{
    constexpr size a_size{600, 3}, b_size{590, 3};
    for (const storage t : {storage::u8, storage::f32}) {
        const auto a = filled(t, a_size, memory_layout::packed, 1),
                   b = filled(t, b_size, memory_layout::padded, 2);
        for (const double x : {-300.5, -1.25, 0.0, 0.5, 9.75, 333.25})
            for_each_level([&](level) {
                auto target = a;
                offset(target.view(), b.view(), {x, 0.5}, 1, 1);
                target.expect([&](int i, int j) {
                    return offset_by_definition(a, b, b_size, {x, 0.5}, 1, 1, i, j);
                });
            });
    }
}

TEST(AddOffset, ChangesNothingFarAway)
{
    const auto a = filled(storage::u8, {5, 4}, memory_layout::padded, 1);
    const auto b = filled(storage::u8, {3, 2}, memory_layout::packed, 2);
    for (const double far : {5.0, -3.0, 2147483648.0, -1e300, infinity, -infinity, not_a_number})
        for (const coordinate<double> p : {coordinate{far, 0.5}, {0.5, far}, {far, far}}) {
            if (far == -3.0 || far == 5.0) {
                if (p.x != far) continue; // inside, vertically
            }
            EXPECT_FALSE(Arithmetic::reaches(a.view().layout, b.view().layout, p)) << far;
        }
    EXPECT_TRUE(Arithmetic::reaches(a.view().layout, b.view().layout, {4.999, -1.999}));
}

TEST(AddOffset, TreatsEachByteOfAColour)
{
    constexpr size a_size{90, 5}, b_size{88, 4};
    for_each_layout([&](memory_layout l) {
        for (const memory_layout of_b : {memory_layout::packed, rotated(l, 3)}) {
            const auto a = random_image<colour_24>(a_size, l, 1),
                       b = random_image<colour_24>(b_size, of_b, 2);
            for (const coordinate<double> p : {coordinate{1.5, 0.25}, {-3.75, -1.0}, {2.0, 1.0}}) {
                auto target = a;
                offset(image_of(target), image_of(b), p, 0.5, 0.75);
                real_image before(storage::u8, a_size, memory_layout::packed),
                    added(storage::u8, b_size, memory_layout::packed);
                for (int c = 0; c < 3; ++c) {
                    before.set([&](int x, int y) { return a.at(x, y).channel[c]; });
                    added.set([&](int x, int y) { return b.at(x, y).channel[c]; });
                    for (int y = 0; y < a_size.height; ++y)
                        for (int x = 0; x < a_size.width; ++x)
                            ASSERT_EQ(
                                target.at(x, y).channel[c],
                                static_cast<uint8_t>(
                                    offset_by_definition(before, added, b_size, p, 0.5, 0.75, x, y).whole))
                                << x << ", " << y << ", " << c;
                }
                expect_intact(target);
            }
        }
    });
}

plain_value whole_offset_by_definition(const real_image& a, const real_image& b, size b_size,
                                       coordinate<int32_t> p, double fa, double fb, double ratio, int x,
                                       int y)
{
    const int64_t u = int64_t{x} - p.x, v = int64_t{y} - p.y;
    double value = fa * real_at(a, x, y);
    if (u >= 0 && u < b_size.width && v >= 0 && v < b_size.height) value += fb * (ratio * real_at(b, u, v));
    return stored(a.type(), value);
}

TEST(AddIntegerOffset, FollowsItsDefinitionForEachPairOfTypes)
{
    struct whole_case {
        coordinate<int32_t> p;
        double fa, fb;
    };
    constexpr size a_size{19, 7}, b_size{11, 5};
    constexpr whole_case cases[] = {{{0, 0}, 1, 1},
                                    {{3, 2}, 1, -1},
                                    {{-4, -1}, 0.5, 0.25},
                                    {{18, 6}, -3, 2.5},
                                    {{-10, 3}, 1, 40000},
                                    {{2, -4}, not_a_number, infinity},
                                    {{30, 0}, 2, 1},
                                    {{INT32_MIN, INT32_MAX}, 1, 1},
                                    {{INT32_MAX, INT32_MIN}, 0.5, 1}};
    int turn = 0;
    for (const storage ta : real_types)
        for (const storage tb : real_types)
            for_each_layout([&](memory_layout l) {
                const auto a = filled(ta, a_size, l, 5), b = filled(tb, b_size, rotated(l, ++turn), 6);
                const int whole_ratio = 8 * static_cast<int>(bytes_of(ta) - bytes_of(tb));
                const double ratio = is_integer(ta) && is_integer(tb) ? std::ldexp(1.0, whole_ratio) : 1;
                for (const auto& [p, fa, fb] : cases)
                    step(name(ta) + " + " + name(tb), [&, p = p, fa = fa, fb = fb] {
                        for_each_level([&](level) {
                            const auto expected = [&](int x, int y) {
                                return whole_offset_by_definition(a, b, b_size, p, fa, fb, ratio, x, y);
                            };
                            auto out = filled(ta, a_size, rotated(l, 2), 9), target = a;
                            Arithmetic::add_integer_offset(a.view(), b.view(), p, fa, fb, out.view());
                            out.expect(expected);
                            Arithmetic::add_integer_offset(target.view(), b.view(), p, fa, fb, target.view());
                            target.expect(expected);
                        });
                    });
            });
}

TEST(AddIntegerOffset, ScalesByTheRatioOfNominalRanges)
{
    const auto a = filled(storage::u16, {6, 4}, memory_layout::packed, 1);
    const auto b = filled(storage::u8, {6, 4}, memory_layout::packed, 2);
    auto out = a;
    for (const auto& [a_bits, b_bits, ratio] : {std::tuple{12, 8, 16.0}, {16, 8, 256.0}, {10, 8, 4.0}}) {
        Arithmetic::add_integer_offset(a.view(a_bits), b.view(b_bits), {0, 0}, 0.5, 0.25, out.view(a_bits));
        out.expect([&, ratio = ratio](int x, int y) {
            return whole_offset_by_definition(a, b, {6, 4}, {0, 0}, 0.5, 0.25, ratio, x, y);
        });
    }
}

/// Images of u16 inside one memory: the second starts so many pixels behind the first.
struct shared_memory {
    static constexpr size whole{24, 12}, part{12, 6};
    real_image memory = filled(storage::u16, whole, memory_layout::packed, 3);

    image at(int x, int y) const
    {
        return Arithmetic::part_of(memory.view(), {x, y, x + part.width, y + part.height});
    }
    real_image copy(int x, int y) const
    {
        real_image c(storage::u16, part, memory_layout::padded);
        c.set([&](int i, int j) { return static_cast<uint16_t>(memory.at(x + i, y + j).whole); });
        return c;
    }
    /// The part at (x, y) is like `expected`, all else as before.
    void expect(int x, int y, const real_image& expected, const shared_memory& before) const
    {
        memory.expect([&](int i, int j) {
            const bool inside = i >= x && i < x + part.width && j >= y && j < y + part.height;
            return inside ? expected.at(i - x, j - y) : before.memory.at(i, j);
        });
    }
};

TEST(Compositing, GivesTheSameInSharedMemory)
{
    constexpr auto s = shared_memory::part;
    const shared_memory before;
    for (const auto& [x, y] : {std::pair{4, 3}, {3, 3}, {5, 3}, {4, 2}, {4, 4}, {0, 0}, {9, 5}}) {
        // Operands begin at (4, 3), at (x, y) and at (6, 4); the output at (x, y).
        const real_image a = before.copy(4, 3), b = before.copy(x, y), mask = before.copy(6, 4);
        const auto check = [&, x = x, y = y](const char* what, auto separate, auto together) {
            real_image out = before.copy(x, y);
            separate(out);
            shared_memory m;
            together(m);
            step(what, [&] { m.expect(x, y, out, before); });
        };
        for (const coordinate<int32_t> p : {coordinate{0, 0}, {2, 1}, {-2, -1}, {0, 1}, {-1, 0}}) {
            check(
                "AddIntegerOffset",
                [&](real_image& out) { add_integer_offset(a.view(), b.view(), p, 0.5, 0.5, out.view()); },
                [&, x = x, y = y](shared_memory& m) {
                    add_integer_offset(m.at(4, 3), m.at(x, y), p, 0.5, 0.5, m.at(x, y));
                });
            const coordinate<double> between{p.x * 0.75, p.y * 0.75};
            check(
                "AddOffset", [&](real_image& out) { offset(out.view(), a.view(), between, 1, 1); },
                [&, x = x, y = y](shared_memory& m) { offset(m.at(x, y), m.at(4, 3), between, 1, 1); });
            check(
                "Extend", [&](real_image& out) { extend(a.view(), p, 7, out.view()); },
                [&, x = x, y = y](shared_memory& m) { extend(m.at(4, 3), p, 7, m.at(x, y)); });
        }
        check(
            "Margins", [&](real_image& out) { set_margins(a.view(), 1, out.view()); },
            [&, x = x, y = y](shared_memory& m) { set_margins(m.at(4, 3), 1, m.at(x, y)); });
        check(
            "Combine", [&](real_image& out) { blend(a.view(), b.view(), mask.view(), out.view()); },
            [&, x = x, y = y](shared_memory& m) { blend(m.at(4, 3), m.at(x, y), m.at(6, 4), m.at(x, y)); });
        static_assert(s.width == 12);
    }
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
