// The facet that measures images.
#pragma once

#include "frame/facet.h"
#include "statistics/kernels/scalar_statistics.h"
#include "zelt/interfaces/statistics.h"

namespace Qor::Luxar::ZELT {

class CStatistics : public rounding_facet<IStatistics> {
public:
    HRESULT Minimum(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept override;
    HRESULT Maximum(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept override;
    HRESULT RangeMin(IPixmat2* pIImage, double* pVal) noexcept override;
    HRESULT RangeMax(IPixmat2* pIImage, double* pVal) noexcept override;
    HRESULT Average(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept override;
    HRESULT SumSquares(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept override;
    HRESULT MinimumCount(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept override;
    HRESULT MaximumCount(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept override;
    HRESULT MinimumPosition(IPixmat2* pIImage, IRectangle* pIArea, ICoordinateInt** ppIPos) noexcept override;
    HRESULT MaximumPosition(IPixmat2* pIImage, IRectangle* pIArea, ICoordinateInt** ppIPos) noexcept override;
    HRESULT CenterOfGravity(IPixmat2* pIImage, IRectangle* pIArea,
                            ICoordinateFloat** ppIPos) noexcept override;
    HRESULT Mean(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept override;
    HRESULT IsNaN(IPixmat2* pIImage, VARIANT_BOOL* pValue) noexcept override;
    HRESULT IsFinite(IPixmat2* pIImage, VARIANT_BOOL* pValue) noexcept override;
    HRESULT Moment(IPixmat2* pIImage, LONG i, LONG j, IRectangle* pIArea, double* pMoment) noexcept override;
    HRESULT Count(IPixmat2* pIImage, double Value, LONG compare, IRectangle* pIArea,
                  LONG* pValue) noexcept override;
    HRESULT BoundingBox(IPixmat2* pIImage, IRectangle** ppIBoundingBox) noexcept override;
    HRESULT get_SubsampleFactor(LONG* pValue) noexcept override;
    HRESULT put_SubsampleFactor(LONG value) noexcept override;
    HRESULT CountRange(IPixmat2* pIImage, double minValue, double maxValue, IRectangle* pIArea,
                       LONG* pValue) noexcept override;

    // Until their families come.
    HRESULT FindPeak(IPixmat2*, ICoordinateInt**) noexcept override { return E_NOTIMPL; }
    HRESULT FindPeaks(IPixmat2*, LONG, LONG, ZELT_Peak_Algorithm, IPeaks**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT Histogram(IPixmat2*, LONG, SAFEARRAY**) noexcept override { return E_NOTIMPL; }
    HRESULT CircularAverage(IPixmat2*, double, ICoordinateFloat*, SAFEARRAY**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT RadialAverage(IPixmat2*, double, double, double, ICoordinateFloat*, SAFEARRAY**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT Projection(IPixmat2*, double, SAFEARRAY**) noexcept override { return E_NOTIMPL; }
    HRESULT Profile(IPixmat2*, ICoordinateFloat*, ICoordinateFloat*, double, SAFEARRAY**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT InterpolatePeak(IPixmat2*, ICoordinateInt*, double, ICoordinateFloat**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT QualityOfMatch(IPixmat2*, IPixmat2*, ICoordinateInt*, double*) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT EdgeSharpness(IPixmat2*, IPixmat2*, double, double*, double*, SAFEARRAY**, IPixmat2*,
                          IPixmat2**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT ProfileFromTemplate(IPixmat2*, SAFEARRAY**) noexcept override { return E_NOTIMPL; }
    HRESULT LocateRealEdge(IPixmat2*, IPixmat2*, SAFEARRAY*, double, IPixmat2*, IPixmat2**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT PSNR(IPixmat2*, IPixmat2*, double*) noexcept override { return E_NOTIMPL; }
    HRESULT SNR(IPixmat2*, double*) noexcept override { return E_NOTIMPL; }
    HRESULT HistogramEx(IPixmat2*, LONG, IRectangle*, SAFEARRAY**) noexcept override { return E_NOTIMPL; }
    HRESULT PyramidSharpness(IPixmat2*, LONG, LONG, double, VARIANT_BOOL, VARIANT_BOOL, IRectangle*,
                             IPyramidSharpnessResult**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT DotProduct(IPixmat2*, IPixmat2*, double*) noexcept override { return E_NOTIMPL; }
    HRESULT FindLocalMaxima(IPixmat2*, LONG, double, LONG, IRectangle*, ZELT_FindLocalMaxima_Ordering,
                            IPeaks**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT EllipticalAverage(IPixmat2*, IRangeFloat*, double, double, double, ICoordinateFloat*,
                              IRangeFloat*, SAFEARRAY**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT Ascend(IPixmat2*, ICoordinateInt*, double, double, ICoordinateInt**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT Descend(IPixmat2*, ICoordinateInt*, double, double, ICoordinateInt**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT HistogramLimits(IPixmat2*, double, double, LONG, IRectangle*, SAFEARRAY**) noexcept override
    {
        return E_NOTIMPL;
    }
    HRESULT InterpolatePeakElliptical(IPixmat2*, ICoordinateInt*, double,
                                      ICoordinateFloat**) noexcept override
    {
        return E_NOTIMPL;
    }

private:
    LONG subsample_factor_ = 1;
};
using CStatisticsDisp = scripting<CStatistics>;

} // namespace Qor::Luxar::ZELT
