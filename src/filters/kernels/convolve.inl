// The sums of a convolution. Every sum starts from 0.0 and takes its products one by one, kernel rows from the first to
// the last and columns in them from the first to the last; products are rounded, then added. Many sums run side by side
// in vectors, which changes nothing in any of them.
#pragma once

#include "filters/kernels/convolve_table.h"
#include "filters/kernels/padded_row.inl"
#include "filters/kernels/store_as.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters {

using Filters::convolve_rows;

/// Adds one source row's products to output rows First to Last. kernel: the row of the kernel that the source
/// row meets in output row First; output row First + 1 meets the one before it.
template <joined How, int First, int Last, int Rows, int Count, class E>
ZELT_INLINE void add_row(tile<Rows, Count>& sum, const double* kernel, int64_t width, const E* x,
                         int64_t step)
{
    x += (width - 1) * step;
    for (int64_t i = 0; i < width; ++i, x -= step) {
        vectors<Count> v;
        load(v, x);
        add_products<How, First, Last>(sum, kernel + i, width, v);
    }
}

/// As much of some output rows as a tile holds, from column x on, for a kernel of any size.
template <joined How, int Rows, int Count, class E>
[[gnu::noinline]] void sum_tile(const convolve_rows<E>& job, int64_t x, double* const* to)
{
    const int64_t width = job.kernel_width, height = job.kernel_height, step = job.step;
    const E* const* const rows = job.rows;
    const double* const kernel = job.kernel;
    tile<Rows, Count> sum{};
    for (int64_t y = 0; y < height + Rows - 1; ++y) {
        const E* const row = rows[y] + x;
        // Output row r meets this source row at kernel row y - r.
        const int64_t first = y < height ? 0 : y - height + 1;
        const int64_t last = y < Rows ? y : Rows - 1;
        const double* const k = kernel + (y - first) * width;
        if constexpr (Rows == 1) {
            add_row<How, 0, 0>(sum, k, width, row, step);
        } else {
            switch (first * Rows + last) {
            case 0: add_row<How, 0, 0>(sum, k, width, row, step); break;
            case 1: add_row<How, 0, 1>(sum, k, width, row, step); break;
            case 2: add_row<How, 0, 2>(sum, k, width, row, step); break;
            case 3: add_row<How, 0, 3>(sum, k, width, row, step); break;
            case 5: add_row<How, 1, 1>(sum, k, width, row, step); break;
            case 6: add_row<How, 1, 2>(sum, k, width, row, step); break;
            case 7: add_row<How, 1, 3>(sum, k, width, row, step); break;
            case 10: add_row<How, 2, 2>(sum, k, width, row, step); break;
            case 11: add_row<How, 2, 3>(sum, k, width, row, step); break;
            default: add_row<How, 3, 3>(sum, k, width, row, step); break;
            }
        }
    }
    for_each_vector(sum, [&](int r, int i, doubles v) { store_vector(to[r] + x + i, v); });
}

/// Asks for bytes begin to end of the output rows and of the source rows that will be asked for next.
template <int Rows, class E>
ZELT_INLINE void prefetch(const convolve_rows<E>& job, uint8_t* const* to, int64_t begin, int64_t end)
{
    for (int r = 0; r < Rows; ++r)
        filters::prefetch(job.next_row ? job.next_row + r * job.next_stride : nullptr, to[r], begin, end);
}

template <joined How, class T, int Rows, int Count, class E>
void sum_rows(const convolve_rows<E>& job, uint8_t* const* to)
{
    constexpr int64_t chunk = 192, bytes = sizeof(T), columns = Count * lanes;
    static_assert(chunk % columns == 0);
    const int64_t elements = job.elements;
    alignas(64) double sums[Rows][chunk];
    double* into[Rows];
    for (int64_t begin = 0; begin < elements; begin += chunk) {
        const int64_t end = elements - begin < chunk ? elements : begin + chunk;
        for (int r = 0; r < Rows; ++r) into[r] = sums[r] - begin;
        for (int64_t x = begin; x < end; x += columns) {
            prefetch<Rows>(job, to, (x + chunk) * bytes, (x + chunk + columns) * bytes);
            sum_tile<How, Rows, Count>(job, x, into);
        }
        for (int r = 0; r < Rows; ++r) {
            int64_t x = begin;
            for (; x + lanes <= end; x += lanes) store_as<T>(load_vector(into[r] + x), to[r] + x * bytes);
            if (x < end) store_some_as<T>(load_vector(into[r] + x), end - x, to[r] + x * bytes);
        }
    }
}

template <joined How, class T, class E>
void sum(const convolve_rows<E>& job, uint8_t* const* to)
{
    if (job.output_rows == 1)
        sum_rows<How, T, 1, 4>(job, to);
    else
        sum_rows<How, T, 4, vector_bytes == 64 ? 6 : 2>(job, to);
}

// A kernel of 3 x 3, the one in most use, without loops.

template <joined How, int Y, int Rows, class E>
ZELT_INLINE void add_rows_of_3x3(tile<Rows, 1>& sum, const double* kernel, const E* const* rows, int64_t x,
                                 int64_t step)
{
    constexpr int size = 3;
    if constexpr (Y < size + Rows - 1) {
        constexpr int first = Y < size ? 0 : Y - size + 1, last = Y < Rows ? Y : Rows - 1;
        add_row<How, first, last>(sum, kernel + (Y - first) * size, size, rows[Y] + x, step);
        add_rows_of_3x3<How, Y + 1>(sum, kernel, rows, x, step);
    }
}

template <joined How, class T, int Rows, class E>
void sum_rows_3x3(const convolve_rows<E>& job, uint8_t* const* to)
{
    constexpr int64_t chunk = 64, bytes = sizeof(T);
    const E* rows[Rows + 2];
    for (int i = 0; i < Rows + 2; ++i) rows[i] = job.rows[i];
    uint8_t* into[Rows];
    for (int i = 0; i < Rows; ++i) into[i] = to[i];
    const double* const kernel = job.kernel;
    const int64_t step = job.step, elements = job.elements;
    for (int64_t x = 0; x < elements; x += lanes) {
        if (x % chunk == 0) prefetch<Rows>(job, into, (x + chunk) * bytes, (x + 2 * chunk) * bytes);
        tile<Rows, 1> sum{};
        add_rows_of_3x3<How, 0>(sum, kernel, rows, x, step);
        if (const int64_t rest = elements - x; rest >= lanes)
            for_each_vector(sum, [&](int r, int, doubles v) { store_as<T>(v, into[r] + x * bytes); });
        else
            for_each_vector(sum,
                            [&](int r, int, doubles v) { store_some_as<T>(v, rest, into[r] + x * bytes); });
    }
}

template <joined How, class T, class E>
void sum_3x3(const convolve_rows<E>& job, uint8_t* const* to)
{
    if (job.output_rows == 1)
        sum_rows_3x3<How, T, 1>(job, to);
    else
        sum_rows_3x3<How, T, 4>(job, to);
}

template <class T, class E>
inline constexpr Filters::convolve_loops<E> convolve_loops_of{
    .load = load_padded_row<T, E>,
    .sum = {sum<joined::rounded, T, E>, sum_3x3<joined::rounded, T, E>},
    .sum_exact = {sum<exact_products, T, E>, sum_3x3<exact_products, T, E>}};

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters
