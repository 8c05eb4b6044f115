#include "flatfield/kernels/flatten.h"

#include "flatfield_cases.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

using FlatField::flatten;
using FlatField::outcome;

/// Operands of these types at every size, layout and level, turning through scale factors and pools, against
/// expected(s, d, g, scale). Floats are special at every second turn, else of everyday size.
template <class T, class S, class D, class G, class Expected>
void sweep(bool with_gain, Expected expected)
{
    int turn = 0;
    for_each_size([&](size s) {
        for_each_layout([&](memory_layout l) {
            const int32_t scale = scale_at(++turn);
            const auto seed = static_cast<uint64_t>(turn);
            const auto kind = turn % 2 ? values::special : values::plain;
            const auto src = random_image<S>(s, l, seed, kind);
            const auto dark = random_image<D>(s, turn % 3 ? rotated(l, 3) : l, seed + 1000, kind);
            const auto gain = random_image<G>(s, turn % 3 ? rotated(l, turn) : l, seed + 2000, kind);
            step("scale " + std::to_string(scale) + ", turn " + std::to_string(turn), [&] {
                for_each_level([&](level) {
                    test_image<T> dst(s, turn % 3 ? rotated(l, turn + 1) : l);
                    ASSERT_EQ(flatten(image_of(dst), image_of(src), image_of(dark),
                                      with_gain ? image_of(gain) : FlatField::image{}, scale, pool_at(turn)),
                              outcome::done);
                    expect_equal(dst, [&](int x, int y) {
                        return expected(src.at(x, y), dark.at(x, y), gain.at(x, y), scale);
                    });
                });
            });
        });
    });
}

template <class T, class S, class D, class G>
void sweep_without_gain()
{
    sweep<T, S, D, G>(false, [](S s, D d, G, int32_t) { return without_gain<T>(s, d); });
}
template <class T, class S, class D, class G>
void sweep_with_gain()
{
    sweep<T, S, D, G>(true, [](S s, D d, G g, int32_t scale) { return with_gain<T>(s, d, g, scale); });
}

template <class Body>
void for_all_types(Body&& body)
{
    for_types<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(body);
}

TEST(Flatten, FollowsTheTableOfEqualTypes)
{
    for_all_types([]<class T>(pixel<T>) { sweep_without_gain<T, T, T, T>(); });
    for_all_types([]<class T>(pixel<T>) { sweep_with_gain<T, T, T, T>(); });
}

TEST(Flatten, FollowsTheMixedTable)
{
    for_types<uint16_t, int16_t>([]<class D>(pixel<D>) {
        for_all_types([]<class T>(pixel<T>) {
            sweep_without_gain<T, uint16_t, D, float>();
            sweep_with_gain<T, uint16_t, D, uint16_t>();
            sweep_with_gain<T, uint16_t, D, float>();
        });
    });
}

TEST(Flatten, KeepsTheFloatGainOfLongRowsExact) // rows are looked at in parts: some gains small, some not
{
    const size s{2600, 2};
    for_types<uint8_t, uint16_t, int8_t, int16_t, int32_t>([&]<class T>(pixel<T>) {
        for (const float odd :
             {16384.0f, -16384.0f, -0.0f, 1e-42f, 3e8f, 1e19f, -1e19f, 1e30f, HUGE_VALF, NAN}) {
            const auto src = random_image<uint16_t>(s, memory_layout::packed, 1);
            const auto dark = random_image<int16_t>(s, memory_layout::packed, 2);
            test_image<float> gain(s);
            // Products near halves: where the sum is rounded up to the next whole number.
            gain.fill([](int x, int y) {
                return std::nextafter(0.5f, x % 2 ? 0.0f : 1.0f) * float(1 + (x + y) % 5);
            });
            for (const int x : {0, 1023, 1024, 1500, 2599}) gain.set(x, x % 2, odd);
            for_each_level([&](level) {
                test_image<T> dst(s);
                flatten(image_of(dst), image_of(src), image_of(dark), image_of(gain), 1, nullptr);
                expect_equal(dst, [&](int x, int y) {
                    return with_gain<T>(src.at(x, y), dark.at(x, y), gain.at(x, y), 1);
                });
            });
        }
    });
}

TEST(Flatten, TakesEachImageAsDestination)
{
    for_all_types([]<class T>(pixel<T>) {
        for_each_layout([](memory_layout l) {
            const size s{67, 3};
            const auto src = random_image<T>(s, l, 1);
            const auto dark = random_image<T>(s, rotated(l, 2), 2);
            const auto gain = random_image<T>(s, rotated(l, 5), 3);
            for_each_level([&](level) {
                auto in_src = src, in_dark = dark, in_gain = gain;
                flatten(image_of(in_src), image_of(in_src), image_of(dark), image_of(gain), 1, nullptr);
                flatten(image_of(in_dark), image_of(src), image_of(in_dark), image_of(gain), 1, nullptr);
                flatten(image_of(in_gain), image_of(src), image_of(dark), image_of(in_gain), 1, nullptr);
                for (const auto* dst : {&in_src, &in_dark, &in_gain})
                    expect_equal(*dst, [&](int x, int y) {
                        return with_gain<T>(src.at(x, y), dark.at(x, y), gain.at(x, y), 1);
                    });
            });
        });
    });
}

