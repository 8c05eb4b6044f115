// The sums of a convolution. Every sum starts from 0.0 and takes its products one by one, kernel rows from the first to
// the last and columns in them from the first to the last; products are rounded, then added. Many sums run side by side
// in vectors, which changes nothing in any of them.
#pragma once

#include "filters/kernels/convolve_table.h"
#include "filters/kernels/padded_row.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters {

using Filters::convolve_rows;

#if defined(__AVX512F__)
inline constexpr int vector_bytes = 64;
#elif defined(__AVX2__)
inline constexpr int vector_bytes = 32;
#else
inline constexpr int vector_bytes = 16;
#endif
typedef double doubles __attribute__((vector_size(vector_bytes)));
inline constexpr int lanes = vector_bytes / 8;

inline doubles load_vector(const double* from)
{
    doubles v;
    __builtin_memcpy(&v, from, sizeof v);
    return v;
}
inline void store_vector(double* to, doubles v) { __builtin_memcpy(to, &v, sizeof v); }

/// The sums of Rows output rows, lowest first, for as many columns as Vectors hold.
template <int Rows, int Vectors>
struct sums {
    doubles of[Rows][Vectors];
};

/// Adds one source row's products to output rows First to Last. kernel: the row of the kernel that the source
/// row meets in output row First; output row First + 1 meets the one before it.
template <int First, int Last, int Rows, int Vectors>
inline void add_row(sums<Rows, Vectors>& s, const double* kernel, int64_t width, const double* x,
                    int64_t step)
{
    x += (width - 1) * step;
    for (int64_t i = 0; i < width; ++i, x -= step) {
        doubles v[Vectors];
        for (int n = 0; n < Vectors; ++n) v[n] = load_vector(x + n * lanes);
        for (int r = First; r <= Last; ++r) {
            const double k = kernel[i - (r - First) * width];
            for (int n = 0; n < Vectors; ++n) s.of[r][n] += k * v[n];
        }
    }
}

template <int Rows, int Vectors>
void sum_tile(const convolve_rows& job, int64_t x, double* const* to)
{
    const int64_t width = job.kernel_width, height = job.kernel_height, step = job.step;
    const double* const* const rows = job.rows;
    const double* const kernel = job.kernel;
    sums<Rows, Vectors> s{};
    for (int64_t y = 0; y < height + Rows - 1; ++y) {
        const double* const row = rows[y] + x;
        // Output row r meets this source row at kernel row y - r.
        const int64_t first = y < height ? 0 : y - height + 1;
        const double* const k = kernel + (y - first) * width;
        if constexpr (Rows == 1) {
            add_row<0, 0>(s, k, width, row, step);
        } else if constexpr (Rows == 2) {
            if (y == 0)
                add_row<0, 0>(s, k, width, row, step);
            else if (y < height)
                add_row<0, 1>(s, k, width, row, step);
            else
                add_row<1, 1>(s, k, width, row, step);
        } else {
            const int64_t last = y < Rows ? y : Rows - 1;
            switch (first * 4 + last) {
            case 0: add_row<0, 0>(s, k, width, row, step); break;
            case 1: add_row<0, 1>(s, k, width, row, step); break;
            case 2: add_row<0, 2>(s, k, width, row, step); break;
            case 3: add_row<0, 3>(s, k, width, row, step); break;
            case 5: add_row<1, 1>(s, k, width, row, step); break;
            case 6: add_row<1, 2>(s, k, width, row, step); break;
            case 7: add_row<1, 3>(s, k, width, row, step); break;
            case 10: add_row<2, 2>(s, k, width, row, step); break;
            case 11: add_row<2, 3>(s, k, width, row, step); break;
            default: add_row<3, 3>(s, k, width, row, step); break;
            }
        }
    }
    for (int r = 0; r < Rows; ++r)
        for (int n = 0; n < Vectors; ++n) store_vector(to[r] + x + n * lanes, s.of[r][n]);
}

template <int Rows, int Vectors>
void sum_rows(const convolve_rows& job, double* const* to)
{
    const int64_t elements = job.elements;
    for (int64_t x = 0; x < elements; x += Vectors * lanes) sum_tile<Rows, Vectors>(job, x, to);
}
inline void sum(const convolve_rows& job, double* const* to)
{
    if (job.output_rows == 1)
        sum_rows<1, 4>(job, to);
    else if (job.output_rows == 2)
        sum_rows<2, 4>(job, to);
    else
        sum_rows<4, 2>(job, to);
}

/// Limited to the range of T and cut toward zero; a NaN becomes the lowest value. Floats take the value
/// itself.
template <class T>
void store_row(const double* sums, int64_t count, uint8_t* to)
{
    const contiguous_row<T> row{to};
    for (int64_t i = 0; i < count; ++i) {
        if constexpr (static_cast<T>(0.5) == 0) {
            constexpr bool is_signed = static_cast<T>(-1) < 0;
            constexpr auto bits = static_cast<int>(8 * sizeof(T)) - (is_signed ? 1 : 0);
            constexpr auto high = static_cast<double>((uint64_t{1} << bits) - 1);
            constexpr double low = is_signed ? -high - 1 : 0;
            double v = sums[i];
            v = v >= low ? v : low;
            v = v < high ? v : high;
            if constexpr (sizeof(T) < 4)
                row[i] = static_cast<T>(static_cast<int32_t>(v));
            else
                row[i] = static_cast<T>(v);
        } else {
            row[i] = static_cast<T>(sums[i]);
        }
    }
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters
