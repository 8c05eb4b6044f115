// Reads padded rows, and asks for memory ahead of loops over rows.
#pragma once

#include "filters/kernels/padded_row.h"
#include "pixel/rows.h"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters {

using Filters::padded_source;

/// Asks for the memory that is needed next, bytes begin to end: of the output, which is as good as never in a cache,
/// and of the source row that will be read in one go, unless it is null. A little at a time: many requests at once
/// wait for each other. Never a call, which would cost the loop around it its registers.
[[gnu::always_inline]] inline void prefetch(const uint8_t* next_row, const uint8_t* to, int64_t begin,
                                            int64_t end)
{
    constexpr int64_t line = 64;
    for (int64_t i = begin; i < end; i += line) {
        __builtin_prefetch(to + i, 1);
        if (next_row) __builtin_prefetch(next_row + i);
    }
}

/// Numbers side by side, from any address on.
template <class T, class E>
void convert_run(const uint8_t* from, int64_t count, E* to)
{
    const contiguous_row<T> row{const_cast<uint8_t*>(from)};
    for (int64_t i = 0; i < count; ++i) to[i] = static_cast<E>(static_cast<T>(row[i]));
}

/// Row y of the source, its numbers of type T turned into E. A pixel's numbers stay beside each other.
template <class T, class E>
void load_padded_row(const padded_source& src, int64_t y, E* to)
{
    const uint8_t* const row = src.first + y * src.y_stride;
    const int64_t channels = src.channels, stride = src.x_stride;
    const auto [left, from, count, right] = src.padding;

    for (int64_t x = 0; x < left; ++x, to += channels) convert_run<T>(row, channels, to);
    if (stride == channels * static_cast<int64_t>(sizeof(T))) {
        convert_run<T>(row + from * stride, count * channels, to);
        to += count * channels;
    } else {
        for (int64_t x = from; x < from + count; ++x, to += channels)
            convert_run<T>(row + x * stride, channels, to);
    }
    const uint8_t* const last = row + (src.width - 1) * stride;
    for (int64_t x = 0; x < right; ++x, to += channels) convert_run<T>(last, channels, to);
}

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters
