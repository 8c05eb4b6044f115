#include "arithmetic_cases.h"

#include <cmath>
#include <csignal>

namespace Qor::Luxar::ZELT::Test {
namespace {

constexpr int wrap = 2, saturate = 3;

std::string case_name(method m, int rounding)
{
    return "method " + std::to_string(static_cast<int>(m)) + ", rounding " + std::to_string(rounding);
}

/// Zero divisors are for the test of their own.
void avoid_faults(method m, real_image& a, real_image& b)
{
    if (!is_integer(a.type()) || !is_integer(b.type())) return;
    if (m == method::divide) b.replace_zeros();
    if (m == method::reverse_divide) a.replace_zeros();
}

void check_images(method m, int rounding, const real_image& a, const real_image& b, const real_image& dst)
{
    ASSERT_EQ(Arithmetic::combine(m, rounding, a.view(), b.view(), dst.view()), outcome::done);
    dst.expect([&](int x, int y) {
        return by_definition(m, rounding == saturate, a.at(x, y), b.at(x, y), dst.type(),
                             dst.view().layout.bits);
    });
}

template <class Body>
void for_each_method(Body&& body)
{
    for (const method m : all_methods)
        for (const int rounding : {wrap, saturate}) step(case_name(m, rounding), [&] { body(m, rounding); });
}

TEST(Binary, ImagesOfOneTypeFollowTheDefinition)
{
    for (const storage t : real_types)
        step(name(t), [&] {
            int turn = 0;
            for_each_size([&](size s) {
                ++turn;
                // Packed images, which are one long row; rows apart; and some mixture.
                for (const int step_of_layouts : {0, 1, turn})
                    for_each_method([&](method m, int rounding) {
                        const auto l = static_cast<memory_layout>(step_of_layouts % memory_layout_count);
                        real_image a(t, s, l), b(t, s, rotated(l, step_of_layouts > 1 ? 3 : 0));
                        a.fill(1), b.fill(2);
                        avoid_faults(m, a, b);
                        for_each_level([&](level) { check_images(m, rounding, a, b, real_image(t, s, l)); });
                    });
            });
        });
}

TEST(Binary, AnyTwoTypesFollowTheDefinition)
{
    int turn = 0;
    for (const storage t : real_types)
        for (const storage other : real_types)
            for (const size s : {size{67, 3}, size{300, 2}, size{1, 1}})
                step(name(t) + " with " + name(other) + " in " + name(s), [&] {
                    if (t == other || enough_failures()) return;
                    for_each_method([&](method m, int rounding) {
                        const auto l = static_cast<memory_layout>(++turn % memory_layout_count);
                        const auto k = static_cast<memory_layout>(turn / 8 % memory_layout_count);
                        real_image a(t, s, l), b(other, s, k);
                        a.fill(3), b.fill(4);
                        avoid_faults(m, a, b);
                        for_each_level([&](level) {
                            check_images(m, rounding, a, b, real_image(t, s, rotated(k, 3)));
                            check_images(m, rounding, a, b, real_image(other, s, rotated(l, 5)));
                        });
                    });
                });
}

TEST(Binary, SaturationStopsAtTheNominalDepth)
{
    constexpr size s{67, 3};
    for (const storage t : {storage::u8, storage::u16, storage::u32, storage::i8, storage::i16, storage::i32})
        for (const storage other : {t, storage::u8, storage::i32, storage::f32, storage::f64})
            for (const method m : all_methods)
                step(name(t) + " with " + name(other) + ", " + case_name(m, saturate), [&] {
                    real_image a(t, s, memory_layout::packed), b(other, s, memory_layout::packed);
                    a.fill(5), b.fill(6);
                    avoid_faults(m, a, b);
                    const int full = static_cast<int>(8 * Arithmetic::bytes_of(t));
                    for (const int bits : {full - 1, full / 2 + 1})
                        for_each_level([&](level) {
                            const real_image dst(t, s, memory_layout::packed);
                            ASSERT_EQ(Arithmetic::combine(m, saturate, a.view(bits),
                                                          b.view(t == other ? bits : 0), dst.view(bits)),
                                      outcome::done);
                            dst.expect([&](int x, int y) {
                                return by_definition(m, true, a.at(x, y), b.at(x, y), t, bits);
                            });
                        });
                });
}

TEST(Binary, OutputsMayBeEitherOperand)
{
    for (const storage t : real_types)
        for (const storage other : {t, storage::f64, storage::u8})
            for (const auto l : {memory_layout::packed, memory_layout::mirrored})
                for_each_method([&](method m, int rounding) {
                    real_image a(t, {67, 3}, l), b(other, {67, 3}, memory_layout::packed);
                    a.fill(9), b.fill(10);
                    avoid_faults(m, a, b);
                    const auto expected = [&](storage to) {
                        return [=, &a, &b](int x, int y) {
                            return by_definition(m, rounding == saturate, a.at(x, y), b.at(x, y), to,
                                                 static_cast<int>(8 * Arithmetic::bytes_of(to)));
                        };
                    };
                    const real_image first = a, second = b;
                    ASSERT_EQ(Arithmetic::combine(m, rounding, first.view(), b.view(), first.view()),
                              outcome::done);
                    first.expect(expected(t));
                    ASSERT_EQ(Arithmetic::combine(m, rounding, a.view(), second.view(), second.view()),
                              outcome::done);
                    second.expect(expected(other));
                });
}

Arithmetic::number number_of(const plain_value& v)
{
    return {v.type, is_integer(v.type) ? static_cast<double>(v.whole) : v.real, 0};
}

/// Numbers of a type: small, negative, large, and of the type's own kind.
std::vector<plain_value> numbers(storage t)
{
    std::vector<plain_value> all;
    for (const double v : {3.0, -10.0, 0.25, 300.7, 1e10})
        switch_scalar(type_of(t), [&]<class T>(pixel<T>) {
            const auto whole = static_cast<int64_t>(v);
            if constexpr (std::is_integral_v<T>)
                all.push_back({t, static_cast<T>(whole), 0});
            else
                all.push_back({t, 0, static_cast<double>(static_cast<T>(v))});
        });
    if (!is_integer(t)) all.push_back({t, 0, std::numeric_limits<double>::quiet_NaN()});
    return all;
}

TEST(Binary, NumbersFollowTheDefinition)
{
    int turn = 0;
    for (const storage t : real_types)
        for (const storage to : real_types) {
            const bool changes_type = Arithmetic::is_unsigned(t) || Arithmetic::is_float(t);
            if (t != to && !changes_type) continue;
            const auto l = static_cast<memory_layout>(++turn % memory_layout_count);
            const size s{turn % 4 == 0 ? 300 : 33, 2};
            real_image packed(t, s, memory_layout::packed), apart(t, s, l);
            packed.fill(static_cast<uint64_t>(turn)), apart.fill(static_cast<uint64_t>(turn));
            packed.replace_zeros(), apart.replace_zeros();
            for (const storage of_number : real_types)
                for (const plain_value& n : numbers(of_number))
                    step(name(t) + " and " + name(of_number) + " to " + name(to), [&] {
                        if (enough_failures()) return;
                        for_each_method([&](method m, int rounding) {
                            if (m == method::divide && is_integer(t) && is_integer(of_number) && n.whole == 0)
                                return;
                            const auto& a = ++turn % 2 ? packed : apart;
                            for_each_level([&](level) {
                                const real_image dst(to, s, turn % 2 ? memory_layout::packed : l);
                                ASSERT_EQ(Arithmetic::check_number_form(a.view(), dst.view()), outcome::done);
                                ASSERT_EQ(
                                    Arithmetic::combine(m, rounding, a.view(), number_of(n), dst.view()),
                                    outcome::done);
                                dst.expect([&](int x, int y) {
                                    return by_definition(m, rounding == saturate, a.at(x, y), n, to,
                                                         static_cast<int>(8 * Arithmetic::bytes_of(to)));
                                });
                            });
                        });
                    });
        }
}

/// Numbers whose results with narrow pixels are hard to get: whole, close to whole, exact and inexact fractions, and
/// those whose products with some pixels are rounded to whole numbers, with others not (0.29, 0.57).
std::vector<plain_value> numbers_for_narrow_pixels()
{
    std::vector<plain_value> all;
    for (const int64_t n : {1, 3, 127, 255, 257, 65535, -1, -3, -128, -32768})
        all.push_back({storage::i32, n, 0});
    for (const double n :
         {0.5, 2.0, -37.0, 0.1, 0.29, 0.57, 1.0 / 3, 3.7, -2.6, 255.9, 300.25, 1 / 65535.0, 41000.5, -70000.5,
          1 - 0x1p-40, 3 + 0x1p-45, 1e-30, -0.0, -1 / 3.0 * (1 + 0x1p-52)})
        all.push_back({storage::f64, 0, n});
    for (const double n : {-17.0, 3.5}) all.push_back({storage::f32, 0, n});
    for (int i = 0; i < 8; ++i)
        all.push_back({storage::f64, 0, std::ldexp(1 + std::fmod(i * 0.6180339887498949, 1.0), i - 4)});
    return all;
}

TEST(Binary, EachNarrowPixelWithANumberFollowsTheDefinition)
{
    int turn = 0;
    for (const storage t : {storage::u8, storage::u16, storage::i8, storage::i16}) {
        const int full = static_cast<int>(8 * Arithmetic::bytes_of(t));
        const size s{full == 8 ? 100 : 256, full == 8 ? 3 : 256};
        real_image a(t, s, memory_layout::packed);
        if (full == 8)
            a.set([](int x, int y) { return static_cast<uint8_t>(100 * y + x); });
        else
            a.set([](int x, int y) { return static_cast<uint16_t>(256 * y + x); });
        for (const plain_value& n : numbers_for_narrow_pixels())
            for (const method m : {method::add, method::subtract, method::reverse_subtract, method::multiply,
                                   method::divide}) {
                if (enough_failures() || (is_integer(n.type) && m != method::divide)) continue;
                const int rounding = ++turn % 2 ? wrap : saturate, bits = turn % 3 ? full : full - 3;
                step(name(t) + ", " + case_name(m, rounding) + ", " + std::to_string(n.whole) + " / " +
                         std::to_string(n.real),
                     [&] {
                         for_each_level([&](level) {
                             const real_image dst(t, s, memory_layout::packed);
                             Arithmetic::combine(m, rounding, a.view(bits), number_of(n), dst.view(bits));
                             dst.expect([&](int x, int y) {
                                 return by_definition(m, rounding == saturate, a.at(x, y), n, t, bits);
                             });
                         });
                     });
            }
    }
}

TEST(Binary, OneLargeFloatLeavesItsNeighboursAlone)
{
    for (const storage t : {storage::u8, storage::u16, storage::i16}) {
        real_image a(t, {1500, 1}, memory_layout::packed), b(storage::f32, {1500, 1}, memory_layout::packed);
        a.fill(1);
        b.set([](int x, int) { return x == 700 ? 5e9f : static_cast<float>(x - 400) / 3; });
        a.replace_zeros();
        for_each_method([&](method m, int rounding) {
            for_each_level([&](level) {
                check_images(m, rounding, a, b, real_image(t, {1500, 1}, memory_layout::packed));
                check_images(m, rounding, b, a, real_image(t, {1500, 1}, memory_layout::packed));
            });
        });
    }
}

TEST(Binary, NumbersLeaveTheRestOfALargerOutput)
{
    real_image a(storage::u8, {5, 4}, memory_layout::packed), dst(storage::u8, {9, 6}, memory_layout::padded);
    a.fill(1), dst.fill(2);
    const real_image before = dst;
    ASSERT_EQ(Arithmetic::combine(method::add, wrap, a.view(), {storage::u8, 7, 0}, dst.view()),
              outcome::done);
    dst.expect([&](int x, int y) {
        return x < 5 && y < 4 ? plain_value{storage::u8, a.at(x, y).whole + 7, 0} : before.at(x, y);
    });
}

TEST(Binary, TheOneQuotientWithoutPlaceWraps)
{
    test_image<int32_t> a({300, 1}), b({300, 1}), dst({300, 1});
    a.fill([](int x, int) { return x % 2 ? std::numeric_limits<int32_t>::min() : x; });
    b.fill([](int, int) { return -1; });
    for_each_level([&](level) {
        ASSERT_EQ(Arithmetic::combine(method::divide, wrap, image_of(a), image_of(b), image_of(dst)),
                  outcome::done);
        expect_equal(dst, [](int x, int) { return x % 2 ? std::numeric_limits<int32_t>::min() : -x; });
    });
}

using BinaryDeathTest = ::testing::Test;

TEST(BinaryDeathTest, IntegerDivisionByZeroIsAFaultAtEachLevel)
{
    GTEST_FLAG_SET(death_test_style, "fast");
    for (const storage t : {storage::u8, storage::u16, storage::u32, storage::i8, storage::i16, storage::i32})
        for (const storage other : {t, storage::u8, storage::i32})
            for (const auto l : {memory_layout::packed, memory_layout::every_second})
                for_each_level([&](level) {
                    if (enough_failures() || (l != memory_layout::packed && t != storage::i16)) return;
                    real_image a(t, {64, 2}, l), b(other, {64, 2}, l), dst(t, {64, 2}, l);
                    a.fill(1), b.fill(2);
                    a.replace_zeros(), b.replace_zeros();
                    std::memset(b.view().data + b.view().layout.offset, 0,
                                size_t(Arithmetic::bytes_of(other)));
                    // A sanitizer's own handler would end the process in another way.
                    const auto images = [&](method m, const real_image& x, const real_image& y) {
                        std::signal(SIGFPE, SIG_DFL);
                        Arithmetic::combine(m, saturate, x.view(), y.view(), dst.view());
                    };
                    EXPECT_EXIT(images(method::divide, a, b), ::testing::KilledBySignal(SIGFPE), "");
                    EXPECT_EXIT(images(method::reverse_divide, b, a), ::testing::KilledBySignal(SIGFPE), "");
                    const auto by_number = [&] {
                        std::signal(SIGFPE, SIG_DFL);
                        Arithmetic::combine(method::divide, wrap, a.view(), {other, 0, 0}, dst.view());
                    };
                    EXPECT_EXIT(by_number(), ::testing::KilledBySignal(SIGFPE), "");
                });
}

TEST(Binary, RefusesInItsOrderAndWritesNothing)
{
    real_image a(storage::u8, {4, 3}, memory_layout::packed), b(storage::f32, {4, 3}, memory_layout::packed);
    real_image third(storage::i16, {4, 3}, memory_layout::packed),
        small(storage::u8, {3, 3}, memory_layout::packed);
    a.fill(1), b.fill(2), third.fill(3), small.fill(4);
    const real_image before = third;
    const auto images = [](int rounding, const real_image& x, const real_image& y, const real_image& dst) {
        return Arithmetic::combine(method::add, rounding, x.view(), y.view(), dst.view());
    };
    EXPECT_EQ(images(0, a, b, small), outcome::other_size);
    EXPECT_EQ(images(0, a, b, third), outcome::no_type_fits);
    for (const int rounding : {0, 4, -1, 1000})
        EXPECT_EQ(images(rounding, a, b, a), outcome::unknown_rounding);
    EXPECT_EQ(Arithmetic::check_number_form(a.view(), small.view()), outcome::too_small);
    EXPECT_EQ(Arithmetic::check_number_form(third.view(), a.view()), outcome::unsupported)
        << "Signed to Unsigned";
    EXPECT_EQ(Arithmetic::check_number_form(third.view(12), third.view()), outcome::unsupported)
        << "Signed 12 to 16";
    EXPECT_EQ(Arithmetic::check_number_form(a.view(), third.view()), outcome::done);
    third.expect([&](int x, int y) { return before.at(x, y); });
}

TEST(Binary, StorageFollowsTheNominalDepthAndNeverCrossesAPixel)
{
    const auto of = [](PixmatEncoding e, int32_t bits, int32_t stride = 16) {
        return Arithmetic::storage_of({1, 1, bits, e, 0, stride, 16});
    };
    EXPECT_EQ(of(PixmatEncoding_Unsigned, 1), storage::u8);
    EXPECT_EQ(of(PixmatEncoding_Signed, 12), storage::i16);
    EXPECT_EQ(of(PixmatEncoding_Unsigned, 17), storage::u32);
    EXPECT_EQ(of(PixmatEncoding_Unsigned, 24, -4), storage::u32);
    EXPECT_EQ(of(PixmatEncoding_Unsigned, 24, 3), storage::none) << "packed in three bytes";
    EXPECT_EQ(of(PixmatEncoding_Complex_Float_Half_Odd, 128), storage::c64);
    for (const int32_t bits : {0, -8, 33, 64}) {
        EXPECT_EQ(of(PixmatEncoding_Unsigned, bits), storage::none) << bits;
        EXPECT_EQ(of(PixmatEncoding_Signed, bits), storage::none) << bits;
    }
    for (const int32_t bits : {16, 31, 128}) EXPECT_EQ(of(PixmatEncoding_Float, bits), storage::none) << bits;
    for (const auto e :
         {PixmatEncoding_Data, PixmatEncoding_RGB, PixmatEncoding_BGRA, PixmatEncoding_Float_Vector2D})
        EXPECT_EQ(of(e, 32), storage::none) << e;
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
