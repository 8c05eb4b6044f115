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

/// dst[x] = operation(source[x]...). A destination that is one of the sources is read before it is written.
template <class Operation, class Dst, class... Sources>
void each_pixel(int64_t begin, int64_t end, Operation operation, Dst dst, Sources... sources)
{
#ifdef __clang__
#pragma clang loop vectorize(assume_safety)
#else
#pragma GCC ivdep
#endif
    for (int64_t x = begin; x < end; ++x) dst[x] = operation(sources[x]...);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::flatfield
