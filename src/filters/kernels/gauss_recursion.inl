// The recursive filter: forward and backward along rows, then down and up along columns.
//
// A recursion is serial along its line, so many lines go side by side in vectors: rows for the passes along rows,
// columns for the others. Square blocks are turned between the two while they are in the cache. The order of operations
// of a pixel is that of the formula. The scratch keeps the rounded results of the first three passes; a pass itself
// continues with unrounded ones, and the way back starts from the last of them.
#pragma once

#include "filters/kernels/gauss_store.inl"
#include "filters/kernels/padded_row.inl"
#include "filters/kernels/tile.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::gauss {

using filters::doubles;
using Filters::gauss_job;
using Filters::gauss_plane;
using filters::lanes;
using Filters::recursion;

/// Lines that go side by side. A step waits for four operations of the step before; as many vectors fill that time.
inline constexpr int vectors_at_once = 4;
inline constexpr int64_t block = vectors_at_once * lanes;

/// What the scratch keeps, and what pixels are read as: floats where these hold every value.
template <class T>
struct scratch_of {
    using type = float;
};
template <>
struct scratch_of<double> {
    using type = double;
};
template <class T>
struct number_of {
    using type = float;
};
template <>
struct number_of<uint32_t> {
    using type = double;
};
template <>
struct number_of<int32_t> {
    using type = double;
};
template <>
struct number_of<double> {
    using type = double;
};

/// The results of three steps of neighbouring lines.
template <int Count>
struct history {
    doubles newest, middle, oldest;
    history<Count - 1> more;
};
template <>
struct history<0> {
};
using block_history = history<vectors_at_once>;

/// One step; the results replace the oldest ones.
template <class In, class Out, int Count>
ZELT_INLINE void step(const recursion& f, history<Count>& h, const In* in, Out* out)
{
    if constexpr (Count > 0) {
        const doubles y =
            f.b * filters::load_vector(in) + f.a1 * h.newest + f.a2 * h.middle + f.a3 * h.oldest;
        h.oldest = h.middle;
        h.middle = h.newest;
        h.newest = y;
        filters::store_vector(out, y);
        step(f, h.more, in + lanes, out + lanes);
    }
}

template <class In, int Count>
ZELT_INLINE void start_from(history<Count>& h, const In* numbers)
{
    if constexpr (Count > 0) {
        h.newest = h.middle = h.oldest = filters::load_vector(numbers);
        start_from(h.more, numbers + lanes);
    }
}

/// The way back.
template <int Count>
ZELT_INLINE void start_from_newest(history<Count>& h)
{
    if constexpr (Count > 0) {
        h.middle = h.oldest = h.newest;
        start_from_newest(h.more);
    }
}

/// History of a block of columns between blocks of rows: three groups of `block` numbers.
template <int Count>
ZELT_INLINE void load(history<Count>& h, const double* from)
{
    if constexpr (Count > 0) {
        h.newest = filters::load_vector(from);
        h.middle = filters::load_vector(from + block);
        h.oldest = filters::load_vector(from + 2 * block);
        load(h.more, from + lanes);
    }
}
template <int Count>
ZELT_INLINE void store(const history<Count>& h, double* to)
{
    if constexpr (Count > 0) {
        filters::store_vector(to, h.newest);
        filters::store_vector(to + block, h.middle);
        filters::store_vector(to + 2 * block, h.oldest);
        store(h.more, to + lanes);
    }
}

ZELT_INLINE int64_t least(int64_t a, int64_t b) { return a < b ? a : b; }

/// Asks for a row of the block that comes after, while this one is worked on: memory takes about as long.
template <class T, int Write>
ZELT_INLINE void prefetch(const gauss_plane& of, int64_t left, int64_t y)
{
    constexpr int64_t line = 64, bytes = block * int64_t{sizeof(T)};
    const uint8_t* const pixels = of.first + y * of.y_stride + left * of.x_stride;
    for (int64_t i = 0; i < bytes; i += line) __builtin_prefetch(pixels + i, Write);
}

/// Reads a block of pixels. Rows and columns that are missing at the end stay as they are.
template <class T, class N>
void read_block(const gauss_plane& from, int64_t left, int64_t columns, int64_t top, int64_t rows, N* to)
{
    for (int64_t y = top; y < top + rows; ++y, to += block) {
        uint8_t* const pixels = from.first + y * from.y_stride + left * from.x_stride;
        if (from.x_stride != int64_t{sizeof(T)}) {
            const strided_row<T> row{pixels, from.x_stride};
            for (int64_t x = 0; x < columns; ++x) to[x] = static_cast<N>(static_cast<T>(row[x]));
        } else if (columns == block) {
            filters::convert_run<T>(pixels, block, to); // of a length that compilers know
        } else {
            filters::convert_run<T>(pixels, columns, to);
        }
    }
}

