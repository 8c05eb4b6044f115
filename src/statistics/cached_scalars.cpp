#include "statistics/cached_scalars.h"

#include "frame/image_access.h"
#include "frame/report.h"
#include "frame/value_objects.h"
#include "zelt/interfaces/statistics.h"
#include "zelt/interfaces/zelt.h"

namespace Qor::Luxar::ZELT::Statistics {
namespace {

using key_text = bstr_constant<20>;

/// What a key holds and when it is written. The order is that of the writes.
struct stored_key {
    key_text key;
    uint32_t flag;
    bool image_statistics::*valid;
};

constexpr stored_key keys[] = {
    {L"stats:minimum", flag_minimum, &image_statistics::minimum_valid},
    {L"stats:mincount", flag_minimum_count, &image_statistics::minimum_valid},
    {L"stats:minposx", flag_minimum_x, &image_statistics::minimum_valid},
    {L"stats:minposy", flag_minimum_y, &image_statistics::minimum_valid},
    {L"stats:maximum", flag_maximum, &image_statistics::maximum_valid},
    {L"stats:maxcount", flag_maximum_count, &image_statistics::maximum_valid},
    {L"stats:maxposx", flag_maximum_x, &image_statistics::maximum_valid},
    {L"stats:maxposy", flag_maximum_y, &image_statistics::maximum_valid},
    {L"stats:absmin", flag_range_min, &image_statistics::range_min_valid},
    {L"stats:absmax", flag_range_max, &image_statistics::range_max_valid},
    {L"stats:mean", flag_mean, &image_statistics::mean_valid},
    {L"stats:sumsquares", flag_sum_squares, &image_statistics::sum_squares_valid},
    {L"stats:gravityx", flag_gravity_x, &image_statistics::gravity_valid},
    {L"stats:gravityy", flag_gravity_y, &image_statistics::gravity_valid},
};

constexpr key_text subsample_key = L"stats:subsample";
constexpr key_text unknown_key = L"Unknown Parameter";

BSTR key_of(statistic_flag flag)
{
    for (const stored_key& k : keys)
        if (k.flag == flag) return k.key.get();
    return unknown_key.get();
}

/// The count cut to its low 32 bits.
uint32_t cut(uint64_t count) { return static_cast<uint32_t>(count); }

variant stored_value(const image_statistics& record, const stored_key& k)
{
    switch (k.flag) {
    case flag_minimum_count: return variant(cut(record.minimum_count));
    case flag_maximum_count: return variant(cut(record.maximum_count));
    case flag_minimum_x: return variant(record.minimum_x);
    case flag_minimum_y: return variant(record.minimum_y);
    case flag_maximum_x: return variant(record.maximum_x);
    case flag_maximum_y: return variant(record.maximum_y);
    default: return variant(value_of(record, static_cast<statistic_flag>(k.flag)));
    }
}

/// S_OK and the value when the store has it for this factor, S_FALSE when a pass is needed, or a failed conversion of
/// the value.
HRESULT look_up(IPixmatStatisticsStore* store, statistic_flag flag, LONG factor, double* value)
{
    variant held;
    if (store->GetValue(subsample_key.get(), held.put()) != S_OK) return S_FALSE;
    if (held.type() != VT_I4 && failed(VariantChangeType(held.get(), held.get(), 0, VT_I4))) return S_FALSE;
    if (held->lVal != factor) return S_FALSE;
    if (store->GetValue(key_of(flag), held.put()) != S_OK) return S_FALSE;
    if (const HRESULT hr = VariantChangeType(held.get(), held.get(), 0, VT_R8); failed(hr)) return hr;
    *value = held->dblVal;
    return S_OK;
}

void keep(IPixmatStatisticsStore* store, const image_statistics& record, LONG factor)
{
    CheckHResult(store->SetValue(subsample_key.get(), variant(factor).get()));
    for (const stored_key& k : keys)
        if (record.*k.valid) CheckHResult(store->SetValue(k.key.get(), stored_value(record, k).get()));
}

HRESULT scalar_pass(IPixmat2* image, const rectangle* area, statistic_flag flag, LONG factor,
                    image_statistics& record)
{
    image_layout layout;
    if (const HRESULT hr = ReadLayout(image, &layout); failed(hr)) return hr;
    const rectangle whole{0, 0, layout.width, layout.height};
    if (area && !fits(*area, {layout.width, layout.height}))
        return ReportError(CLSID_ZELT2, L"Invalid rectangle argument", IStatistics::iid, E_INVALIDARG);
    com_ptr<IPixmatLock> lock;
    if (const HRESULT hr = image->OpenRead(nullptr, 1.0, lock.put()); failed(hr)) return hr;
    const auto format = find_value_format(layout.encoding, layout.bits);
    if (!format)
        return ReportError(CLSID_ZELT2, L"Statistics not implemented for this encoding", IStatistics::iid,
                           E_NOTIMPL);
    record.range_min = format->range_min;
    record.range_max = format->range_max;
    if (flag != flag_range_min && flag != flag_range_max)
        measure(layout, lock->Data(0), area ? *area : whole, factor, *format, record);
    record.range_min_valid = record.range_max_valid = true;
    return S_OK;
}

} // namespace

double value_of(const image_statistics& record, statistic_flag flag) noexcept
{
    switch (flag) {
    case flag_minimum: return record.minimum;
    case flag_maximum: return record.maximum;
    case flag_mean: return record.mean;
    case flag_sum_squares: return record.sum_squares;
    case flag_range_min: return record.range_min;
    case flag_range_max: return record.range_max;
    case flag_minimum_count: return static_cast<double>(record.minimum_count);
    case flag_maximum_count: return static_cast<double>(record.maximum_count);
    case flag_minimum_x: return record.minimum_x;
    case flag_minimum_y: return record.minimum_y;
    case flag_maximum_x: return record.maximum_x;
    case flag_maximum_y: return record.maximum_y;
    case flag_gravity_x: return record.gravity_x;
    case flag_gravity_y: return record.gravity_y;
    case flag_histogram: break;
    }
    return 0;
}

HRESULT read_statistic(IPixmat2* image, IRectangle* area, statistic_flag flag, LONG subsample_factor,
                       double* value, image_statistics& record)
{
    if (!image) return E_INVALIDARG;
    if (!value) return E_POINTER;
    const Common::optional_rectangle given(area);
    const rectangle* part = given.get();
    if (part) {
        image_layout layout;
        if (const HRESULT hr = ReadLayout(image, &layout); failed(hr)) return hr;
        if (*part == rectangle{0, 0, layout.width, layout.height}) part = nullptr;
    }
    const auto store = query<IPixmatStatisticsStore>(image);
    if (!part && store) {
        const HRESULT found = look_up(store.get(), flag, subsample_factor, value);
        if (found != S_FALSE) return failed(found) ? found : from_store;
    }
    if (const HRESULT hr = scalar_pass(image, part, flag, subsample_factor, record); failed(hr)) return hr;
    // A sampled result is never kept, so a facet that samples always computes.
    if (subsample_factor == 1 && !part && store) keep(store.get(), record, subsample_factor);
    return from_pass;
}

} // namespace Qor::Luxar::ZELT::Statistics
