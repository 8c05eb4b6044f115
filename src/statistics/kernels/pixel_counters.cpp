#include "statistics/kernels/pixel_counters.h"

#include "pixel/rows.h"

#include <sleef.h>

#include <algorithm>
#include <cmath>
#include <type_traits>
#include <vector>

namespace Qor::Luxar::ZELT::Statistics {
namespace {

using namespace ZELT_LEVEL;

template <class T, class Rows>
comparison compare_rows(Rows src, double value)
{
    int64_t not_less = 0;
    int64_t more = 0;
    for (int32_t y = 0; y < src.height; ++y) {
        const auto row = src[y];
        for (int32_t x = 0; x < src.width; ++x) {
            const auto v = static_cast<double>(static_cast<T>(row[x]));
            not_less += v >= value ? 1 : 0;
            more += v > value ? 1 : 0;
        }
    }
    const int64_t all = int64_t{src.width} * src.height;
    return {all - not_less, not_less - more, more};
}

template <class T, class Rows>
int64_t count_rows(Rows src, double low, double high)
{
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

template <class T, class Rows>
double moment_of_rows(Rows src, const double* x_powers, int32_t j)
{
    double sum = 0;
    for (int32_t y = 0; y < src.height; ++y) {
        const auto row = src[y];
        const double y_power = power(y, j);
        for (int32_t x = 0; x < src.width; ++x)
            sum += x_powers[x] * y_power * static_cast<double>(static_cast<T>(row[x]));
    }
    return sum;
}

/// True when the test holds for a pixel.
template <class T, class Test>
bool any_pixel(const memory_2d& src, Test test)
{
    return with_rows<T>(src, [test](auto rows) {
        for (int32_t y = 0; y < rows.height; ++y) {
            const auto row = rows[y];
            for (int32_t x = 0; x < rows.width; ++x)
                if (test(static_cast<T>(row[x]))) return true;
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
        std::vector<double> x_powers(static_cast<size_t>(std::max(src.width, 0)));
        for (size_t x = 0; x < x_powers.size(); ++x) x_powers[x] = power(static_cast<double>(x), i);
        sum = with_rows<T>(src, [&](auto rows) { return moment_of_rows<T>(rows, x_powers.data(), j); });
    });
    return sum;
}

bool has_nan(const memory_2d& src)
{
    // A complex pixel with one NaN part does not count.
    return any_real_or_complex(src, "IsNaN: unsupported pixel type", [](auto real, auto imaginary) {
        return std::isnan(real) && std::isnan(imaginary);
    });
}

bool is_finite(const memory_2d& src)
{
    return !any_real_or_complex(src, "IsFinite: unsupported pixel type", [](auto real, auto imaginary) {
        return !std::isfinite(real) || !std::isfinite(imaginary);
    });
}

} // namespace Qor::Luxar::ZELT::Statistics
