#include "statistics/kernels/pixel_counters.h"

#include "pixel/rows.h"

#include <sleef.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <type_traits>
#include <vector>

namespace Qor::Luxar::ZELT::Statistics {
namespace {

using namespace ZELT_LEVEL;

/// Integer pixels between two limits that are whole numbers or infinite, both included.
template <class T, class Rows>
int64_t count_between(Rows src, double low, double high)
{
    using limits = std::numeric_limits<T>;
    const double first = std::max(low, static_cast<double>(limits::min()));
    const double last = std::min(high, static_cast<double>(limits::max()));
    if (!(first <= last)) return 0;
    using bits = std::make_unsigned_t<T>;
    const auto base = static_cast<bits>(static_cast<T>(first));
    const auto span = static_cast<bits>(static_cast<bits>(static_cast<T>(last)) - base);
    int64_t total = 0;
    for (int32_t y = 0; y < src.height; ++y) {
        const auto row = src[y];
        // Short runs, so that counters as narrow as the pixels suffice.
        for (int32_t start = 0; start < src.width;) {
            const int32_t end = src.width - start < 128 ? src.width : start + 128;
            bits count = 0;
            for (int32_t x = start; x < end; ++x) {
                const auto above = static_cast<bits>(static_cast<bits>(static_cast<T>(row[x])) - base);
                count = static_cast<bits>(count + (above <= span ? 1 : 0));
            }
            total += count;
            start = end;
        }
    }
    return total;
}

constexpr double infinite = std::numeric_limits<double>::infinity();

template <class T, class Rows>
comparison compare_rows(Rows src, double value)
{
    const int64_t all = int64_t{src.width} * src.height;
    if (std::isnan(value)) return {all, 0, 0};
    int64_t more = 0;
    if constexpr (std::is_integral_v<T>) {
        // A whole number is below a value when it is at most the last whole number that is.
        const int64_t less = count_between<T>(src, -infinite, std::ceil(value) - 1);
        more = count_between<T>(src, std::floor(value) + 1, infinite);
        return {less, all - less - more, more};
    } else {
        int64_t not_less = 0;
        for (int32_t y = 0; y < src.height; ++y) {
            const auto row = src[y];
            for (int32_t x = 0; x < src.width; ++x) {
                const auto v = static_cast<double>(static_cast<T>(row[x]));
                not_less += v >= value ? 1 : 0;
                more += v > value ? 1 : 0;
            }
        }
        return {all - not_less, not_less - more, more};
    }
}

template <class T, class Rows>
int64_t count_rows(Rows src, double low, double high)
{
    if constexpr (std::is_integral_v<T>) {
        if (std::isnan(low)) return 0;
        return count_between<T>(src, std::ceil(low), std::isnan(high) ? infinite : std::floor(high));
    } else {
        int64_t n = 0;
        for (int32_t y = 0; y < src.height; ++y) {
            const auto row = src[y];
            for (int32_t x = 0; x < src.width; ++x) {
                const auto v = static_cast<double>(static_cast<T>(row[x]));
                n += v >= low && !(v > high) ? 1 : 0;
            }
        }
        return n;
    }
}

template <class T, class Rows>
rectangle bounds_of_rows(Rows src)
{
    rectangle box{src.width, src.height, 0, 0};
    const auto holds = [](T v) { return v < 0 || v > 0; }; // a NaN does not
    for (int32_t y = 0; y < src.height; ++y) {
        const auto row = src[y];
        int32_t first = 0;
        while (first < src.width && !holds(row[first])) ++first;
        if (first == src.width) continue;
        int32_t last = src.width - 1;
        while (!holds(row[last])) --last;
        box.left = std::min(box.left, first);
        box.top = std::min(box.top, y);
        box.right = std::max(box.right, last);
        box.bottom = y;
    }
    // Deliberately only edges that are not 0 become exclusive: clients have always seen an empty box for content that
    // lies in the first row or column alone.
    if (box.right != 0) ++box.right;
    if (box.bottom != 0) ++box.bottom;
    return box;
}

// The mathematical library's own pow differs in last bits between processors.
double power(double base, int32_t exponent)
{
    return exponent == 2 ? base * base : Sleef_cinz_powd1_u10purec(base, exponent);
}

// The powers come in tables: a call between the rows would keep the sum in memory.
template <class T, class Rows>
double moment_of_rows(Rows src, const double* x_powers, const double* y_powers)
{
    double sum = 0;
    for (int32_t y = 0; y < src.height; ++y) {
        const auto row = src[y];
        const double y_power = y_powers[y];
        for (int32_t x = 0; x < src.width; ++x)
            sum += x_powers[x] * y_power * static_cast<double>(static_cast<T>(row[x]));
    }
    return sum;
}

std::vector<double> powers(int32_t count, int32_t exponent)
{
    std::vector<double> table(static_cast<size_t>(std::max(count, 0)));
    for (size_t i = 0; i < table.size(); ++i) table[i] = power(static_cast<double>(i), exponent);
    return table;
}

/// True when the test holds for a pixel.
template <class T, class Test>
bool any_pixel(const memory_2d& src, Test test)
{
    return with_rows<T>(src, [test](auto rows) {
        for (int32_t y = 0; y < rows.height; ++y) {
            const auto row = rows[y];
            uint32_t found = 0; // a row is searched in vectors, without a way out
            for (int32_t x = 0; x < rows.width; ++x) found |= test(static_cast<T>(row[x])) ? 1 : 0;
            if (found != 0) return true;
        }
        return false;
    });
}

/// The answer for integers, which are not read, or what a scan of real or complex pixels says.
template <class Test>
bool any_real_or_complex(const memory_2d& src, const char* unsupported, Test test)
{
    switch (src.type) {
    case pixel_type::unsigned_8:
    case pixel_type::unsigned_16:
    case pixel_type::unsigned_32:
    case pixel_type::unsigned_64:
    case pixel_type::signed_8:
    case pixel_type::signed_16:
    case pixel_type::signed_32:
    case pixel_type::signed_64: return false;
    case pixel_type::float_32: return any_pixel<float>(src, [=](float v) { return test(v, v); });
    case pixel_type::float_64: return any_pixel<double>(src, [=](double v) { return test(v, v); });
    case pixel_type::complex_32:
    case pixel_type::half_even_32:
    case pixel_type::half_odd_32:
        return any_pixel<complex_pixel<float>>(src, [=](auto v) { return test(v.real, v.imaginary); });
    case pixel_type::complex_64:
    case pixel_type::half_even_64:
    case pixel_type::half_odd_64:
        return any_pixel<complex_pixel<double>>(src, [=](auto v) { return test(v.real, v.imaginary); });
    default: throw std::invalid_argument(unsupported);
    }
}

} // namespace

comparison compare_pixels(const memory_2d& src, double value)
{
    comparison c;
    switch_scalar(src.type, "Count: unsupported pixel type", [&]<class T>(pixel<T>) {
        c = with_rows<T>(src, [=](auto rows) { return compare_rows<T>(rows, value); });
    });
    return c;
}

int64_t count_range(const memory_2d& src, double low, double high)
{
    int64_t n = 0;
    switch_scalar(src.type, "CountRange: unsupported pixel type", [&]<class T>(pixel<T>) {
        n = with_rows<T>(src, [=](auto rows) { return count_rows<T>(rows, low, high); });
    });
    return n;
}

rectangle bounding_box(const memory_2d& src)
{
    rectangle box;
    switch_scalar(src.type, "BoundingBox: unsupported pixel type", [&]<class T>(pixel<T>) {
        box = with_rows<T>(src, [](auto rows) { return bounds_of_rows<T>(rows); });
    });
    return box;
}

double moment(const memory_2d& src, int32_t i, int32_t j)
{
    double sum = 0;
    switch_scalar(src.type, "Moment: unsupported pixel type", [&]<class T>(pixel<T>) {
        const auto x_powers = powers(src.width, i);
        const auto y_powers = powers(src.height, j);
        sum = with_rows<T>(
            src, [&](auto rows) { return moment_of_rows<T>(rows, x_powers.data(), y_powers.data()); });
    });
    return sum;
}

bool has_nan(const memory_2d& src)
{
    // A complex pixel with one NaN part does not count.
    return any_real_or_complex(src, "IsNaN: unsupported pixel type", [](auto real, auto imaginary) {
        return (real != real) & (imaginary != imaginary);
    });
}

bool is_finite(const memory_2d& src)
{
    return !any_real_or_complex(src, "IsFinite: unsupported pixel type", [](auto real, auto imaginary) {
        return (real - real != 0) | (imaginary - imaginary != 0);
    });
}

} // namespace Qor::Luxar::ZELT::Statistics
