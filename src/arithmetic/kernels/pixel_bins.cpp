#include "arithmetic/kernels/pixel_bins.h"

#include <algorithm>
#include <cstring>
#include <limits>

namespace Qor::Luxar::ZELT::Arithmetic {
namespace {

constexpr int64_t block = 2048;

/// Equal neighbours in one table would wait for each other's stores, so consecutive pixels use several tables.
template <int Tables>
void count_block(const uint16_t* bins, int64_t n, uint32_t* tables, size_t bin_count)
{
    int64_t i = 0;
    for (; i + 4 <= n; i += 4) {
        uint64_t four;
        std::memcpy(&four, bins + i, sizeof four);
        for (size_t k = 0; k < 4; ++k) ++tables[(k % Tables) * bin_count + ((four >> (16 * k)) & 0xffff)];
    }
    for (; i < n; ++i) ++tables[bins[i]];
}

/// Of a few values, the one that `rank` others come before in their order: first by the upper byte, then by the
/// lower one of those that share it.
uint16_t value_at_rank(const uint16_t* values, int64_t n, int64_t rank)
{
    const auto find = [&rank](const uint16_t(&counts)[256]) {
        int byte = 0;
        for (; byte < 255 && counts[byte] <= rank; ++byte) rank -= counts[byte];
        return byte;
    };
    uint16_t upper_counts[256] = {}, lower_counts[256] = {};
    for (int64_t i = 0; i < n; ++i) ++upper_counts[values[i] >> 8];
    const int upper = find(upper_counts);
    for (int64_t i = 0; i < n; ++i)
        if (values[i] >> 8 == upper) ++lower_counts[values[i] & 255];
    return static_cast<uint16_t>(upper << 8 | find(lower_counts));
}

} // namespace

bool is_cheap_by_value(const memory_2d& image)
{
    if (GetPixmatEncoding(image.type) == PixmatEncoding_Float) return false;
    const int32_t bits = GetPixmatBits(image.type);
    return bits == 8 || (bits == 16 && int64_t{image.width} * image.height >= (int64_t{1} << 20));
}

binning bins_by_value(pixel_type type)
{
    const int32_t values = int32_t{1} << GetPixmatBits(type);
    const bool is_signed = GetPixmatEncoding(type) == PixmatEncoding_Signed;
    return {is_signed ? -values / 2.0 : 0.0, 1, values - 1};
}

pixel_bins::pixel_bins(const memory_2d& image, difference d, binning b) : last_bin_(b.last)
{
    const bins_function to_bins = threshold_level().bins[index(d)][index(image.type)];
    const long_size extent = joined_extent(image);
    if (extent.width * extent.height > few) {
        count(image, extent, to_bins, b);
        return;
    }
    const pixel_grid grid = grid_of(image);
    for (int64_t y = 0; y < extent.height; ++y, listed_ += extent.width)
        to_bins(grid.first + y * grid.y_stride, grid.x_stride, extent.width, b, list_ + listed_);
}

void pixel_bins::count(const memory_2d& image, long_size extent, bins_function to_bins, binning b)
{
    const size_t bin_count = static_cast<size_t>(b.last) + 1;
    const size_t tables = bin_count <= 4096 ? 4 : 2;
    std::vector<uint32_t> partial(bin_count * tables);
    counts_.resize(bin_count);
    const auto fold = [&] {
        for (size_t t = 0; t < tables; ++t)
            for (size_t i = 0; i < bin_count; ++i) counts_[i] += partial[t * bin_count + i];
    };

    uint16_t bins[block];
    const pixel_grid grid = grid_of(image);
    int64_t room = std::numeric_limits<uint32_t>::max();
    for (int64_t y = 0; y < extent.height; ++y)
        for (int64_t x = 0; x < extent.width; x += block) {
            const int64_t n = std::min(block, extent.width - x);
            if (room < n) { // a table could overflow
                fold();
                std::fill(partial.begin(), partial.end(), 0);
                room = std::numeric_limits<uint32_t>::max();
            }
            room -= n;
            to_bins(grid.first + y * grid.y_stride + x * grid.x_stride, grid.x_stride, n, b, bins);
            if (tables == 4)
                count_block<4>(bins, n, partial.data(), bin_count);
            else
                count_block<2>(bins, n, partial.data(), bin_count);
        }
    fold();
}

int32_t pixel_bins::last() const noexcept
{
    if (counts_.empty()) return listed_ > 0 ? *std::max_element(list_, list_ + listed_) : 0;
    int32_t bin = last_bin_;
    while (bin > 0 && counts_[static_cast<size_t>(bin)] == 0) --bin;
    return bin;
}

void pixel_bins::rescale(double scale, int32_t last_bin)
{
    const int32_t from = first(), to = last();
    const auto rescaled = [=](int32_t bin) {
        return static_cast<size_t>(std::min(static_cast<int32_t>((bin - from) * scale), last_bin));
    };
    last_bin_ = last_bin;
    for (int64_t i = 0; i < listed_; ++i) list_[i] = static_cast<uint16_t>(rescaled(list_[i]));
    if (counts_.empty()) return;
    std::vector<int64_t> moved(static_cast<size_t>(last_bin) + 1);
    for (int32_t bin = from; bin <= to; ++bin) moved[rescaled(bin)] += counts_[static_cast<size_t>(bin)];
    counts_ = std::move(moved);
}

int32_t pixel_bins::at_rank(int64_t rank) const noexcept
{
    if (counts_.empty()) return value_at_rank(list_, listed_, rank);
    int32_t bin = 0;
    for (; bin < last_bin_ && counts_[static_cast<size_t>(bin)] <= rank; ++bin)
        rank -= counts_[static_cast<size_t>(bin)];
    return bin;
}

pixel_bins::part pixel_bins::below(int32_t bin) const noexcept
{
    part lower;
    if (counts_.empty()) {
        for (int64_t i = 0; i < listed_; ++i) {
            const bool is_below = list_[i] < bin;
            lower.pixels += is_below;
            lower.sum += is_below ? list_[i] : 0;
        }
    } else {
        for (int64_t i = 0; i < bin; ++i) {
            lower.pixels += counts_[static_cast<size_t>(i)];
            lower.sum += counts_[static_cast<size_t>(i)] * i;
        }
    }
    return lower;
}

} // namespace Qor::Luxar::ZELT::Arithmetic
