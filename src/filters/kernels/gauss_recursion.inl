// The recursive filter: forward and backward along rows, then down and up along columns.
//
// A recursion is serial along its line, so many lines go side by side: the rows of a block as the lanes of a strip
// [x][row], the columns as they lie in the scratch. The order of operations of a pixel is that of the formula. The
// scratch keeps the rounded results of the first three passes; a pass itself continues with unrounded ones, and
// the way back starts from the last of them.
#pragma once

#include "filters/kernels/gauss_store.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::gauss {

using Filters::gauss_job;
using Filters::gauss_plane;
using Filters::recursion;

inline constexpr int rows_at_once = 16;
inline constexpr int64_t columns_at_once = 512;

template <class T>
struct scratch_of {
    using type = float;
};
template <>
struct scratch_of<double> {
    using type = double;
};

/// The results of three steps of neighbouring lines. Each step replaces the oldest.
struct history {
    double* newest;
    double* middle;
    double* oldest;

    void turn()
    {
        double* const replaced = oldest;
        oldest = middle;
        middle = newest;
        newest = replaced;
    }
};

/// One step of `count` lines; h.newest holds the unrounded results afterwards.
template <class In, class Out>
inline void step(recursion f, int64_t count, const In* in, Out* out, history& h)
{
    const double* const y1 = h.newest;
    const double* const y2 = h.middle;
    double* const y3 = h.oldest;
    for (int64_t i = 0; i < count; ++i) {
        const double y = f.b * static_cast<double>(in[i]) + f.a1 * y1[i] + f.a2 * y2[i] + f.a3 * y3[i];
        y3[i] = y;
        out[i] = static_cast<Out>(y);
    }
    h.turn();
}

template <class T>
inline T pixel_at(const gauss_plane& p, int64_t x, int64_t y)
{
    T value;
    __builtin_memcpy(&value, p.first + y * p.y_stride + x * p.x_stride, sizeof value);
    return value;
}

/// Both passes over the rows [top, top + rows) from the source into the scratch.
template <class T, class S>
void along_rows(const gauss_job& job, int64_t top, int64_t rows)
{
    double numbers[3][rows_at_once] = {};
    history h{numbers[0], numbers[1], numbers[2]};
    double in[rows_at_once] = {};
    S* const strip = static_cast<S*>(job.lanes);
    const int64_t width = job.width;

    for (int64_t r = 0; r < rows; ++r)
        for (auto& n : numbers) n[r] = static_cast<double>(pixel_at<T>(job.src, 0, top + r));
    for (int64_t x = 0; x < width; ++x) {
        for (int64_t r = 0; r < rows; ++r) in[r] = static_cast<double>(pixel_at<T>(job.src, x, top + r));
        step(job.filter, rows_at_once, in, strip + x * rows_at_once, h);
    }
    for (int64_t r = 0; r < rows; ++r) h.middle[r] = h.oldest[r] = h.newest[r];
    for (int64_t x = width - 1; x >= 0; --x) {
        S* const lanes = strip + x * rows_at_once;
        step(job.filter, rows_at_once, lanes, lanes, h);
        for (int64_t r = 0; r < rows; ++r)
            __builtin_memcpy(job.scratch.first + (top + r) * job.scratch.y_stride + x * int64_t{sizeof(S)},
                             lanes + r, sizeof(S));
    }
}

template <class T>
void rows_and_down(const gauss_job& job)
{
    using S = typename scratch_of<T>::type;
    const int64_t width = job.width, height = job.height;
    double* const numbers[3] = {job.history, job.history + width, job.history + 2 * width};
    for (int64_t top = 0; top < height; top += rows_at_once) {
        const int64_t rows = height - top < rows_at_once ? height - top : rows_at_once;
        along_rows<T, S>(job, top, rows);
        if (top == 0)
            for (double* const n : numbers)
                for (int64_t x = 0; x < width; ++x)
                    n[x] = static_cast<double>(reinterpret_cast<const S*>(job.scratch.first)[x]);
        for (int64_t left = 0; left < width; left += columns_at_once) {
            const int64_t count = width - left < columns_at_once ? width - left : columns_at_once;
            // Row y replaces what row y - 3 has left.
            history h{numbers[(top + 2) % 3] + left, numbers[(top + 1) % 3] + left, numbers[top % 3] + left};
            for (int64_t y = top; y < top + rows; ++y) {
                S* const row = reinterpret_cast<S*>(job.scratch.first + y * job.scratch.y_stride) + left;
                step(job.filter, count, row, row, h);
            }
        }
    }
}

/// The last pass, bottom to top. Store says how its numbers become pixels.
template <class S, class Store>
void up_as(const gauss_job& job)
{
    const int64_t width = job.width, height = job.height;
    const double* const last = job.history + (height - 1) % 3 * width;
    double numbers[3][columns_at_once];
    for (int64_t left = 0; left < width; left += columns_at_once) {
        const int64_t count = width - left < columns_at_once ? width - left : columns_at_once;
        for (auto& n : numbers)
            for (int64_t i = 0; i < count; ++i) n[i] = last[left + i];
        history h{numbers[0], numbers[1], numbers[2]};
        for (int64_t y = height - 1; y >= 0; --y) {
            S* const row = reinterpret_cast<S*>(job.scratch.first + y * job.scratch.y_stride) + left;
            S rounded[columns_at_once];
            step(job.filter, count, row, rounded, h);
            store<Store>(h.newest, count, job.dst.first + y * job.dst.y_stride + left * job.dst.x_stride,
                         job.dst.x_stride);
        }
    }
}

template <class T>
void up(const gauss_job& job)
{
    up_as<typename scratch_of<T>::type, cut<T>>(job);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::gauss
