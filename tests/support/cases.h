// The routine that every kernel test uses: it walks storage types, sizes around the vector widths, memory
// layouts and the instruction-set levels of the machine.
//
// One input, one output:
//
//     for_each_case<uint8_t, float>([]<class T>(const test_case<T>& c) {
//         const auto out = c.run([](memory_2d src, memory_2d dst) { Filters::median(src, {3, 3}, dst); });
//         expect_equal(out, [&](int x, int y) { return by_definition(c.input, x, y); });
//     });
//
// An output of another type or size: c.template run<double>(kernel, {w, h}); source and result in one image:
// c.run_in_place([](memory_2d image) { ... }). Floats with NaN, infinities, -0 and denormals:
// for_each_case<float>(values::special, body). A size that the kernel refuses: return from the body.
//
// More operands: combine the parts, and give each operand its own layout by rotation.
//
//     for_each_size([](size s) {
//         for_each_layout([&](memory_layout l) {
//             const auto a = random_image<uint8_t>(s, l, 1);
//             const auto b = random_image<float>(s, rotated(l, 3), 2);
//             for_each_level([&](level) {
//                 auto out = random_image<int16_t>(s, rotated(l, 5), 3);     // what the kernel leaves shows
//                 add(a.view(), b.view(), out.view());
//                 expect_equal(out, [&](int x, int y) { return ...; });      // also: nothing written beside
//                 it
//             });
//         });
//     });
#pragma once

#include "pixel/level.h"
#include "pixel/memory_2d.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <initializer_list>
#include <limits>
#include <optional>
#include <random>
#include <sstream>
#include <string>
#include <type_traits>
#include <typeinfo>
#include <vector>

namespace Qor::Luxar::ZELT::Test {

enum class memory_layout { packed, padded, flipped, mirrored, transposed, every_second, misaligned, inset };
inline constexpr int memory_layout_count = 8;

/// Random values: plain ones, with the limits of the type and 0 mixed in, with what only floats have as well.
enum class values { plain, extreme, special };

const char* name(memory_layout) noexcept;
const char* name(level) noexcept;
std::string name(size);

/// The layout `steps` further on, so that operands differ: rotated(packed, 8) is packed again.
constexpr memory_layout rotated(memory_layout l, int steps) noexcept
{
    return static_cast<memory_layout>((static_cast<int>(l) + steps) % memory_layout_count);
}

/// The pixel type that a storage type has unless a test says otherwise.
template <class T>
constexpr pixel_type default_type() noexcept
{
    if constexpr (std::is_same_v<T, float>)
        return pixel_type::float_32;
    else if constexpr (std::is_same_v<T, double>)
        return pixel_type::float_64;
    else if constexpr (std::is_same_v<T, complex_pixel<float>>)
        return pixel_type::complex_32;
    else if constexpr (std::is_same_v<T, complex_pixel<double>>)
        return pixel_type::complex_64;
    else if constexpr (std::is_same_v<T, colour_24>)
        return pixel_type::rgb;
    else if constexpr (std::is_same_v<T, colour_32>)
        return pixel_type::rgba;
    else {
        static_assert(std::is_integral_v<T>);
        constexpr int log2_bytes = sizeof(T) == 8 ? 3 : sizeof(T) / 2;
        return static_cast<pixel_type>((std::is_signed_v<T> ? 4 : 0) + log2_bytes);
    }
}

/// The memory under a test image: at least 64 guard bytes on either side. The address sanitizer also reports
/// reads of them.
class pixel_memory {
public:
    pixel_memory(size, memory_layout, int64_t pixel_bytes);
    pixel_memory(const pixel_memory&);
    pixel_memory(pixel_memory&&) noexcept = default;
    pixel_memory& operator=(pixel_memory other) noexcept;
    ~pixel_memory() = default;

    uint8_t* data() const noexcept { return const_cast<uint8_t*>(lines_.data()->byte); }
    uint8_t* at(int64_t x, int64_t y) const noexcept { return data() + offset + y * y_stride + x * x_stride; }

    /// The distance from pixel (0, 0) to a byte that was written outside the pixels, if there is one.
    std::optional<int64_t> damage() const;

    int64_t offset, x_stride, y_stride;

private:
    struct alignas(64) line {
        uint8_t byte[64];
    };
    void guard(bool on) const;