TEST(Flatten, GivesTheDocumentedExamples)
{
    const auto one = [](auto result, uint16_t s, uint16_t d, std::optional<uint16_t> g, int32_t scale) {
        test_image<decltype(result)> dst({1, 1});
        test_image<uint16_t> src({1, 1}), dark({1, 1}), gain({1, 1});
        src.set(0, 0, s);
        dark.set(0, 0, d);
        gain.set(0, 0, g.value_or(0));
        flatten(image_of(dst), image_of(src), image_of(dark), g ? image_of(gain) : FlatField::image{}, scale,
                nullptr);
        return dst.at(0, 0);
    };
    EXPECT_EQ(one(uint16_t{}, 5, 9, {}, 1), 0);
    EXPECT_EQ(one(uint16_t{}, 1500, 500, 32768, 1), 1000);
    EXPECT_EQ(one(uint16_t{}, 4, 5, 32768, 1), 65535);
    EXPECT_EQ(one(uint16_t{}, 7, 5, 3, 16), 6) << "no shift";
    EXPECT_EQ(one(int32_t{}, 65535, 0, 65535, 17), 1) << "a shift by 31";
    EXPECT_EQ(one(uint32_t{}, 6, 5, {}, 1), 0xFFFFFFFF);
    EXPECT_EQ(one(uint32_t{}, 4, 5, {}, 1), 0u);
}

TEST(Flatten, RefusesOtherPairingsAndWritesNothing)
{
    struct operand {
        int32_t bits;
        PixmatEncoding encoding;
    };
    constexpr auto U = PixmatEncoding_Unsigned, S = PixmatEncoding_Signed, F = PixmatEncoding_Float;
    struct {
        operand dst, src, dark, gain; // no bits: no gain
        outcome expected;
    } const cases[] = {
        {{12, U}, {16, U}, {9, S}, {16, U}, outcome::done}, // depths of two bytes are one kind
        {{16, U}, {16, U}, {16, U}, {12, U}, outcome::done},
        {{32, U}, {17, U}, {24, U}, {}, outcome::done},
        {{64, F}, {16, U}, {16, S}, {24, F}, outcome::done},
        {{16, U}, {16, S}, {16, S}, {}, outcome::unsupported}, // the source of mixed types is unsigned
        {{16, U}, {8, U}, {8, U}, {}, outcome::unsupported},
        {{16, U}, {16, U}, {32, S}, {}, outcome::unsupported},
        {{16, U}, {16, U}, {16, U}, {16, S}, outcome::unsupported},
        {{16, U}, {16, U}, {16, U}, {64, F}, outcome::unsupported},
        {{32, F}, {32, F}, {32, F}, {16, U}, outcome::unsupported},
        {{64, U}, {64, U}, {64, U}, {}, outcome::unsupported},
        {{64, U}, {16, U}, {16, U}, {}, outcome::unsupported},
        {{16, F}, {16, U}, {16, U}, {}, outcome::unsupported},
        {{0, U}, {0, U}, {0, U}, {}, outcome::unsupported},
        {{32, PixmatEncoding_RGBA},
         {32, PixmatEncoding_RGBA},
         {32, PixmatEncoding_RGBA},
         {},
         outcome::unsupported},
    };
    for (const auto& c : cases) {
        uint64_t memory[4][4] = {};
        const auto image = [&](operand o, uint64_t(&m)[4]) {
            const image_layout l{4, 1, o.bits, o.encoding, 0, 8, 32};
            return o.bits == 0 && &m == &memory[3] ? FlatField::image{}
                                                   : FlatField::image{l, reinterpret_cast<uint8_t*>(m)};
        };
        constexpr uint64_t untouched = 0x5555555555555555;
        memory[0][2] = untouched;
        step("destination " + std::to_string(c.dst.bits) + " bits, source " + std::to_string(c.src.bits),
             [&] {
                 EXPECT_EQ(flatten(image(c.dst, memory[0]), image(c.src, memory[1]), image(c.dark, memory[2]),
                                   image(c.gain, memory[3]), 1, nullptr),
                           c.expected);
                 EXPECT_EQ(memory[0][2] != untouched, c.expected == outcome::done);
             });
    }
}

TEST(Flatten, RefusesImagesThatDoNotCoverTheSource)
{
    const auto source = random_image<uint16_t>({7, 5}, memory_layout::padded, 1);
    for (const size small : {size{6, 5}, size{7, 4}, size{0, 0}})
        for (int which = 0; which < 3; ++which) {
            const auto extent = [&](int i) { return i == which ? small : size{9, 8}; };
            test_image<int32_t> dst(extent(0));
            const test_image<uint16_t> dark(extent(1)), gain(extent(2));
            EXPECT_EQ(flatten(image_of(dst), image_of(source), image_of(dark), image_of(gain), 1, nullptr),
                      outcome::too_small);
            expect_equal(dst, [](int, int) { return 0; });
        }
}

TEST(Flatten, WritesTheSourcesRectangleOfALargerDestination)
{
    const auto src = random_image<uint16_t>({7, 5}, memory_layout::padded, 1);
    const auto dark = random_image<uint16_t>({9, 6}, memory_layout::packed, 2);
    test_image<float> dst({12, 8}, memory_layout::inset);
    ASSERT_EQ(flatten(image_of(dst), image_of(src), image_of(dark), {}, 1, pool_at(2)), outcome::done);
    expect_equal(dst, [&](int x, int y) {
        return x < 7 && y < 5 ? static_cast<float>(src.at(x, y) - dark.at(x, y)) : 0.0f;
    });
}

TEST(Flatten, RefusesPixelsThatTheirStorageWouldLeave) // 24 bits in three bytes each, read as four
{
    uint8_t memory[64] = {};
    const image_layout three = packed_layout(4, 2, 24, PixmatEncoding_Unsigned);
    image_layout four = three;
    four.x_stride = 4;
    four.y_stride = 16;
    const auto all = [&](const image_layout& l) {
        const FlatField::image i{l, memory};
        return flatten(i, i, i, {}, 1, nullptr);
    };
    EXPECT_EQ(all(three), outcome::unsupported);
    EXPECT_EQ(all(four), outcome::done);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
