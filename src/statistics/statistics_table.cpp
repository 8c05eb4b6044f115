#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/statistics.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {

using S = IStatistics;

constexpr auto image = in("pIImage");
constexpr auto area = opt("pIArea");
constexpr auto value = result("pVal");
constexpr auto array = result("pArray");

constexpr auto statistics_rows = std::tuple(
    method<&S::Minimum>("Minimum", "smallest pixel value", image, area, value),
    method<&S::Maximum>("Maximum", "largest pixel value", image, area, value),
    method<&S::RangeMin>("RangeMin", "lowest value of the format", image, value),
    method<&S::RangeMax>("RangeMax", "highest value of the format", image, value),
    method<&S::Average>("Average", "mean pixel value", image, area, value),
    method<&S::SumSquares>("SumSquares", "sum of the squared pixel values", image, area, value),
    method<&S::FindPeak>("FindPeak", "one peak, by shrinking a rectangle", image, result("ppIPos")),
    method<&S::FindPeaks>("FindPeaks", "the strongest pixels, some distance apart", image, in("nPeaks"),
                          in("radius"), opt("algorithm"), result("ppIPeaks")),
    method<&S::Histogram>("Histogram", "how often each value occurs", image, opt("bins"), array),
    method<&S::MinimumCount>("MinimumCount", "how often the smallest value occurs", image, area, value),
    method<&S::MaximumCount>("MaximumCount", "how often the largest value occurs", image, area, value),
    method<&S::MinimumPosition>("MinimumPosition", "first pixel with the smallest value", image, area,
                                result("ppIPos")),
    method<&S::MaximumPosition>("MaximumPosition", "first pixel with the largest value", image, area,
                                result("ppIPos")),
    method<&S::CenterOfGravity>("CenterOfGravity", "mean position, weighted by pixel values", image, area,
                                result("ppIPos")),
    method<&S::CircularAverage>("CircularAverage", "mean over circles, by radius", image,
                                opt("radiusStep", 1.0), opt("pICentre"), array),
    method<&S::RadialAverage>("RadialAverage", "mean over rays, by angle", image,
                              opt("angleStep", 0.01744000054895878), opt("minRadius", 0.0),
                              opt("maxRadius", 6.0), opt("pICentre"), array),
    method<&S::Projection>("Projection", "sums along parallel lines", image, opt("angleRad", 0.0), array),
    method<&S::Profile>("Profile", "values along a line", image, in("pIP0"), in("pIP1"), opt("width", 0.0),
                        array),
    method<&S::InterpolatePeak>("InterpolatePeak", "sub-pixel position of a round peak", image, in("pIPeak"),
                                in("radius"), result("ppIPos")),
    method<&S::Mean>("Mean", "mean pixel value", image, area, value),
    method<&S::QualityOfMatch>("QualityOfMatch", "how well a template fits at a place", image,
                               in("pITemplate"), opt("pITemplatePos"), result("pQuality")),
    method<&S::EdgeSharpness>("EdgeSharpness", "sharpness of the edges of a binary image", image,
                              in("pIImageBin"), in("gauss_blur"), out("pSharpness"), out("pConfidence"),
                              out("pSg"), opt("pIOut"), result("ppIPixmat")),
    method<&S::ProfileFromTemplate>("ProfileFromTemplate", "edge profile of a template", image,
                                    result("pProfile")),
    method<&S::LocateRealEdge>("LocateRealEdge", "edge positions by a profile", image, in("pIImageBin"),
                               in("pTmpProfile"), in("gauss_blur"), opt("pIOut"), result("ppIPixmat")),
    method<&S::PSNR>("PSNR", "peak signal to noise ratio of two images", in("pIImageA"), in("pIImageB"),
                     result("pValue")),
    method<&S::SNR>("SNR", "signal to noise ratio", image, result("pValue")),
    method<&S::HistogramEx>("HistogramEx", "how often each value occurs in an area", image, opt("bins"), area,
                            array),
    method<&S::IsNaN>("IsNaN", "whether a pixel is NaN", image, result("pValue")),
    method<&S::IsFinite>("IsFinite", "whether all pixels are finite", image, result("pValue")),
    method<&S::Moment>("Moment", "sum of x^i * y^j * value", image, in("i"), in("j"), area,
                       result("pMoment")),
    method<&S::Count>("Count",
                      "how many pixels compare so with a value (1 equal, 2 less, 4 more, 0 not equal)", image,
                      in("Value"), opt("compare", ZELT_Equal), area, result("pValue")),
    method<&S::BoundingBox>("BoundingBox", "rectangle around all pixels that are not 0", image,
                            result("ppIBoundingBox")),
    method<&S::PyramidSharpness>("PyramidSharpness", "sharpness over a pyramid of sizes", image,
                                 in("startPyramidLevel"), in("endPyramidLevel"), in("normalizingFactor"),
                                 in("computeABSSharpness"), in("compute3PtSlope"), area, result("ppIResult")),
    method<&S::DotProduct>("DotProduct", "sum of the products of two images' pixels", in("pIImageA"),
                           in("pIImageB"), result("pValue")),
    get<&S::get_SubsampleFactor>("SubsampleFactor", "sampling step of scalars and histograms",
                                 result("pValue")),
    put<&S::put_SubsampleFactor>("SubsampleFactor", "sampling step of scalars and histograms", in("value")),
    method<&S::FindLocalMaxima>("FindLocalMaxima", "all local maxima of an area", image, opt("nMaxima"),
                                opt("radius", 1.0), opt("peakSelectionNeighborhoodSize", 1), opt("pIRect"),
                                opt("orderSpec"), result("ppIPeaks")),
    method<&S::CountRange>("CountRange", "how many pixels lie between two values", image, in("minValue"),
                           in("maxValue"), area, result("pValue")),
    method<&S::EllipticalAverage>("EllipticalAverage", "mean over ellipses, by radius", image,
                                  in("pIRadiusRange"), opt("radiusStep", 1.0), opt("ellipseOrientation", 0.0),
                                  opt("ellipticity", 1.0), opt("pICentre"), opt("pISigmaRange"), array),
    method<&S::Ascend>("Ascend", "walk uphill from a point", image, in("pIStartPoint"), in("maxDistance"),
                       in("Threshold"), result("ppIPosition")),
    method<&S::Descend>("Descend", "walk downhill from a point", image, in("pIStartPoint"), in("maxDistance"),
                        in("Threshold"), result("ppIPosition")),
    method<&S::HistogramLimits>("HistogramLimits", "how often each value between two limits occurs", image,
                                in("lowLimit"), in("highLimit"), opt("bins"), area, array),
    method<&S::InterpolatePeakElliptical>("InterpolatePeakElliptical",
                                          "sub-pixel position of an elliptical peak", image, in("pIPeak"),
                                          in("radius"), result("ppIPos")));