    size size_;
    int64_t pixel_bytes_;
    int64_t first_, end_; // the bytes from the lowest pixel to the highest
    std::vector<line> lines_;
};

using generator = std::mt19937_64;

template <class T>
T random_value(generator& random, values kind)
{
    if constexpr (std::is_integral_v<T>) {
        using limits = std::numeric_limits<T>;
        const T extremes[] = {limits::min(), limits::max(), 0, static_cast<T>(limits::max() - 1)};
        if (kind != values::plain && random() % 6 == 0) return extremes[random() % 4];
        return static_cast<T>(random() >> (random() % 3 * 20)); // all magnitudes of the wide types
    } else if constexpr (std::is_floating_point_v<T>) {
        using limits = std::numeric_limits<T>;
        const T extremes[] = {0, limits::max(), limits::lowest(), limits::min()};
        const T specials[] = {limits::quiet_NaN(),  limits::infinity(), -limits::infinity(), T{-0.0},
                              limits::denorm_min(), -limits::min() / 2};
        if (kind == values::special && random() % 6 == 0) return specials[random() % 6];
        if (kind != values::plain && random() % 12 == 0) return extremes[random() % 4];
        return static_cast<T>(std::ldexp(static_cast<double>(random() >> 11), -43) - 512); // -512 to 512
    } else if constexpr (requires(T t) { t.real; }) {
        const auto real = random_value<decltype(T::real)>(random, kind);
        return {real, random_value<decltype(T::real)>(random, kind)};
    } else {
        T t;
        for (auto& c : t.channel) c = random_value<uint8_t>(random, kind);
        return t;
    }
}

/// An image of a test. Its size is the stored one; its type says how the library sees the storage T.
template <class T>
class test_image {
public:
    explicit test_image(size s, memory_layout l = memory_layout::packed, pixel_type t = default_type<T>())
        : size_(s), type_(t), memory_(s, l, sizeof(T))
    {
        fill([](int, int) { return T{}; });
    }

    int width() const { return size_.width; }
    int height() const { return size_.height; }
    size extent() const { return size_; }

    T at(int x, int y) const
    {
        T value;
        std::memcpy(&value, memory_.at(x, y), sizeof value);
        return value;
    }
    void set(int x, int y, T value) { std::memcpy(memory_.at(x, y), &value, sizeof value); }

    /// The pixel at a place, or the nearest one of the image.
    T clamped(int x, int y) const
    {
        return at(std::clamp(x, 0, width() - 1), std::clamp(y, 0, height() - 1));
    }

    /// Sets every pixel to f(x, y).
    template <class F>
    void fill(F&& f)
    {
        for (int y = 0; y < height(); ++y)
            for (int x = 0; x < width(); ++x) set(x, y, f(x, y));
    }

    /// A kernel gets this view of an input, too: views have no constness.
    memory_2d view() const
    {
        return {type_,         size_.width, size_.height, memory_.offset, memory_.x_stride, memory_.y_stride,
                memory_.data()};
    }
    image_layout layout() const
    {
        return {size_.width,
                size_.height,
                GetPixmatBits(type_),
                GetPixmatEncoding(type_),
                static_cast<int32_t>(memory_.offset),
                static_cast<int32_t>(memory_.x_stride),
                static_cast<int32_t>(memory_.y_stride)};
    }
    void* data() const { return memory_.data(); }
    std::optional<int64_t> damage() const { return memory_.damage(); }

private:
    size size_;
    pixel_type type_;
    pixel_memory memory_;
};

template <class T>
test_image<T> random_image(size s, memory_layout l, uint64_t seed, values kind = values::extreme,
                           pixel_type t = default_type<T>())
{
    test_image<T> image(s, l, t);
    generator random(seed);
    image.fill([&](int, int) { return random_value<T>(random, kind); });
    return image;
}

/// The same bytes. Any two NaNs are equal: whose payload survives an operation is the compiler's choice.
template <class T>
bool same_bits(T a, T b)
{
    if constexpr (std::is_floating_point_v<T>)
        return (std::isnan(a) && std::isnan(b)) || std::memcmp(&a, &b, sizeof a) == 0;
    else if constexpr (requires { a.real; })
        return same_bits(a.real, b.real) && same_bits(a.imaginary, b.imaginary);
    else
        return std::memcmp(&a, &b, sizeof a) == 0;
}

template <class T>
std::string show(T value)
{
    std::ostringstream s;
    if constexpr (std::is_integral_v<T>)
        s << +value;
    else if constexpr (std::is_floating_point_v<T>)
        s << value << " (" << std::hexfloat << value << ")";
    else if constexpr (requires { value.real; })
        s << show(value.real) << " + i " << show(value.imaginary);
    else
        for (const int c : value.channel) s << c << ' ';
    return s.str();
}

/// Nothing beside the pixels was written.
template <class T>
void expect_intact(const test_image<T>& image, const char* what = "output")
{
    if (const auto place = image.damage())
        ADD_FAILURE() << what << ": a byte outside the pixels was written, " << *place
                      << " bytes from pixel (0, 0)";
}

/// Every pixel is expected(x, y), bit for bit, and nothing beside the pixels was written.
template <class T, class Expected>
void expect_equal(const test_image<T>& image, Expected&& expected)
{
    int wrong = 0;
    std::string first;
    for (int y = 0; y < image.height(); ++y)
        for (int x = 0; x < image.width(); ++x) {
            const T want = expected(x, y);
            const T got = image.at(x, y);
            if (!same_bits(got, want) && wrong++ == 0)
                first = "at (" + std::to_string(x) + ", " + std::to_string(y) + ") got " + show(got) +
                        ", expected " + show(want);
        }
    if (wrong > 0)
        ADD_FAILURE() << first << "; " << wrong << " wrong pixels of type "
                      << static_cast<int>(image.view().type) << " ("
                      << GetPixmatEncodingName(image.layout().encoding) << ' ' << image.layout().bits
                      << ") in " << name(image.extent());
    expect_intact(image);
}
template <class T>
void expect_equal(const test_image<T>& image, const test_image<T>& expected)
{
    ASSERT_EQ(image.extent(), expected.extent());
    expect_equal(image, [&](int x, int y) { return expected.at(x, y); });
}

/// The function throws exactly E, with exactly this text.
template <class E, class F>
void expect_throws(F&& f, const std::string& text)
{
    try {
        f();
        ADD_FAILURE() << "nothing was thrown instead of \"" << text << '"';
    } catch (const std::exception& e) {
        EXPECT_TRUE(typeid(e) == typeid(E)) << "another type: " << typeid(e).name();
        EXPECT_EQ(e.what(), text);
    }
}

/// Forces a level while it lives.
class forced_level {
public:
    explicit forced_level(level l) { force_level(l); }
    ~forced_level() { use_best_level(); }
    forced_level(const forced_level&) = delete;
    forced_level& operator=(const forced_level&) = delete;
};

/// True when the running test has failed so often that more cases would only bury the first.
bool enough_failures();

/// Runs one step of a walk: a failure inside, and an exception that leaves it, is reported with the step's
/// name.
template <class Body>
void step(const std::string& what, Body&& body)
{
    const ::testing::ScopedTrace trace(__FILE__, __LINE__, what);
    try {
        body();
    } catch (const std::exception& e) {
        ADD_FAILURE() << "thrown: " << e.what();
    }
}

/// body(level) at each level of the machine. Fails when one of them was not in force to the end of its run.
template <class Body>
void for_each_level(Body&& body)
{
    for (const level l : {level::v1, level::v3, level::v4}) {
        if (!machine_has(l) || enough_failures()) continue;
        const forced_level guard(l);
        step(std::string("level ") + name(l), [&] {
            body(l);
            EXPECT_EQ(current_level(), l) << "the level was not in use";
        });
    }
}

/// body(memory_layout) for each of them.
template <class Body>
void for_each_layout(Body&& body)
{
    for (int i = 0; i < memory_layout_count && !enough_failures(); ++i) {
        const auto l = static_cast<memory_layout>(i);
        step(std::string("layout ") + name(l), [&] { body(l); });
    }
}

/// body(size): none, one, odd ones, and those next to a vector's width.
template <class Body>
void for_each_size(Body&& body)
{
    constexpr size sizes[] = {{0, 0},  {1, 1},  {5, 0},  {1, 7},  {7, 1},  {2, 2},
                              {3, 5},  {5, 4},  {8, 3},  {15, 2}, {16, 3}, {17, 4},
                              {31, 2}, {33, 3}, {64, 2}, {67, 3}, {3, 37}, {20, 19}};
    for (const size s : sizes)
        if (!enough_failures()) step("size " + name(s), [&] { body(s); });
}

/// One input at one level. The output of run() has a layout of its own.
template <class T>
struct test_case {
    test_image<T> input;
    memory_layout output_layout;

