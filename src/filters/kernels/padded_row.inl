// Reads padded rows.
#pragma once

#include "filters/kernels/padded_row.h"
#include "pixel/rows.h"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters {

using Filters::padded_source;

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
