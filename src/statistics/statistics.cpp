#include "statistics/statistics.h"

#include "frame/operation.h"
#include "frame/value_objects.h"
#include "statistics/cached_scalars.h"
#include "statistics/kernels/pixel_counters.h"

#include <cmath>

namespace Qor::Luxar::ZELT {
namespace {

using namespace Statistics;
using Common::optional_rectangle;

/// One scalar, stored or computed. The code is 0 or 1 on success, see read_statistic.
HRESULT scalar(IPixmat2* image, IRectangle* area, statistic_flag flag, LONG factor, double* value)
{
    image_statistics record;
    const HRESULT hr = read_statistic(image, area, flag, factor, value, record);
    if (hr == from_pass) *value = value_of(record, flag);
    return hr;
}

HRESULT scalar_method(IPixmat2* image, IRectangle* area, statistic_flag flag, LONG factor,
                      double* value) noexcept
{
    return run_frame(IStatistics::iid, [&]() -> HRESULT {
        const HRESULT hr = scalar(image, area, flag, factor, value);
        return failed(hr) ? hr : S_OK;
    });
}

/// Two scalars as one position; each of them can be stored or computed.
template <class Interface, class Make>
HRESULT position_method(IPixmat2* image, IRectangle* area, statistic_flag x_flag, statistic_flag y_flag,
                        LONG factor, Interface** position, Make&& make_position) noexcept
{
    return run_frame(IStatistics::iid, [&]() -> HRESULT {
        if (!image) return E_INVALIDARG;
        if (!position) return E_POINTER;
        double x = 0;
        double y = 0;
        if (const HRESULT hr = scalar(image, area, x_flag, factor, &x); failed(hr)) return hr;
        if (const HRESULT hr = scalar(image, area, y_flag, factor, &y); failed(hr)) return hr;
        return make_position(x, y, position);
    });
}

/// A stored position may be any number: its low bits, 0 for NaN and what lies beyond 64 bits.
HRESULT make_nearest(double x, double y, ICoordinateInt** out) noexcept
{
    const auto nearest = [](double v) {
        const double whole = std::floor(v + 0.5);
        return whole >= -0x1p63 && whole < 0x1p63 ? static_cast<LONG>(static_cast<int64_t>(whole)) : LONG{0};
    };
    return Common::MakeCoordinateInt(nearest(x), nearest(y), out);
}

/// Measures the pixels of an area. A left or top below 0 would pass make_view and leave the image.
template <class T, class Body>
HRESULT area_method(IPixmat2* image, IRectangle* area, T* value, Body&& body) noexcept
{
    return run_frame(IStatistics::iid, [&]() -> HRESULT {
        const ImageReadAccess src(image);
        if (!value) return E_POINTER;
        const optional_rectangle part(area);
        if (part.get() && (part.get()->left < 0 || part.get()->top < 0))
            throw std::invalid_argument("memory_2d::make_view: invalid rectangle");
        *value = body(src.view().make_view(part.get()));
        return S_OK;
    });
}

VARIANT_BOOL as_variant_bool(bool b) { return b ? VARIANT_TRUE : VARIANT_FALSE; }

/// A bound of the declared format.
HRESULT range_method(IPixmat2* image, double* value, double (*bound)(PixmatEncoding, int32_t)) noexcept
{
    if (!image) return E_INVALIDARG;
    if (!value) return E_POINTER;
    image_layout layout;
    if (const HRESULT hr = ReadLayout(image, &layout); failed(hr)) return hr;
    *value = bound(layout.encoding, layout.bits);
    return S_OK;
}

} // namespace

HRESULT CStatistics::Minimum(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept
{
    return scalar_method(pIImage, pIArea, flag_minimum, subsample_factor_, pVal);
}

HRESULT CStatistics::Maximum(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept
{
    return scalar_method(pIImage, pIArea, flag_maximum, subsample_factor_, pVal);
}

HRESULT CStatistics::RangeMin(IPixmat2* pIImage, double* pVal) noexcept
{
    return range_method(pIImage, pVal, range_minimum);
}

HRESULT CStatistics::RangeMax(IPixmat2* pIImage, double* pVal) noexcept
{
    return range_method(pIImage, pVal, range_maximum);
}

HRESULT CStatistics::Average(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept
{
    return Mean(pIImage, pIArea, pVal);
}

HRESULT CStatistics::SumSquares(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept
{
    return scalar_method(pIImage, pIArea, flag_sum_squares, subsample_factor_, pVal);
}

HRESULT CStatistics::MinimumCount(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept
{
    return scalar_method(pIImage, pIArea, flag_minimum_count, subsample_factor_, pVal);
}

HRESULT CStatistics::MaximumCount(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept
{
    return scalar_method(pIImage, pIArea, flag_maximum_count, subsample_factor_, pVal);
}

HRESULT CStatistics::MinimumPosition(IPixmat2* pIImage, IRectangle* pIArea, ICoordinateInt** ppIPos) noexcept
{
    return position_method(pIImage, pIArea, flag_minimum_x, flag_minimum_y, subsample_factor_, ppIPos,
                           make_nearest);
}

HRESULT CStatistics::MaximumPosition(IPixmat2* pIImage, IRectangle* pIArea, ICoordinateInt** ppIPos) noexcept
{
    return position_method(pIImage, pIArea, flag_maximum_x, flag_maximum_y, subsample_factor_, ppIPos,
                           make_nearest);
}

HRESULT CStatistics::CenterOfGravity(IPixmat2* pIImage, IRectangle* pIArea,
                                     ICoordinateFloat** ppIPos) noexcept
{
    return position_method(pIImage, pIArea, flag_gravity_x, flag_gravity_y, subsample_factor_, ppIPos,
                           Common::MakeCoordinateFloat);
}

HRESULT CStatistics::Mean(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept
{
    return scalar_method(pIImage, pIArea, flag_mean, subsample_factor_, pVal);
}

HRESULT CStatistics::IsNaN(IPixmat2* pIImage, VARIANT_BOOL* pValue) noexcept
{
    return area_method(pIImage, nullptr, pValue,
                       [](const memory_2d& src) { return as_variant_bool(has_nan(src)); });
}

HRESULT CStatistics::IsFinite(IPixmat2* pIImage, VARIANT_BOOL* pValue) noexcept
{
    return area_method(pIImage, nullptr, pValue,
                       [](const memory_2d& src) { return as_variant_bool(is_finite(src)); });
}

HRESULT CStatistics::Moment(IPixmat2* pIImage, LONG i, LONG j, IRectangle* pIArea, double* pMoment) noexcept
{
    return area_method(pIImage, pIArea, pMoment, [=](const memory_2d& src) { return moment(src, i, j); });
}

HRESULT CStatistics::Count(IPixmat2* pIImage, double Value, LONG compare, IRectangle* pIArea,
                           LONG* pValue) noexcept
{
    return area_method(pIImage, pIArea, pValue, [=](const memory_2d& src) {
        const comparison c = compare_pixels(src, Value);
        int64_t n = compare == ZELT_NotEqual ? int64_t{src.width} * src.height - c.equal : 0;
        if (compare & ZELT_Less) n += c.less;
        if (compare & ZELT_Equal) n += c.equal;
        if (compare & ZELT_More) n += c.more;
        return static_cast<LONG>(n);
    });
}

HRESULT CStatistics::BoundingBox(IPixmat2* pIImage, IRectangle** ppIBoundingBox) noexcept
{
    return run_frame(IStatistics::iid, [&] {
        const ImageReadAccess src(pIImage);
        const rectangle box = bounding_box(src.view());
        return Common::MakeRectangle(box.left, box.top, box.right, box.bottom, ppIBoundingBox);
    });
}

HRESULT CStatistics::get_SubsampleFactor(LONG* pValue) noexcept
{
    return Common::read_field(subsample_factor_, pValue);
}

HRESULT CStatistics::put_SubsampleFactor(LONG value) noexcept
{
    if (value < 1) return E_INVALIDARG;
    subsample_factor_ = value;
    return S_OK;
}

HRESULT CStatistics::CountRange(IPixmat2* pIImage, double minValue, double maxValue, IRectangle* pIArea,
                                LONG* pValue) noexcept
{
    return area_method(pIImage, pIArea, pValue, [=](const memory_2d& src) {
        return static_cast<LONG>(count_range(src, minValue, maxValue));
    });
}

} // namespace Qor::Luxar::ZELT