    /// Calls kernel(src, dst) and gives dst. Fails when the kernel writes to its source.
    template <class Out = T, class Kernel>
    test_image<Out> run(Kernel&& kernel, std::optional<size> s = {}, pixel_type t = default_type<Out>()) const
    {
        const test_image<T> before = input;
        auto out = random_image<Out>(s.value_or(input.extent()), output_layout, 77, values::plain, t);
        kernel(input.view(), out.view());
        const ::testing::ScopedTrace trace(__FILE__, __LINE__, std::string("output ") + name(output_layout));
        expect_intact(out);
        const ::testing::ScopedTrace of_input(__FILE__, __LINE__, "the source after the run");
        expect_equal(input, before);
        return out;
    }

    /// Calls kernel(image) on a copy of the input and gives the copy.
    template <class Kernel>
    test_image<T> run_in_place(Kernel&& kernel) const
    {
        test_image<T> image = input;
        kernel(image.view());
        expect_intact(image);
        return image;
    }
};

/// body(const test_case<T>&) for each storage type, size, layout and level.
template <class... Types, class Body>
void for_each_case(values kind, Body&& body)
{
    const auto cases_of = [&]<class T>(pixel<T>) {
        int turn = 0;
        for_each_size([&](size s) {
            ++turn;
            for_each_layout([&](memory_layout l) {
                // Packed meets packed at every size; every other layout meets another partner at each size.
                const auto out = l == memory_layout::packed ? l : rotated(l, turn);
                const uint64_t seed = 1000 + static_cast<uint64_t>(turn) * 10 + static_cast<uint64_t>(l);
                const test_case<T> c{random_image<T>(s, l, seed, kind), out};
                step("seed " + std::to_string(seed) + ", type " + std::to_string(int(c.input.view().type)),
                     [&] { for_each_level([&](level) { body(c); }); });
            });
        });
    };
    (cases_of(pixel<Types>{}), ...);
}
template <class... Types, class Body>
void for_each_case(Body&& body)
{
    for_each_case<Types...>(values::extreme, body);
}

} // namespace Qor::Luxar::ZELT::Test
