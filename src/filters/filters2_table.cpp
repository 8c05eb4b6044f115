#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/filters.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {

constexpr const char* ten_types =
    "Signed and unsigned integers of up to 32 bits, float, double, RGB and BGR by channel; integers are cut "
    "towards zero and stop at the limits of their storage. The output has the type of the image.";

constexpr const char* ten_types_unlimited =
    "Signed and unsigned integers of up to 32 bits, float, double, RGB and BGR by channel; integers are cut "
    "towards zero. The output has the type of the image.";

constexpr auto filters2_rows = std::tuple(
    pixels(ten_types_unlimited,
           method<&IFilters2::Gauss>("Gauss", "smooth; the cost does not depend on sigma", in("pIImage"),
                                     in("sigma"), opt("pIOut"), result("ppIPixmat"))),
    method<&IFilters2::Median>("Median", "median of a window", in("pIImage"), in("kernelWidth"),
                               in("kernelHeight"), opt("pIOut"), result("ppIPixmat")),
    method<&IFilters2::Min>("Min", "least pixel of a window", in("pIImage"), in("kernelWidth"),
                            in("kernelHeight"), opt("pIOut"), result("ppIPixmat")),
    method<&IFilters2::Max>("Max", "greatest pixel of a window", in("pIImage"), in("kernelWidth"),
                            in("kernelHeight"), opt("pIOut"), result("ppIPixmat")),
    method<&IFilters2::Average>("Average", "mean of a window", in("pIImage"), in("kernelWidth"),
                                in("kernelHeight"), opt("pIOut"), result("ppIPixmat")),
    pixels(ten_types,
           method<&IFilters2::Convolve>("Convolve", "convolve with a kernel and its anchor", in("pIImage"),
                                        in("kernel"), in("kx"), in("ky"), opt("pIOut"), result("ppIPixmat"))),
    pixels(ten_types, method<&IFilters2::Sobel>("Sobel", "magnitude of the gradient, by Sobel's kernels",
                                                in("pIImage"), opt("pIOut"), result("ppIPixmat"))),
    pixels(ten_types,
           method<&IFilters2::Prewitt>("Prewitt", "magnitude of the gradient, by Prewitt's kernels",
                                       in("pIImage"), opt("pIOut"), result("ppIPixmat"))),
    method<&IFilters2::HanningWindow>("HanningWindow", "multiply with a Hann window", in("pIImage"),
                                      opt("pIOut"), result("ppIPixmat")),
    method<&IFilters2::HammingWindow>("HammingWindow", "multiply with a Hamming window", in("pIImage"),
                                      opt("pIOut"), result("ppIPixmat")),
    method<&IFilters2::Taper>("Taper", "put into a frame, fading the edges out", in("pIImage"), in("pIOut"),
                              opt("pIDstPoint"), opt("Value", 0.0), opt("maxWidth")),
    method<&IFilters2::TaperEx>("TaperEx", "Taper into a new image", in("pIImage"), in("width"), in("height"),
                                opt("pIDstPoint"), opt("Value", 0.0), opt("maxWidth"), result("ppIPixmat")),
    pixels(ten_types, method<&IFilters2::GaussDerivative>(
                          "GaussDerivative", "magnitude of the gradient of the smoothed image", in("pIImage"),
                          in("sigma"), opt("pIOut"), result("ppIPixmat"))),
    pixels(ten_types, method<&IFilters2::LaplacianGaussian>(
                          "LaplacianGaussian", "magnitude of the second differences of the smoothed image",
                          in("pIImage"), in("sigma"), opt("pIOut"), result("ppIPixmat"))),
    pixels(ten_types, method<&IFilters2::SDGDGaussian>(
                          "SDGDGaussian", "second derivative along the gradient of the smoothed image",
                          in("pIImage"), in("sigma"), opt("pIOut"), result("ppIPixmat"))),
    pixels(ten_types, method<&IFilters2::Derivative>(
                          "Derivative", "magnitude of the gradient, by differences of neighbours",
                          in("pIImage"), opt("pIOut"), result("ppIPixmat"))),
    method<&IFilters2::Bilateral>("Bilateral", "smooth, but keep edges: mean of near and alike pixels",
                                  in("pIImage"), in("sigma_dist"), in("sigma_brightness"), opt("pIOut"),
                                  result("ppIPixmat")),
    method<&IFilters2::NonLocalMeans>("NonLocalMeans", "smooth, but keep what repeats: mean by alike patches",
                                      in("pIImage"), in("windowSize"), in("kernelSize"),
                                      in("sigma_brightness"), opt("pIOut"), result("ppIPixmat")),
    method<&IFilters2::ThresholdCorrection>(
        "ThresholdCorrection", "move an output toward the image it was made of, where they agree",
        in("pIImage"), in("kernelSize"), in("correction"), opt("pIOut"), result("ppIPixmat")),
    method<&IFilters2::LowPass>("LowPass", "keep low frequencies", in("pIImage"), in("order"),
                                in("frequency"), opt("pIOut"), result("ppIPixmat")),
    method<&IFilters2::HighPass>("HighPass", "keep high frequencies", in("pIImage"), in("order"),
                                 in("frequency"), opt("pIOut"), result("ppIPixmat")),
    method<&IFilters2::BandPass>("BandPass", "keep a band of frequencies", in("pIImage"), in("orderLow"),
                                 in("freqLow"), in("orderHigh"), in("freqHigh"), opt("pIOut"),
                                 result("ppIPixmat")),
    method<&IFilters2::BandStop>("BandStop", "take a band of frequencies away", in("pIImage"), in("orderLow"),
                                 in("freqLow"), in("orderHigh"), in("freqHigh"), opt("pIOut"),
                                 result("ppIPixmat")),
    method<&IFilters2::Kuwahara>("Kuwahara", "smooth, but keep edges: mean of the calmest quadrant",
                                 in("pIImage"), in("kernelWidth"), in("kernelHeight"), opt("pIOut"),
                                 result("ppIPixmat")),
    method<&IFilters2::FrankotChellappa>("FrankotChellappa", "height map from two images of its gradients",
                                         in("pIImageComposite1"), in("pIImageComposite2"),
                                         in("integrateImages"), opt("theta", 0.0), result("ppIPixmat")),
    method<&IFilters2::CrossCorrelate>("CrossCorrelate", "how alike two images are at each displacement",
                                       in("pIImage1"), in("pIImage2"), opt("options"),
                                       opt("boundaryCondition", ZELT_BoundaryCondition_Periodic),
                                       opt("pIOut"), result("ppIPixmat")),
    method<&IFilters2::AutoCorrelate>("AutoCorrelate", "how alike an image is to itself at each displacement",
                                      in("pIImage"), opt("options"),
                                      opt("boundaryCondition", ZELT_BoundaryCondition_Periodic), opt("pIOut"),
                                      result("ppIPixmat")));

} // namespace

template <>
const interface_info& table_of<IFilters2>() noexcept
{
    return interface_table<IFilters2, filters2_rows>::info("filters");
}

} // namespace Qor