constexpr auto peak_rows =
    std::tuple(get<&IPeak::get_Position>("Position", "where it is", result("position")),
               get<&IPeak::get_Value>("Value", "its height", result("value")));

constexpr auto peaks_rows =
    std::tuple(get<&IPeaks::get_Count>("Count", "how many", result("count")),
               get<&IPeaks::get_Item>("Item", "one of them, from 0", in("index"), result("peak")),
               get<&IPeaks::get__NewEnum>("_NewEnum", "all of them", result("enumerator")));

constexpr auto sharpness_rows =
    std::tuple(get<&IPyramidSharpnessResult::get_NumberOfPyramids>("NumberOfPyramids", "how many levels",
                                                                   result("count")),
               get<&IPyramidSharpnessResult::get_SharpnessArray>("SharpnessArray", "a value for each level",
                                                                 result("array")),
               get<&IPyramidSharpnessResult::get_AggregateSharpness>(
                   "AggregateSharpness", "mean over the chosen levels", result("value")));

} // namespace

template <>
const interface_info& table_of<IStatistics>() noexcept
{
    return interface_table<IStatistics, statistics_rows>::info("measuring images");
}

template <>
const interface_info& table_of<IPeak>() noexcept
{
    return interface_table<IPeak, peak_rows>::info("one peak");
}

template <>
const interface_info& table_of<IPeaks>() noexcept
{
    return interface_table<IPeaks, peaks_rows>::info("peaks in result order");
}

template <>
const interface_info& table_of<IPyramidSharpnessResult>() noexcept
{
    return interface_table<IPyramidSharpnessResult, sharpness_rows>::info(
        "sharpness over a pyramid of sizes");
}

} // namespace Qor
