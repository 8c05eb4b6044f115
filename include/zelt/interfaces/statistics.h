// Measuring images.
#pragma once

#include "zelt/com/interface_table.h"
#include "zelt/interfaces/peaks.h"
#include "zelt/pixmat/pixmat.h"

namespace Qor::Luxar::ZELT {

/// What Count counts: a bit set. NotEqual is the complement of Equal, NaN pixels included.
enum ZELT_Compare : int32_t {
    ZELT_NotEqual = 0,
    ZELT_Equal = 1,
    ZELT_Less = 2,
    ZELT_More = 4,
};

enum ZELT_Peak_Algorithm : int32_t {
    ZELT_Peak_Algorithm_Absolute = 0,
    ZELT_Peak_Algorithm_Relative = 1,
    ZELT_Peak_Algorithm_Integrate = 2,
};

enum ZELT_FindLocalMaxima_Ordering : int32_t {
    ZELT_FindLocalMaxima_Ordering_None = 0,
    ZELT_FindLocalMaxima_Ordering_Value = 1,
    ZELT_FindLocalMaxima_Ordering_Scanline = 2,
};

} // namespace Qor::Luxar::ZELT

template <>
struct Qor::enumeration_of<Qor::Luxar::ZELT::ZELT_Peak_Algorithm> {
    static constexpr enumeration_value values[] = {
        {"ZELT_Peak_Algorithm_Absolute", 0},
        {"ZELT_Peak_Algorithm_Relative", 1},
        {"ZELT_Peak_Algorithm_Integrate", 2},
    };
    static constexpr enumeration_info info{"ZELT_Peak_Algorithm", values};
};

template <>
struct Qor::enumeration_of<Qor::Luxar::ZELT::ZELT_FindLocalMaxima_Ordering> {
    static constexpr enumeration_value values[] = {
        {"ZELT_FindLocalMaxima_Ordering_None", 0},
        {"ZELT_FindLocalMaxima_Ordering_Value", 1},
        {"ZELT_FindLocalMaxima_Ordering_Scanline", 2},
    };
    static constexpr enumeration_info info{"ZELT_FindLocalMaxima_Ordering", values};
};

namespace Qor::Luxar::ZELT {

/// Measures images on the caller's thread and writes no pixels.
///
/// Scalars. Minimum, Maximum, Mean, Average, SumSquares, MinimumCount, MaximumCount, MinimumPosition, MaximumPosition
/// and CenterOfGravity come from one pass that finds them all. After a pass over a whole image at SubsampleFactor 1
/// they are kept on the image, if it has a statistics store, and later questions are look-ups until its pixels change.
/// Pixels     unsigned and signed integers of 1 to 32 bits, float, double. Depths that are no whole element (1 to 7,
///            17 to 31) are read through the next larger element, bits that memory does not have as 0.
/// Area       null, or the image's own rectangle, means the image. Another area neither reads nor writes the store.
///            Positions and gravity are in image coordinates. An empty area has the count 1 and the value of the
///            nearest pixel as extremes, and NaN or infinity as mean and gravity.
/// Sampling   every SubsampleFactor-th pixel of every such row. The mean divides by the whole number of samples per
///            axis rounded down, while the scan visits it rounded up; the sum of squares is scaled by the factor
///            squared.
/// Counts     the pixel at the corner is counted once more than it occurs when it is an extreme: deliberate.
/// Sums       of integers are those of doubles added in scan order. Of floats: sixteen lanes in a row, sample i in lane
///            i mod 16, folded by halves, rows added in their order. The same bits on every processor.
/// NaN        replaces the minimum, and so does the pixel after it; against the maximum it counts as equal. Sums
///            become NaN.
/// Fails      E_INVALIDARG for a null image, E_POINTER for a null result, E_INVALIDARG "Invalid rectangle argument",
///            E_NOTIMPL "Statistics not implemented for this encoding", what the image or its store answer.
struct IStatistics : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0310-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IStatistics";
    using base = IDispatch;

