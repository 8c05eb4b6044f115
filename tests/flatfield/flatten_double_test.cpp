#include "flatfield/kernels/flatten_double.h"

#include "flatfield_cases.h"

#include <tuple>

namespace Qor::Luxar::ZELT::Test {
namespace {

using FlatField::flatten_double;
using FlatField::image;
using FlatField::outcome;

constexpr double ratios[] = {1.0, 4.0, 0.37, -2.5, 1e300, HUGE_VAL, NAN, 0.0, 70000.75};

template <class T>
T limited(double x)
{
    constexpr double low = std::numeric_limits<T>::min(), high = std::numeric_limits<T>::max();
    return std::isnan(x) ? T{0}
           : x < low     ? std::numeric_limits<T>::min()
           : x >= high   ? std::numeric_limits<T>::max()
                         : static_cast<T>(x);
}
template <class T>
T clipped(double x) // an exact whole number, or an infinity
{
    if (std::is_same_v<T, int32_t>) return low_bits<T>(x);
    return std::isnan(x) ? T{0} : static_cast<T>(std::clamp(x, -32768.0, 32767.0));
}

/// The rows of the table: k is the ratio of the exposures, t the saturation level.
template <class T>
T merged_raw(int64_t l, int64_t h, int64_t t, double k)
{
    if (l >= t) return limited<T>(static_cast<double>(l) * k);
    if (std::is_same_v<T, int16_t>) return static_cast<T>(h < 32768 ? -32768 : 32767);
    return static_cast<T>(h < 65535 ? h : 0x7FFFFFFF);
}
template <class T>
T merged_dark(int64_t l, int64_t h, int64_t d, int64_t t, double k)
{
    return l >= t ? limited<T>(static_cast<double>(l - d) * k) : clipped<T>(static_cast<double>(h - d));
}
template <class T, class G>
T merged_gain(int64_t l, int64_t h, int64_t d, G g, int64_t t, double k, int32_t scale)
{
    if constexpr (std::is_same_v<G, float>) {
        if (l >= t) return limited<T>(static_cast<double>(h - d) * k * static_cast<double>(g));
        return clipped<T>(rounded(static_cast<float>(l - d) * g));
    } else {
        if (l >= t) {
            const double product = std::trunc(static_cast<double>(h - d) * k * static_cast<double>(g));
            return limited<T>(static_cast<double>(shifted(low_bits<int64_t>(product), scale)));
        }
        return clipped<T>(static_cast<double>(static_cast<int32_t>(shifted((l - d) * int64_t{g}, scale))));
    }
}

/// Operands at every size, layout and level; levels of saturation that occur. The images of the test support
/// begin at an offset, which keeps the eight lanes out of it.
template <class T, class S, class D, class G, class Merge, class Expected>
void sweep(Merge merge, Expected expected)
{
    int turn = 0;
    for_each_size([&](size s) {
        for_each_layout([&](memory_layout l) {
            const int32_t scale = scale_at(++turn);
            const double k = ratios[turn % 9];
            const int32_t bits = sizeof(S) == 1 ? 1 + turn % 8 : 9 + turn % 8;
            const auto seed = static_cast<uint64_t>(turn);
            const auto long_exposure = random_image<S>(s, l, seed);
            auto brief = random_image<S>(s, l, seed + 1000);
            const auto dark = random_image<D>(s, turn % 3 ? rotated(l, 3) : l, seed + 2000);
            const auto gain = random_image<G>(s, turn % 3 ? rotated(l, turn) : l, seed + 3000,
                                              turn % 2 ? values::special : values::plain);
            step("turn " + std::to_string(turn) + ", scale " + std::to_string(scale) + ", bits " +
                     std::to_string(bits) + ", ratio " + std::to_string(k),
                 [&] {
                     for_each_level([&](level) {
                         test_image<T> dst(s, turn % 3 ? rotated(l, turn + 1) : l);
                         auto declared = image_of(long_exposure), beside = image_of(brief);
                         declared.layout.bits = beside.layout.bits = bits;
                         ASSERT_EQ(merge(image_of(dst), declared, beside, k, image_of(dark), image_of(gain),
                                         scale, pool_at(turn)),
                                   outcome::done);
                         expect_equal(dst, [&](int x, int y) {
                             return expected(long_exposure.at(x, y), brief.at(x, y), dark.at(x, y),
                                             gain.at(x, y), (int64_t{1} << bits) - 1, k, scale);
                         });
                     });
                 });
        });
    });
}

template <class T, class S, class D>
void sweep_all_rows()
{
    using image_ref = const image&;
    using pool_ptr = Thread::ThreadPool*;
    const auto whole = [](image_ref dst, image_ref l, image_ref h, double k, image_ref d, image_ref g,
                          int32_t scale,
                          pool_ptr pool) { return flatten_double(dst, l, h, k, d, g, scale, pool); };
    const auto no_gain = [&](image_ref dst, image_ref l, image_ref h, double k, image_ref d, image_ref,
                             int32_t scale,
                             pool_ptr pool) { return flatten_double(dst, l, h, k, d, {}, scale, pool); };
    const auto raw = [&](image_ref dst, image_ref l, image_ref h, double k, image_ref, image_ref,
                         int32_t scale,
                         pool_ptr pool) { return flatten_double(dst, l, h, k, {}, {}, scale, pool); };
    const auto single = [&](image_ref dst, image_ref l, image_ref, double k, image_ref d, image_ref g,
                            int32_t scale,
                            pool_ptr pool) { return flatten_double(dst, l, {}, k, d, g, scale, pool); };
    const auto single_dark = [&](image_ref dst, image_ref l, image_ref, double k, image_ref d, image_ref,
                                 int32_t scale,
                                 pool_ptr pool) { return flatten_double(dst, l, {}, k, d, {}, scale, pool); };
    const auto by_table = [](S l, S h, D d, auto g, int64_t t, double k, int32_t scale) {
        return merged_gain<T>(l, h, d, g, t, k, scale);
    };
    const auto by_single_table = [](S l, S, D d, auto g, int64_t, double, int32_t scale) {
        return with_gain<T>(l, d, g, scale);
    };
    sweep<T, S, D, float>(whole, by_table);
    sweep<T, S, D, uint16_t>(whole, by_table);
    sweep<T, S, D, float>(no_gain, [](S l, S h, D d, float, int64_t t, double k, int32_t) {
        return merged_dark<T>(l, h, d, t, k);
    });
    sweep<T, S, D, float>(
        raw, [](S l, S h, D, float, int64_t t, double k, int32_t) { return merged_raw<T>(l, h, t, k); });
    sweep<T, S, D, float>(single, by_single_table);
    sweep<T, S, D, uint16_t>(single, by_single_table);
    sweep<T, S, D, float>(single_dark,
                          [](S l, S, D d, float, int64_t, double, int32_t) { return without_gain<T>(l, d); });
}

TEST(FlattenDouble, FollowsTheTableFor16BitExposures)
{
    for_types<int16_t, int32_t>([]<class T>(pixel<T>) {
        sweep_all_rows<T, uint16_t, uint16_t>();
        sweep_all_rows<T, uint16_t, int16_t>();
    });
}

TEST(FlattenDouble, FollowsTheTableFor8BitExposures)
{
    for_types<int16_t, int32_t>([]<class T>(pixel<T>) { sweep_all_rows<T, uint8_t, int16_t>(); });
}

/// Rows are looked at in parts: with and without saturated pixels, with and without large gains.
template <class T, class G>
void merge_long_rows(G odd_gain)
{
    const size s{600, 2};
    test_image<uint16_t> l(s);
    const auto h = random_image<uint16_t>(s, memory_layout::packed, 2);
    const auto dark = random_image<int16_t>(s, memory_layout::packed, 3);
    test_image<G> gain(s);
    gain.fill([&](int x, int y) {
        return static_cast<G>(h.at(x, y) % 5000 * (std::is_integral_v<G> ? 10 : 0.0005));
    });
    l.fill([&](int x, int y) { return uint16_t(h.at(599 - x, y) / 2); });
    for (const int x : {127, 256, 257, 599}) l.set(x, x % 2, 65535);
    for (const int x : {0, 130, 260, 598}) gain.set(x, x % 2, odd_gain);
    const auto expected = [&](int x, int y) {
        return merged_gain<T>(l.at(x, y), h.at(x, y), dark.at(x, y), gain.at(x, y), 65535, 1.5, 1);
    };
    for_each_level([&](level) {
        test_image<T> dst(s);
        flatten_double(image_of(dst), image_of(l), image_of(h), 1.5, image_of(dark), image_of(gain), 1,
                       nullptr);
        expect_equal(dst, expected);
        if (sizeof(T) != sizeof(uint16_t)) return;
        test_image<uint16_t> same = l;
        auto in_place = image_of(same);
        in_place.layout.encoding = PixmatEncoding_Signed;
        flatten_double(in_place, image_of(same), image_of(h), 1.5, image_of(dark), image_of(gain), 1,
                       nullptr);
        expect_equal(same, [&](int x, int y) { return static_cast<uint16_t>(expected(x, y)); });
    });
}

TEST(FlattenDouble, ChangesItsWayAlongARow)
{
    for_types<int16_t, int32_t>([]<class T>(pixel<T>) {
        for (const float odd : {16384.0f, -1e30f, HUGE_VALF, NAN}) merge_long_rows<T, float>(odd);
        merge_long_rows<T, uint16_t>(65535);
    });
}

TEST(FlattenDouble, NeedsAShortExposureOrADark)
{
    const test_image<uint16_t> l({4, 4});
    const test_image<int16_t> dst({4, 4});
    EXPECT_EQ(flatten_double(image_of(dst), image_of(l), {}, 1, {}, {}, 1, nullptr), outcome::unsupported);
}

TEST(FlattenDouble, WritesOnlyWhereTheDestinationHasRoom)
{
    const test_image<uint16_t> l({4, 4});
    const test_image<int16_t> dark({4, 4});
    const auto with_bits = [&](int32_t bits, int32_t width) {
        std::vector<uint8_t> memory(256);
        const image dst{packed_layout(width, 4, bits, PixmatEncoding_Signed), memory.data()};
        return flatten_double(dst, image_of(l), {}, 1, image_of(dark), {}, 1, nullptr);
    };
    EXPECT_EQ(with_bits(16, 4), outcome::done);
    EXPECT_EQ(with_bits(9, 4), outcome::done);
    EXPECT_EQ(with_bits(32, 5), outcome::done);
    EXPECT_EQ(with_bits(64, 4), outcome::done);
    EXPECT_EQ(with_bits(8, 4), outcome::unsupported) << "two bytes to each pixel of one";
    EXPECT_EQ(with_bits(17, 4), outcome::unsupported) << "four bytes to each pixel of three";
    EXPECT_EQ(with_bits(16, 3), outcome::too_small);
}

TEST(FlattenDouble, RefusesTheFirstWrongImage)
{
    const auto of = [](PixmatEncoding e, int32_t bits) { return packed_layout(8, 4, bits, e); };
    const auto U = PixmatEncoding_Unsigned, S = PixmatEncoding_Signed, F = PixmatEncoding_Float;
    const auto i16 = of(S, 16), u16 = of(U, 16), u12 = of(U, 12), u24 = of(U, 24), f32 = of(F, 32),
               f64 = of(F, 64);
    auto padded = u16;
    padded.y_stride += 2;
    using layouts = FlatField::merge_layouts;
    const auto expect = [](const char* text, const layouts& m) {
        expect_throws<std::invalid_argument>([&] { FlatField::check_merge(m); }, text);
    };
    // Each case is also wrong in a later way, so that the order shows.
    expect("Destination image must be signed", {&u16, &u24, nullptr, nullptr, nullptr});
    expect("Source image must be unsigned 16 max", {&i16, &u24, nullptr, &u12, nullptr});
    expect("Source image must be unsigned 16 max", {&i16, &i16, nullptr, nullptr, nullptr});
    expect("Dark reference must be 16 bit signed or unsigned", {&i16, &u16, nullptr, &u12, &f64});
    expect("Dark reference must be 16 bit signed or unsigned", {&i16, &u16, nullptr, &f32, nullptr});
    expect("Gain reference must be 16 bit unsigned or 32 bit float", {&i16, &u16, &u12, nullptr, &f64});
    expect("Gain reference must be 16 bit unsigned or 32 bit float", {&i16, &u16, nullptr, &u16, &i16});
    expect("Short exposure must be same encoding as long exposure", {&i16, &u16, &u12, nullptr, &f32});
    expect("Short exposure must be same encoding as long exposure", {&i16, &u16, &padded, &u16, nullptr});
    expect("Gain reference provided without dark reference", {&i16, &u16, nullptr, nullptr, &f32});
    FlatField::check_merge({&i16, &u16, &u16, &i16, &f32});
    FlatField::check_merge({&i16, &u12, nullptr, &u16, &u16});
}

/// Five aligned images of 16 x 4 pixels, four unsigned and one dark: what the eight lanes want.
class LanesOfFlattenDouble : public ::testing::Test {
protected:
    struct operand {
        image_layout layout;
        int64_t shift = 0; // of the data pointer
        alignas(16) uint8_t memory[1024] = {};

