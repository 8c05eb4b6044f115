// The one loop of the family: an operation on a pixel of each operand, along a row.
#pragma once

#include "flatfield/kernels/row_job.h"
#include "pixel/rows.h"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::flatfield {

using FlatField::plane;
using FlatField::row_function;
using FlatField::row_job;

template <class A, class B>
struct is_same {
    static constexpr bool value = false;
};
template <class A>
struct is_same<A, A> {
    static constexpr bool value = true;
};
template <class T>
inline constexpr bool is_real = is_same<T, float>::value || is_same<T, double>::value;
template <class T>
inline constexpr bool is_narrow = !is_real<T> && sizeof(T) < 4;

template <template <class> class Row, class T>
Row<T> row_of(const plane& p, int64_t y)
{
    if constexpr (is_same<Row<T>, contiguous_row<T>>::value)
        return {p.first + y * p.y_stride};
    else
        return {p.first + y * p.y_stride, p.x_stride};
}

/// dst[x] = operation(source[x]...) for n pixels. A destination that is one of the sources is read before it is
/// written.
template <class Count, class Operation, class Dst, class... Sources>
void each_pixel(Count n, Operation operation, Dst dst, Sources... sources)
{
    const int64_t end = n;
#ifdef __clang__
#pragma clang loop vectorize(assume_safety)
#else
#pragma GCC ivdep
#endif
    for (int64_t x = 0; x < end; ++x) dst[x] = operation(sources[x]...);
}

/// Part of a row that is looked at before it is computed: short, so that the second reading costs next to nothing.
inline constexpr int64_t piece = 128;
/// The length of most pieces, known to the loops.
struct whole_piece {
    constexpr operator int64_t() const { return piece; }
};

/// body(begin, n) for each piece of a row. Inlined, since a row may be short: what the body holds stays in registers.
template <class Body>
[[gnu::always_inline]] inline void each_piece(int64_t width, Body body)
{
    int64_t begin = 0;
    for (; begin + piece <= width; begin += piece) body(begin, whole_piece{});
    if (begin < width) body(begin, width - begin);
}

/// The rest of a row.
template <class Row>
Row row_from(Row row, int64_t x)
{
    row.first = row[x].address;
    return row;
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::flatfield