    /// The smallest pixel value.
    virtual HRESULT Minimum(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept = 0;
    /// The largest pixel value.
    virtual HRESULT Maximum(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept = 0;
    /// The lowest value of the image's format, whatever its pixels hold: -2^(bits-1) for Signed, else 0. Any encoding;
    /// reads the descriptor only. Fails: E_INVALIDARG for a null image, E_POINTER.
    virtual HRESULT RangeMin(IPixmat2* pIImage, double* pVal) noexcept = 0;
    /// The highest value of the image's format: 1 for Float, 2^(bits-1) - 1 for Signed, else 2^bits - 1 with the shift
    /// taken modulo 64, so that 64 bits give 0. As RangeMin.
    virtual HRESULT RangeMax(IPixmat2* pIImage, double* pVal) noexcept = 0;
    /// Mean, by its older name.
    virtual HRESULT Average(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept = 0;
    /// The sum of the squared pixel values.
    virtual HRESULT SumSquares(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept = 0;
    virtual HRESULT FindPeak(IPixmat2* pIImage, ICoordinateInt** ppIPos) noexcept = 0;
    virtual HRESULT FindPeaks(IPixmat2* pIImage, LONG nPeaks, LONG radius, ZELT_Peak_Algorithm algorithm,
                              IPeaks** ppIPeaks) noexcept = 0;
    virtual HRESULT Histogram(IPixmat2* pIImage, LONG bins, SAFEARRAY** pArray) noexcept = 0;
    /// How many pixels have the smallest value.
    virtual HRESULT MinimumCount(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept = 0;
    /// How many pixels have the largest value.
    virtual HRESULT MaximumCount(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept = 0;
    /// The first pixel, row by row, that has the smallest value.
    virtual HRESULT MinimumPosition(IPixmat2* pIImage, IRectangle* pIArea,
                                    ICoordinateInt** ppIPos) noexcept = 0;
    /// The first pixel, row by row, that has the largest value.
    virtual HRESULT MaximumPosition(IPixmat2* pIImage, IRectangle* pIArea,
                                    ICoordinateInt** ppIPos) noexcept = 0;
    /// The mean position, weighted by pixel values.
    virtual HRESULT CenterOfGravity(IPixmat2* pIImage, IRectangle* pIArea,
                                    ICoordinateFloat** ppIPos) noexcept = 0;
    virtual HRESULT CircularAverage(IPixmat2* pIImage, double radiusStep, ICoordinateFloat* pICentre,
                                    SAFEARRAY** pArray) noexcept = 0;
    virtual HRESULT RadialAverage(IPixmat2* pIImage, double angleStep, double minRadius, double maxRadius,
                                  ICoordinateFloat* pICentre, SAFEARRAY** pArray) noexcept = 0;
    virtual HRESULT Projection(IPixmat2* pIImage, double angleRad, SAFEARRAY** pArray) noexcept = 0;
    virtual HRESULT Profile(IPixmat2* pIImage, ICoordinateFloat* pIP0, ICoordinateFloat* pIP1, double width,
                            SAFEARRAY** pArray) noexcept = 0;
    virtual HRESULT InterpolatePeak(IPixmat2* pIImage, ICoordinateInt* pIPeak, double radius,
                                    ICoordinateFloat** ppIPos) noexcept = 0;
    /// The sum of the pixel values over their number.
    virtual HRESULT Mean(IPixmat2* pIImage, IRectangle* pIArea, double* pVal) noexcept = 0;
    virtual HRESULT QualityOfMatch(IPixmat2* pIImage, IPixmat2* pITemplate, ICoordinateInt* pITemplatePos,
                                   double* pQuality) noexcept = 0;
    virtual HRESULT EdgeSharpness(IPixmat2* pIImage, IPixmat2* pIImageBin, double gauss_blur,
                                  double* pSharpness, double* pConfidence, SAFEARRAY** pSg, IPixmat2* pIOut,
                                  IPixmat2** ppIPixmat) noexcept = 0;
    virtual HRESULT ProfileFromTemplate(IPixmat2* pIImage, SAFEARRAY** pProfile) noexcept = 0;
    virtual HRESULT LocateRealEdge(IPixmat2* pIImage, IPixmat2* pIImageBin, SAFEARRAY* pTmpProfile,
                                   double gauss_blur, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept = 0;
    virtual HRESULT PSNR(IPixmat2* pIImageA, IPixmat2* pIImageB, double* pValue) noexcept = 0;
    virtual HRESULT SNR(IPixmat2* pIImage, double* pValue) noexcept = 0;
    virtual HRESULT HistogramEx(IPixmat2* pIImage, LONG bins, IRectangle* pIArea,
                                SAFEARRAY** pArray) noexcept = 0;
    /// Whether a pixel is NaN. Complex pixels count when both parts are. Integers never are, and are not read.
    /// Pixels     all but colours. Fails: E_INVALIDARG "null IPixmat2", "IsNaN: unsupported pixel type"; E_POINTER.
    virtual HRESULT IsNaN(IPixmat2* pIImage, VARIANT_BOOL* pValue) noexcept = 0;
    /// Whether all pixels are finite; complex pixels need both parts to be. Integers always are, and are not read.
    /// Pixels     all but colours. Fails: E_INVALIDARG "null IPixmat2", "IsFinite: unsupported pixel type"; E_POINTER.
    virtual HRESULT IsFinite(IPixmat2* pIImage, VARIANT_BOOL* pValue) noexcept = 0;
    /// The sum over the area of x^i * y^j * value, in double, pixel by pixel and row by row.
    /// Pixels     unsigned and signed 8, 16, 32 bit, float, double.
    /// Arguments  i, j: any whole numbers; 0^0 is 1, and a negative exponent makes infinity at 0. x and y count from the
    ///            area's corner.
    /// Fails      E_INVALIDARG "null IPixmat2", "memory_2d::make_view: invalid rectangle", "Moment: unsupported pixel
    ///            type"; E_POINTER.
    virtual HRESULT Moment(IPixmat2* pIImage, LONG i, LONG j, IRectangle* pIArea,
                           double* pMoment) noexcept = 0;
    /// How many pixels compare so with Value: the sum of what the bits of `compare` ask for (ZELT_Compare); 0 asks for
    /// all that are not equal. A NaN pixel counts as less.
    /// Pixels     unsigned and signed 8, 16, 32 bit, float, double, compared in double.
    /// Fails      E_INVALIDARG "null IPixmat2", "memory_2d::make_view: invalid rectangle", "Count: unsupported pixel
    ///            type"; E_POINTER.
    virtual HRESULT Count(IPixmat2* pIImage, double Value, LONG compare, IRectangle* pIArea,
                          LONG* pValue) noexcept = 0;
    /// The smallest rectangle around all pixels that are not 0 (NaN is 0 here). Right and bottom are exclusive, except
    /// when they are 0: content only in row 0 has height 0, content only in column 0 width 0. Deliberate. A blank image
    /// gives (width, height, 0, 0).
    /// Pixels     unsigned and signed 8, 16, 32 bit, float, double.
    /// Fails      E_INVALIDARG "null IPixmat2", "BoundingBox: unsupported pixel type"; E_POINTER.
    virtual HRESULT BoundingBox(IPixmat2* pIImage, IRectangle** ppIBoundingBox) noexcept = 0;
    virtual HRESULT PyramidSharpness(IPixmat2* pIImage, LONG startPyramidLevel, LONG endPyramidLevel,
                                     double normalizingFactor, VARIANT_BOOL computeABSSharpness,
                                     VARIANT_BOOL compute3PtSlope, IRectangle* pIArea,
                                     IPyramidSharpnessResult** ppIResult) noexcept = 0;
    virtual HRESULT DotProduct(IPixmat2* pIImageA, IPixmat2* pIImageB, double* pValue) noexcept = 0;
    /// The sampling step of the scalars and histograms, of this facet object; 1 at first.
    virtual HRESULT get_SubsampleFactor(LONG* pValue) noexcept = 0;
    /// Fails: E_INVALIDARG for a value below 1; the factor stays.
    virtual HRESULT put_SubsampleFactor(LONG value) noexcept = 0;
    virtual HRESULT FindLocalMaxima(IPixmat2* pIImage, LONG nMaxima, double radius,
                                    LONG peakSelectionNeighborhoodSize, IRectangle* pIRect,
                                    ZELT_FindLocalMaxima_Ordering orderSpec, IPeaks** ppIPeaks) noexcept = 0;
    /// How many pixels lie between minValue and maxValue, both included. A NaN pixel never does.
    /// Pixels     as Count. Fails: as Count, with "CountRange: unsupported pixel type".
    virtual HRESULT CountRange(IPixmat2* pIImage, double minValue, double maxValue, IRectangle* pIArea,
                               LONG* pValue) noexcept = 0;
    virtual HRESULT EllipticalAverage(IPixmat2* pIImage, IRangeFloat* pIRadiusRange, double radiusStep,
                                      double ellipseOrientation, double ellipticity,
                                      ICoordinateFloat* pICentre, IRangeFloat* pISigmaRange,
                                      SAFEARRAY** pArray) noexcept = 0;
    virtual HRESULT Ascend(IPixmat2* pIImage, ICoordinateInt* pIStartPoint, double maxDistance,
                           double Threshold, ICoordinateInt** ppIPosition) noexcept = 0;
    virtual HRESULT Descend(IPixmat2* pIImage, ICoordinateInt* pIStartPoint, double maxDistance,
                            double Threshold, ICoordinateInt** ppIPosition) noexcept = 0;
    virtual HRESULT HistogramLimits(IPixmat2* pIImage, double lowLimit, double highLimit, LONG bins,
                                    IRectangle* pIArea, SAFEARRAY** pArray) noexcept = 0;
    virtual HRESULT InterpolatePeakElliptical(IPixmat2* pIImage, ICoordinateInt* pIPeak, double radius,
                                              ICoordinateFloat** ppIPos) noexcept = 0;
};

} // namespace Qor::Luxar::ZELT