        explicit operand(PixmatEncoding e, uint64_t seed) : layout(packed_layout(16, 4, 16, e))
        {
            generator random(seed);
            for (auto& b : memory) b = static_cast<uint8_t>(random());
        }
        image view() { return {layout, memory + shift}; }
        uint16_t at(int x, int y) const
        {
            uint16_t v;
            std::memcpy(&v, memory + shift + layout.offset + y * layout.y_stride + x * layout.x_stride, 2);
            return v;
        }
        void set(int x, int y, uint16_t v)
        {
            std::memcpy(memory + y * layout.y_stride + x * layout.x_stride, &v, 2);
        }
    };
    operand long_exposure{PixmatEncoding_Unsigned, 1}, brief{PixmatEncoding_Unsigned, 2},
        dark{PixmatEncoding_Signed, 3}, gain{PixmatEncoding_Unsigned, 4}, dst{PixmatEncoding_Signed, 5};
    double ratio = 3.7;
    int32_t scale = 2;

    int64_t saturated() const { return (1 << long_exposure.layout.bits) - 1; }

    /// The lanes' arithmetic, modulo 65536 after each step.
    int16_t lanes(int x, int y) const
    {
        const auto as_signed = [](int64_t v) { return int64_t{static_cast<int16_t>(v)}; };
        const int64_t l = long_exposure.at(x, y), h = brief.at(x, y), d = dark.at(x, y), g = gain.at(x, y);
        const auto k = low_bits<int64_t>(ratio);
        const int64_t v =
            as_signed(as_signed(saturated()) > as_signed(l) ? l - d : as_signed(h - d) * (k & 65535));
        const auto high = static_cast<int64_t>(std::floor(static_cast<double>(v * as_signed(g)) / 65536));
        return static_cast<int16_t>(scale < 16 ? high * (int64_t{1} << scale) : 0);
    }
    int16_t general(int x, int y) const
    {
        return merged_gain<int16_t>(long_exposure.at(x, y), brief.at(x, y),
                                    static_cast<int16_t>(dark.at(x, y)), gain.at(x, y), saturated(), ratio,
                                    scale);
    }
    template <class Expected>
    void expect_all(const char* what, Expected expected)
    {
        const auto& l = long_exposure.layout;
        for_each_level([&](level) {
            for (int turn = 0; turn < 3; ++turn) {
                std::memset(dst.memory, 0x77, sizeof dst.memory);
                ASSERT_EQ(flatten_double(dst.view(), long_exposure.view(), brief.view(), ratio, dark.view(),
                                         gain.view(), scale, pool_at(turn)),
                          outcome::done);
                for (int y = 0; y < l.height; ++y)
                    for (int x = 0; x < l.width; ++x)
                        ASSERT_EQ(static_cast<int16_t>(dst.at(x, y)), expected(x, y))
                            << what << " " << x << " " << y;
            }
        });
    }
    void expect_lanes(const char* what)
    {
        expect_all(what, [this](int x, int y) { return lanes(x, y); });
    }
    void expect_general(const char* what)
    {
        expect_all(what, [this](int x, int y) { return general(x, y); });
    }
};

TEST_F(LanesOfFlattenDouble, FollowTheirOwnArithmetic)
{
    for (const int32_t bits : {16, 15, 14, 12, 9})
        for (const int32_t s : {2, 3, 8, 15, 16, 17, 40, 1000})
            for (const double k : ratios) {
                long_exposure.layout.bits = brief.layout.bits = bits;
                long_exposure.set(5, 1, static_cast<uint16_t>(saturated())); // a tie
                scale = s;
                ratio = k;
                expect_lanes("bits, scale and ratio");
            }
}

TEST_F(LanesOfFlattenDouble, EndWhereOneConditionFails)
{
    const auto with = [&](const char* what, auto change) {
        const auto saved = std::tuple(long_exposure, brief, dark, gain, dst, scale);
        change();
        expect_general(what);
        std::tie(long_exposure, brief, dark, gain, dst, scale) = saved;
    };
    operand* const all[] = {&dark, &gain, &long_exposure, &brief, &dst};
    with("scale", [&] { scale = 1; });
    with("negative scale", [&] { scale = -3; });
    for (const size uneven : {size{15, 3}, size{6, 2}})
        with("size", [&] {
            for (auto* o : all)
                o->layout = packed_layout(uneven.width, uneven.height, 16, o->layout.encoding);
        });
    with("exposures' x stride", [&] { long_exposure.layout.x_stride = brief.layout.x_stride = 4; });
    with("exposures' offset", [&] { long_exposure.layout.offset = brief.layout.offset = 16; });
    with("exposures' rows", [&] { long_exposure.layout.y_stride = brief.layout.y_stride = 48; });
    for (auto* o : all) with("data pointer", [&] { o->shift = 2; });
    for (auto* o : {&dark, &gain}) {
        with("x stride", [&] { o->layout.x_stride = 4; });
        with("offset", [&] { o->layout.offset = 16; });
    }
    for (auto* o : {&dark, &gain, &dst}) with("rows", [&] { o->layout.y_stride = 48; });
    expect_lanes("nothing changed");
}

TEST_F(LanesOfFlattenDouble, EndForOtherTypes)
{
    dark.layout.encoding = PixmatEncoding_Unsigned;
    expect_all("unsigned dark", [this](int x, int y) {
        return merged_gain<int16_t>(long_exposure.at(x, y), brief.at(x, y), dark.at(x, y), gain.at(x, y),
                                    saturated(), ratio, scale);
    });
}

TEST_F(LanesOfFlattenDouble,
       PlaceTheirResultsByTheDestinationsLayout) // its offset and x stride are no condition
{
    dst.layout.offset = 32;
    expect_lanes("offset");
    dst.layout.offset = 0;
    for (auto* o : {&dark, &gain, &long_exposure, &brief, &dst}) o->layout.height = 1;
    dst.layout.x_stride = 4;
    expect_lanes("x stride");
}

TEST_F(LanesOfFlattenDouble, TakeTheLongExposureAsDestination)
{
    std::vector<int16_t> expected;
    for (int y = 0; y < 4; ++y)
        for (int x = 0; x < 16; ++x) expected.push_back(lanes(x, y));
    auto in_place = long_exposure.view();
    in_place.layout.encoding = PixmatEncoding_Signed;
    flatten_double(in_place, long_exposure.view(), brief.view(), ratio, dark.view(), gain.view(), scale,
                   nullptr);
    for (size_t i = 0; i < expected.size(); ++i)
        EXPECT_EQ(static_cast<int16_t>(long_exposure.at(static_cast<int>(i % 16), static_cast<int>(i / 16))),
                  expected[i]);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
