#include "pixmat/transfer.h"

#include "pixmat/conversion.h"
#include "pixmat/convert_load.h"
#include "pixmat/convert_store.h"

#include <array>
#include <cmath>
#include <numeric>

namespace Qor::Luxar {
namespace {

using namespace Convert;

/// f(values, count, results) for the pixels of an image, a block at a time. For a small pixel type all its values are
/// tabulated when that is less work than asking for each pixel.
template <class T, class F>
class tabulated {
public:
    tabulated(const memory_2d& from, F function) : function_(function)
    {
        switch (from.type) {
        case pixel_type::unsigned_8: tabulate(0, 256, from); break;
        case pixel_type::signed_8: tabulate(-128, 256, from); break;
        case pixel_type::unsigned_16: tabulate(0, 65536, from); break;
        case pixel_type::signed_16: tabulate(-32768, 65536, from); break;
        default: break;
        }
    }

    /// values: as loaded, of this kind.
    void operator()(working kind, const void* values, int count, T* out) const
    {
        if (!table_.empty()) {
            const auto* const in = static_cast<const int32_t*>(values);
            const T* const first = table_.data() - low_;
            for (int i = 0; i < count; ++i) out[i] = first[in[i]];
            return;
        }
        double reals[block_size];
        to_real(kind, values, count, reals);
        function_(reals, count, out);
    }

private:
    void tabulate(int32_t low, int32_t entries, const memory_2d& from)
    {
        if (int64_t{from.width} * from.height <= entries) return;
        low_ = low;
        table_.resize(static_cast<size_t>(entries));
        double values[block_size];
        for (int32_t first = 0; first < entries; first += block_size) {
            for (int i = 0; i < block_size; ++i) values[i] = low + first + i;
            function_(values, block_size, table_.data() + first);
        }
    }