/// Turns rows into columns.
template <class N>
void transpose_block(const N* from, N* to)
{
    typedef N four __attribute__((vector_size(4 * sizeof(N))));
    for (int64_t y = 0; y < block; y += 4)
        for (int64_t x = 0; x < block; x += 4) {
            four row[4], column[4];
            for (int i = 0; i < 4; ++i) __builtin_memcpy(&row[i], from + (y + i) * block + x, sizeof(four));
            const four low_02 = __builtin_shufflevector(row[0], row[2], 0, 4, 1, 5);
            const four low_13 = __builtin_shufflevector(row[1], row[3], 0, 4, 1, 5);
            const four high_02 = __builtin_shufflevector(row[0], row[2], 2, 6, 3, 7);
            const four high_13 = __builtin_shufflevector(row[1], row[3], 2, 6, 3, 7);
            column[0] = __builtin_shufflevector(low_02, low_13, 0, 4, 1, 5);
            column[1] = __builtin_shufflevector(low_02, low_13, 2, 6, 3, 7);
            column[2] = __builtin_shufflevector(high_02, high_13, 0, 4, 1, 5);
            column[3] = __builtin_shufflevector(high_02, high_13, 2, 6, 3, 7);
            for (int i = 0; i < 4; ++i) __builtin_memcpy(to + (x + i) * block + y, &column[i], sizeof(four));
        }
}

/// Writes a block into the scratch.
template <class S>
void write_block(const S* from, const gauss_job& job, int64_t left, int64_t columns, int64_t top,
                 int64_t rows)
{
    constexpr int64_t bytes = block * int64_t{sizeof(S)};
    for (int64_t y = top; y < top + rows; ++y, from += block) {
        uint8_t* const row = job.scratch.first + y * job.scratch.y_stride + left * int64_t{sizeof(S)};
        if (columns < block) {
            __builtin_memcpy(row, from, sizeof(S) * static_cast<size_t>(columns));
        } else if (bytes % filters::line_bytes == 0 && job.beyond_cache) {
            for (int64_t i = 0; i < bytes; i += filters::line_bytes)
                filters::stream_line(reinterpret_cast<const uint8_t*>(from) + i, row + i);
        } else {
            __builtin_memcpy(row, from, bytes);
        }
    }
}

/// Both passes along a block of rows, and on the way back the pass down its columns.
template <class T>
void rows_and_down_block(const gauss_job& job, int64_t top)
{
    using S = typename scratch_of<T>::type;
    using N = typename number_of<T>::type;
    const recursion f = job.filter;
    const int64_t width = job.width, rows = least(block, job.height - top);
    S* const strip = static_cast<S*>(job.lanes);
    alignas(64) N pixels[block * block] = {}, across[block * block];
    alignas(64) S results[block * block];
    block_history h{};

    for (int64_t left = 0; left < width; left += block) {
        const int64_t columns = least(block, width - left);
        read_block<T>(job.src, left, columns, top, rows, pixels);
        transpose_block(pixels, across);
        if (left == 0) start_from(h, across);
        for (int64_t x = 0; x < columns; ++x) {
            prefetch<T, 0>(job.src, left + block, top + x);
            step(f, h, across + x * block, strip + (left + x) * block);
        }
    }
    start_from_newest(h);
    for (int64_t left = (width - 1) / block * block; left >= 0; left -= block) {
        const int64_t columns = least(block, width - left);
        alignas(64) S turned[block * block];
        for (int64_t x = columns - 1; x >= 0; --x) step(f, h, strip + (left + x) * block, turned + x * block);
        transpose_block(turned, results);
        block_history down{};
        double* const numbers = job.history + 3 * left;
        if (top == 0)
            start_from(down, results);
        else
            load(down, numbers);
        for (int64_t r = 0; r < rows; ++r) step(f, down, results + r * block, results + r * block);
        store(down, numbers);
        write_block(results, job, left, columns, top, rows);
    }
}

template <class T>
void rows_and_down(const gauss_job& job)
{
    for (int64_t top = 0; top < job.height; top += block) rows_and_down_block<T>(job, top);
}

/// Rows of the last pass, which nothing needs to be turned for: few enough for the processor to read ahead.
inline constexpr int64_t band = 8;

/// The last pass, bottom to top. Store says how its numbers become pixels.
template <class S, class Store>
void up_as(const gauss_job& job)
{
    const recursion f = job.filter;
    const int64_t width = job.width, height = job.height;
    alignas(64) S numbers[band * block] = {};
    alignas(64) double results[band * block];
    for (int64_t bottom = height; bottom > 0; bottom -= band) {
        const int64_t rows = least(band, bottom), top = bottom - rows;
        for (int64_t left = 0; left < width; left += block) {
            const int64_t columns = least(block, width - left);
            read_block<S>(job.scratch, left, columns, top, rows, numbers);
            block_history h{};
            double* const kept = job.history + 3 * left;
            load(h, kept);
            if (bottom == height) start_from_newest(h);
            for (int64_t r = rows - 1; r >= 0; --r) {
                prefetch<S, 0>(job.scratch, left + 4 * block, top + r);
                prefetch<typename Store::pixel, 1>(job.dst, left + 4 * block, top + r);
                step(f, h, numbers + r * block, results + r * block);
            }
            store(h, kept);
            for (int64_t r = 0; r < rows; ++r) {
                uint8_t* const to = job.dst.first + (top + r) * job.dst.y_stride + left * job.dst.x_stride;
                if (columns == block && job.dst.x_stride == sizeof(typename Store::pixel)) {
                    // Of a length and a stride that compilers know.
                    store<Store>(results + r * block, block, to, sizeof(typename Store::pixel));
                } else {
                    store<Store>(results + r * block, columns, to, job.dst.x_stride);
                }
            }
        }
    }
}

template <class T>
void up(const gauss_job& job)
{
    up_as<typename scratch_of<T>::type, cut<T>>(job);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::gauss
