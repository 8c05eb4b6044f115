// The definition of pixel-wise arithmetic on single values, and images of any real type to hold it against.
#pragma once

#include "arithmetic/kernels/binary.h"
#include "support/cases.h"

namespace Qor::Luxar::ZELT::Test {

using Arithmetic::method;
using Arithmetic::outcome;
using Arithmetic::storage;

inline constexpr storage real_types[] = {storage::u8,  storage::u16, storage::u32, storage::i8,
                                         storage::i16, storage::i32, storage::f32, storage::f64};
inline constexpr method all_methods[] = {method::add,      method::subtract, method::reverse_subtract,
                                         method::multiply, method::divide,   method::reverse_divide,
                                         method::min,      method::max,      method::assign};

inline bool is_integer(storage t) { return t <= storage::i32; }
inline pixel_type type_of(storage t)
{
    constexpr pixel_type types[] = {pixel_type::unsigned_8, pixel_type::unsigned_16, pixel_type::unsigned_32,
                                    pixel_type::signed_8,   pixel_type::signed_16,   pixel_type::signed_32,
                                    pixel_type::float_32,   pixel_type::float_64};
    return types[static_cast<int>(t)];
}
inline std::string name(storage t)
{
    constexpr const char* names[] = {"u8", "u16", "u32", "i8", "i16", "i32", "f32", "f64"};
    return names[static_cast<int>(t)];
}

template <class T>
Arithmetic::image image_of(const test_image<T>& i)
{
    return {i.layout(), static_cast<uint8_t*>(i.data())};
}

/// A pixel or number: every real type fits into one of the two.
struct plain_value {
    storage type;
    int64_t whole;
    double real;
};

/// Truncated to 64 bits; 0 for NaN and beyond.
inline int64_t truncated(double v)
{
    return v >= -0x1p63 && v < 0x1p63 ? static_cast<int64_t>(v) : 0; // false for NaN
}

/// What is stored into a pixel of `to` with so many nominal bits, as a double or an integer whose low bits count.
inline plain_value by_definition(method m, bool saturate, plain_value a, plain_value b, storage to, int bits)
{
    const auto limited = [&](auto v, auto lower, auto upper) {
        using W = decltype(v);
        if (!saturate || m == method::min || m == method::max || m == method::assign) return v;
        if (!(v >= static_cast<W>(lower))) return static_cast<W>(lower);
        return v < static_cast<W>(upper) ? v : static_cast<W>(upper);
    };
    const auto operated = [&](auto x, auto y) {
        switch (m) {
        case method::add: return x + y;
        case method::subtract: return x - y;
        case method::reverse_subtract: return y - x;
        case method::multiply: return x * y;
        case method::divide: return x / y;
        case method::reverse_divide: return y / x;
        case method::min: return y < x ? y : x;
        case method::max: return x < y ? y : x;
        default: return y;
        }
    };
    const bool to_signed = to >= storage::i8 && to <= storage::i32;
    const int64_t lower = to_signed ? -(int64_t{1} << (bits - 1)) : 0;
    const int64_t upper = !is_integer(to) ? 1
                          : to_signed     ? (int64_t{1} << (bits - 1)) - 1
                                          : (int64_t{1} << bits) - 1;

    if (is_integer(a.type) && is_integer(b.type)) {
        const bool both_signed = a.type >= storage::i8 && b.type >= storage::i8;
        int64_t v;
        if (both_signed) {
            v = limited(static_cast<int32_t>(operated(a.whole, b.whole)), lower, upper);
        } else { // products of 32 bits fit into 64 without sign
            const uint64_t x = static_cast<uint32_t>(a.whole), y = static_cast<uint32_t>(b.whole);
            v = limited(static_cast<uint32_t>(operated(x, y)), lower, upper);
        }
        return {to, v, static_cast<double>(v)};
    }
    const auto as_real = [](plain_value p) {
        return is_integer(p.type) ? static_cast<double>(p.whole) : p.real;
    };
    double v;
    if (a.type == storage::f64 || b.type == storage::f64)
        v = limited(operated(as_real(a), as_real(b)), lower, upper);
    else
        v = static_cast<double>(
            limited(operated(static_cast<float>(as_real(a)), static_cast<float>(as_real(b))), lower, upper));
    return {to, truncated(v), v};
}

/// An image of any real type.
class real_image {
public:
    real_image(storage type, size s, memory_layout l)
        : type_(type), size_(s), memory_(s, l, Arithmetic::bytes_of(type))
    {
    }

    /// Random pixels, the special ones of the type among them.
    void fill(uint64_t seed)
    {
        generator random(seed);
        for (int y = 0; y < size_.height; ++y)
            for (int x = 0; x < size_.width; ++x)
                switch_scalar(type_of(type_), [&]<class T>(pixel<T>) {
                    const T v = random_value<T>(random, values::special);
                    std::memcpy(memory_.at(x, y), &v, sizeof v);
                });
    }
    /// Sets every pixel to f(x, y), which has the storage type.
    template <class F>
    void set(F&& f)
    {
        for (int y = 0; y < size_.height; ++y)
            for (int x = 0; x < size_.width; ++x) {
                const auto v = f(x, y);
                std::memcpy(memory_.at(x, y), &v, sizeof v);
            }
    }
    void replace_zeros()
    {
        for (int y = 0; y < size_.height; ++y)
            for (int x = 0; x < size_.width; ++x)
                if (at(x, y).whole == 0) *memory_.at(x, y) = 3;
    }

    plain_value at(int x, int y) const
    {
        plain_value v{type_, 0, 0};
        switch_scalar(type_of(type_), [&]<class T>(pixel<T>) {
            T p;
            std::memcpy(&p, memory_.at(x, y), sizeof p);
            if constexpr (std::is_integral_v<T>) v.whole = p;
            v.real = static_cast<double>(p);
        });
        return v;
    }
    storage type() const { return type_; }

    Arithmetic::image view(int nominal_bits = 0) const
    {
        const pixel_type t = type_of(type_);
        return {{size_.width, size_.height, nominal_bits ? nominal_bits : GetPixmatBits(t),
                 GetPixmatEncoding(t), static_cast<int32_t>(memory_.offset),
                 static_cast<int32_t>(memory_.x_stride), static_cast<int32_t>(memory_.y_stride)},
                memory_.data()};
    }

    /// Every pixel holds the low bits, or the rounded real value, of expected(x, y).
    template <class Expected>
    void expect(Expected&& expected) const
    {
        EXPECT_FALSE(memory_.damage()) << "a byte outside the pixels was written";
        for (int y = 0; y < size_.height; ++y)
            for (int x = 0; x < size_.width; ++x) {
                const plain_value want = expected(x, y);
                bool right = true;
                switch_scalar(type_of(type_), [&]<class T>(pixel<T>) {
                    T got;
                    std::memcpy(&got, memory_.at(x, y), sizeof got);
                    if constexpr (std::is_integral_v<T>)
                        right = got == static_cast<T>(want.whole);
                    else
                        right = same_bits(got, static_cast<T>(want.real));
                });
                if (right) continue;
                ADD_FAILURE() << name(type_) << " at (" << x << ", " << y << "): got " << at(x, y).whole
                              << " / " << at(x, y).real << ", expected " << want.whole << " / " << want.real;
                return;
            }
    }

private:
    storage type_;
    size size_;
    pixel_memory memory_;
};

} // namespace Qor::Luxar::ZELT::Test