    F function_;
    int32_t low_ = 0;
    std::vector<T> table_;
};

template <class T, class F>
auto tabulate(const memory_2d& from, F function)
{
    return tabulated<T, F>(from, function);
}

} // namespace

HRESULT CPixmatTransfer::Run(const void* source, void* target, const rectangle* source_area,
                             const coordinate<int32_t>* target_point) noexcept
try {
    if (!source || !target) return E_POINTER;
    if (source_area || target_point) return E_INVALIDARG;
    if (source_layout_.width != target_layout_.width || source_layout_.height != target_layout_.height)
        return E_INVALIDARG;
    if (!type_of(source_layout_) || !type_of(target_layout_)) return E_NOTIMPL;
    if (table_.empty() && levels_change_nothing()) return recode(source, target);
    const memory_2d from = view_of(source_layout_, const_cast<void*>(source)); // read only
    const memory_2d to = view_of(target_layout_, target);
    return table_.empty() ? level(from, to) : look_up(from, to);
} catch (...) {
    return E_OUTOFMEMORY; // nothing else can fail here
}

/// Levels that were never set, and default levels between equal ranges.
bool CPixmatTransfer::levels_change_nothing() const
{
    if (!levels_set_) return true;
    if (levels_ != levels{}) return false;
    const pixel_type from = *type_of(source_layout_);
    const pixel_type to = *type_of(target_layout_);
    if (is_float(from) || is_colour(from))
        return is_float(from) == is_float(to) && is_colour(from) == is_colour(to);
    return from == to && source_layout_.bits == target_layout_.bits;
}

HRESULT CPixmatTransfer::recode(const void* source, void* target) const
{
    const auto c = recode_between(source_layout_, target_layout_);
    if (!c) return E_NOTIMPL;
    run(*c, view_of(source_layout_, const_cast<void*>(source)), view_of(target_layout_, target));
    return S_OK;
}

HRESULT CPixmatTransfer::look_up(const memory_2d& from, const memory_2d& to) const
{
    const loader value = load_value(from.type);
    if (!is_colour(to.type) || !value.load || is_full_complex(from.type)) return E_NOTIMPL;
    const auto count = static_cast<double>(table_.size());
    const auto colour_of = tabulate<colour_32>(from, [this, count](const double* v, int n, colour_32* out) {
        for (int i = 0; i < n; ++i) {
            const double index = std::floor((v[i] - low_) / (high_ - low_) * count);
            if (!(index > 0.0)) // NaN, too
                out[i] = table_.front();
            else
                out[i] = index < count ? table_[static_cast<size_t>(index)] : table_.back();
        }
    });
    const store_pixels store = store_colour(to.type);
    block values;
    std::array<colour_32, block_size> colours;
    for_each_block(from, to, [&](const uint8_t* source, uint8_t* target, int n) {
        value.load(source, from.x_stride, n, values.bytes);
        colour_of(value.kind, values.bytes, n, colours.data());
        store(colours.data(), n, target, to.x_stride, {});
    });
    return S_OK;
}

HRESULT CPixmatTransfer::level(const memory_2d& from, const memory_2d& to) const
{
    const auto number_or_colour = [](pixel_type t) { return is_number(t) || is_colour(t); };
    if (!number_or_colour(from.type) || !number_or_colour(to.type)) return E_NOTIMPL;
    const auto from_scale = level_scale::of(from.type, source_layout_.bits);
    const auto to_scale = level_scale::of(to.type, target_layout_.bits);
    const auto new_values = [this, from_scale, to_scale](const double* v, int n, double* out) {
        for (int i = 0; i < n; ++i) out[i] = from_scale.level(v[i]);
        levels_.apply(out, n);
        for (int i = 0; i < n; ++i) out[i] = to_scale.value(out[i]);
    };
    block values;
    if (is_colour(from.type) && is_colour(to.type)) {
        static_assert(block_size == 256);
        double results[256];
        std::array<uint8_t, 256> channel;
        std::iota(results, results + 256, 0.0);
        new_values(results, 256, results);
        for (size_t i = 0; i < 256; ++i) channel[i] = static_cast<uint8_t>(results[i] + 0.5);
        const load_pixels load = load_colour(from.type).load;
        const store_pixels store = store_colour(to.type);
        for_each_block(from, to, [&](const uint8_t* source, uint8_t* target, int n) {
            load(source, from.x_stride, n, values.bytes);
            for (int i = 0; i < n; ++i)
                for (int k = 0; k < 3; ++k) values.bytes[4 * i + k] = channel[values.bytes[4 * i + k]];
            store(values.bytes, n, target, to.x_stride, {});
        });
        return S_OK;
    }
    const loader value = load_value(from.type);
    const store_pixels store = store_value(to.type, working::real);
    const nominal_range range = is_number(to.type) ? range_of(to.type, target_layout_.bits) : nominal_range{};
    const auto levelled = tabulate<double>(from, new_values);
    double results[block_size];
    for_each_block(from, to, [&](const uint8_t* source, uint8_t* target, int n) {
        value.load(source, from.x_stride, n, values.bytes);
        levelled(value.kind, values.bytes, n, results);
        store(results, n, target, to.x_stride, range);
    });
    return S_OK;
}

HRESULT CPixmatTransfer::SetLookupTable(const uint32_t* entries, LONG count, double low, double high) noexcept
try {
    if (!entries) return E_POINTER;
    if (count < 1) return E_INVALIDARG;
    std::vector<colour_32> table(static_cast<size_t>(count));
    for (size_t i = 0; i < table.size(); ++i) {
        const uint32_t number = entries[i];
        table[i] = {{static_cast<uint8_t>(number), static_cast<uint8_t>(number >> 8),
                     static_cast<uint8_t>(number >> 16), 255}};
    }
    table_.swap(table);
    low_ = low;
    high_ = high;
    return S_OK;
} catch (...) {
    return E_OUTOFMEMORY;
}

HRESULT CPixmatTransfer::set_level(double& level, double value, bool positive) noexcept
{
    if (!std::isfinite(value) || (positive && value <= 0.0)) return E_INVALIDARG;
    level = value;
    levels_set_ = true;
    return S_OK;
}

HRESULT CPixmatTransfer::SetContrast(double value) noexcept
{
    return set_level(levels_.contrast, value, false);
}

HRESULT CPixmatTransfer::SetBrightness(double value) noexcept
{
    return set_level(levels_.brightness, value, false);
}

HRESULT CPixmatTransfer::SetGamma(double value) noexcept { return set_level(levels_.gamma, value, true); }

HRESULT CPixmatTransfer::SetSigma(double value) noexcept { return set_level(levels_.sigma, value, true); }

} // namespace Qor::Luxar
