// Filters.
#pragma once

#include "zelt/interfaces/enums.h"
#include "zelt/pixmat/pixmat.h"

namespace Qor::Luxar::ZELT {

/// What a correlation does beside correlating; the bits may be added.
enum ZELT_CorrelateOptions : uint32_t {
    ZELT_CorrelateOptions_None = 0,
    ZELT_CorrelateOptions_MutualCorrelation = 1, ///< the square root of the cross spectrum's magnitude
    ZELT_CorrelateOptions_SelfCorrelation = 1,
    ZELT_CorrelateOptions_Center0 = 2,                  ///< no displacement lies at the centre
    ZELT_CorrelateOptions_FourierTransformedOutput = 4, ///< the result stays a spectrum
    ZELT_CorrelateOptions_SuppressMean = 8,             ///< the mean is taken out
};

/// Filters images. What holds where a method says nothing else:
/// Pixels     unsigned and signed 8, 16, 32 bit, float, double, RGB, BGR (each channel by itself); the result
///            has the type and size of the input.
/// Output     pIOut, if it is given, must have the type and size of the input; a new image declares the bits
///            of its storage (12 become 16).
/// Values     saturated means limited to the range of the type and cut toward zero, a NaN becomes the lowest
///            value; cut means cut toward zero. Float and double take the value itself.
/// Border     clamped means that a pixel outside the image has the value of the nearest one inside.
/// In place   compares the address of the first pixel, also of two image objects over one memory.
/// Threads    everything runs on the calling thread.
/// Fails      E_INVALIDARG "null IPixmat2" for a null input; then the texts in their order, all E_INVALIDARG,
///            before a pixel is written; what an image answers, unchanged; E_OUTOFMEMORY; E_POINTER, after
///            the work, for a null ppIPixmat.
struct IFilters2 : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0361-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IFilters2";
    using base = IDispatch;

    /// Smooths with a Gaussian: a recursive filter whose cost does not depend on sigma, run forward and
    /// backward over rows and then over columns.
    /// Arguments  sigma: in pixels. Below 0.5 a 3 x 3 kernel of the Gaussian's values is convolved instead;
    ///            sigma 0 makes NaN of its weights.
    /// Values     integers: cut and not limited from 0.5 on, so a constant 100 can become 99, and the
    ///            brightest values of Unsigned 32 wrap to 0; saturated below 0.5.
    /// Border     from 0.5 on the image continues with its first and last value in each direction; clamped
    ///            below.
    /// In place   allowed.
    /// NaN        spoils the whole image, from row to column; below 0.5 the 3 x 3 pixels around it.
    /// Threads    below 0.5 on the facet's pool, and Cancel stops it as it does Convolve.
    /// Fails      "Gauss: src and dst pixel types must be identical"; "Gauss: unsupported pixel type";
    ///            "ZELT GaussDerivative input and output images must have the same size".
    virtual HRESULT Gauss(IPixmat2* pIImage, double sigma, IPixmat2* pIOut,
                          IPixmat2** ppIPixmat) noexcept = 0;

    /// The median of a window. Its anchor is ((kernelWidth - 1) / 2, (kernelHeight - 1) / 2): an even size
    /// reaches one further to the right and to the bottom.
    /// Pixels     no colour.
    /// Arguments  kernelWidth, kernelHeight: the whole window in pixels, at least 1.
    /// Values     of an even number of pixels the lower of the two middle ones.
    /// Border     only pixels inside the image count. 3 x 3 is a case of its own: corners take the upper of
    ///            their two middle values, and the last pixel of the last row is not written.
    /// In place   refused.
    /// NaN        has no place in an order: any value of the window may come out.
    /// Fails      "Statistics Filter: src and dst pixel types must be identical";
    ///            "Statistics: unsupported pixel type" (3 x 3: "Median: " begins these two);
    ///            "ZELT Statistics filter input and output images must have the same size" (3 x 3: when the
    ///            output is smaller); "ZELT Statistics filter can not be used in place";
    ///            "ZELT Statistics filter: kernel size below 1".
    virtual HRESULT Median(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight, IPixmat2* pIOut,
                           IPixmat2** ppIPixmat) noexcept = 0;
    /// The least pixel of a window. Windows, border, in place and failures as for a Median other than 3 x 3.
    virtual HRESULT Min(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight, IPixmat2* pIOut,
                        IPixmat2** ppIPixmat) noexcept = 0;
    /// The greatest pixel of a window. Otherwise as Min.
    virtual HRESULT Max(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight, IPixmat2* pIOut,
                        IPixmat2** ppIPixmat) noexcept = 0;
    /// The mean of a window, in double, cut. Otherwise as Min.
    virtual HRESULT Average(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight, IPixmat2* pIOut,
                            IPixmat2** ppIPixmat) noexcept = 0;

    /// Convolves with a kernel: out(x, y) is the sum over its rows j, and in them over its columns i, of
    /// kernel(i, j) * in(x + kx - i, y + ky - j). The kernel is flipped, as in mathematics.
    /// Arguments  kernel: VT_ARRAY | VT_R8 with two dimensions, the leftmost one is x.
    ///            kx, ky: its anchor, which may lie outside.
    /// Values     summed in double in the order of the formula, from 0; saturated.
    /// Border     clamped.
    /// In place   refused.
    /// NaN        makes NaN of every pixel whose window holds it, where the kernel is 0 too.
    /// Threads    rows run on the facet's pool; a second call waits for the first. Cancel stops it between
    ///            rows.
    /// Fails      "Convolve() needs a 2D double kernel"; "Convolve() needs a 2D kernel";
    ///            "Convolve: src and dst pixel types must be identical"; "Convolve: unsupported pixel type";
    ///            "ZELT Convolve input and output images must have the same size";
    ///            "ZELT Convolve can not be used in place".
    ///            E_FAIL "ZELT call was cancelled": the output then holds the rows finished so far and is not
    ///            committed. A request that came before the call counts, but a call that is refused leaves it
    ///            standing.
    virtual HRESULT Convolve(IPixmat2* pIImage, VARIANT kernel, LONG kx, LONG ky, IPixmat2* pIOut,
                             IPixmat2** ppIPixmat) noexcept = 0;
    /// The magnitude of the gradient by the 3 x 3 kernels of Sobel (1 2 1), without a scale: an edge of
    /// height h gives 4 h.
    /// Values     the differences are exact for integers and in the pixel's own type otherwise; their
    ///            hypotenuse is taken in double; saturated.
    /// Border     clamped.
    /// In place   refused.
    /// NaN        makes NaN of the pixels beside it.
    /// Fails      "Sobel: src and dst pixel types must be identical"; "Sobel: unsupported pixel type"; the
    ///            first text again for another size; "Sobel: filter can not be used in place".
    virtual HRESULT Sobel(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept = 0;
    /// The magnitude of the gradient by the kernels of Prewitt (1 1 1): an edge of height h gives 3 h.
    /// Otherwise as Sobel, whose name in the texts is "Prewitt".
    virtual HRESULT Prewitt(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept = 0;

    /// Multiplies with a Hann window, 0 at all four edges: the product of 0.5 - 0.5 cos(2 pi x / (width - 1))
    /// and its like over rows.
    /// Values     the product of both weights is formed first; integers are cut.
    /// In place   allowed.
    /// NaN        stays.
    /// Fails      "ZELT Window input and output images must have the same size"; E_FAIL
    ///            "SWITCH_PIXELENCODING: Format not supported".
    virtual HRESULT HanningWindow(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept = 0;
    /// The same with a Hamming window, 0.54 - 0.46 cos.
    virtual HRESULT HammingWindow(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept = 0;

    /// Puts an image into a frame, usually a larger one, and fades its edges out into a constant.
    /// Pixels     any input that the image component converts; an output without colour.
    /// Arguments  pIOut: the frame, required. pIDstPoint: where the image goes; null centres it. Value: the
    ///            constant.
    ///            maxWidth: of the fading band in pixels; below 1 it reaches to the edge of the frame.
    /// Values     beside the image the nearest pixel of it times f plus Value times 1 - f, where f falls
    ///            linearly to 0 and is a product at corners; cut.
    /// Fails      E_INVALIDARG without text for a null image; "Taper: invalid rectangle provided" for an
    ///            image that starts outside the frame or has no pixel in it; E_NOTIMPL, after the copy, for
    ///            another output type.
    virtual HRESULT Taper(IPixmat2* pIImage, IPixmat2* pIOut, ICoordinateInt* pIDstPoint, double Value,
                          LONG maxWidth) noexcept = 0;
    /// Taper into a new image of the given size, with the bits and encoding of the input.
    virtual HRESULT TaperEx(IPixmat2* pIImage, LONG width, LONG height, ICoordinateInt* pIDstPoint,
                            double Value, LONG maxWidth, IPixmat2** ppIPixmat) noexcept = 0;

    /// The magnitude of the gradient of a smoothed image: the hypotenuse of the differences of both
    /// neighbours in x and in y, not halved.
    /// Arguments  sigma: of the smoothing, a recursive filter. Below 0.5 there is nothing to differ and all
    ///            is 0.
    /// Values     smoothed into float (double for double); the hypotenuse is single precision; saturated.
    /// Border     clamped.
    /// In place   allowed.
    /// NaN        spoils the whole image, from row to column.
    /// Fails      "GaussDerivative: src and dst pixel types must be identical";
    ///            "GaussDerivative: unsupported pixel type";
    ///            "ZELT GaussDerivative input and output images must have the same size".
    virtual HRESULT GaussDerivative(IPixmat2* pIImage, double sigma, IPixmat2* pIOut,
                                    IPixmat2** ppIPixmat) noexcept = 0;
    /// The magnitude of both second differences of a smoothed image, each a quarter of
    /// S(x - 2) + S(x + 2) - 2 S(x). Otherwise as GaussDerivative, with this name in all three texts.
    virtual HRESULT LaplacianGaussian(IPixmat2* pIImage, double sigma, IPixmat2* pIOut,
                                      IPixmat2** ppIPixmat) noexcept = 0;
    /// The second derivative of a smoothed image in the direction of its gradient: the magnitude times
    /// sqrt(2). Below sigma 0.5 the output stays as it was. Otherwise as GaussDerivative, with this name in
    /// all three texts.
    virtual HRESULT SDGDGaussian(IPixmat2* pIImage, double sigma, IPixmat2* pIOut,
                                 IPixmat2** ppIPixmat) noexcept = 0;
    /// The magnitude of the gradient by the differences of both neighbours: an edge of height h gives h.
    /// Otherwise as Sobel.
    /// Fails      "Derivative: src and dst pixel types must be identical";
    ///            "Derivative: unsupported pixel type";
    ///            "ZELT Derivative input and output images must have the same size";
    ///            "ZELT Derivative can not be used in place".
    virtual HRESULT Derivative(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept = 0;

    /// Smooths but keeps edges: a mean whose weights fall with distance and with the difference of values.
    /// The pixel itself takes no part; one without any alike neighbour becomes the mean of the two middle
    /// ones of its eight neighbours.
    /// Arguments  sigma_dist: in pixels; the window reaches 1.5 sigma_dist + 1, cut, to each side.
    ///            sigma_brightness: in pixel values; colours differ by their luminance.
    /// Values     cut.
    /// Border     clamped.
    /// In place   refused.
    /// Threads    as Convolve, Cancel too.
    /// Fails      "Bilateral: src and dst pixel types must be identical";
    ///            "Bilateral: unsupported pixel type";
    ///            "ZELT Bilateral input and output images must have the same size";
    ///            "ZELT Bilateral can not be used in place"; E_FAIL "ZELT call was cancelled".
    virtual HRESULT Bilateral(IPixmat2* pIImage, double sigma_dist, double sigma_brightness, IPixmat2* pIOut,
                              IPixmat2** ppIPixmat) noexcept = 0;
    /// Smooths but keeps what repeats: a mean whose weights fall with the difference of the patches around
    /// the pixels.
    /// Pixels     no colour.
    /// Arguments  windowSize, kernelSize: radius of the neighbourhood and of a patch; n is 2n + 1 pixels
    ///            across.
    ///            sigma_brightness: in pixel values.
    /// Values     cut. Border clamped, in place refused, threads as Convolve, Cancel too.
    /// Fails      as Bilateral, with "NonLocalMeans" as the name in the texts.
    virtual HRESULT NonLocalMeans(IPixmat2* pIImage, LONG windowSize, LONG kernelSize,
                                  double sigma_brightness, IPixmat2* pIOut,
                                  IPixmat2** ppIPixmat) noexcept = 0;
    /// Corrects the output, a thresholded image say, by the image it was made of: moves each of its pixels
    /// toward the source where the source's window agrees with it.
    /// Pixels     no colour.
    /// Arguments  kernelSize: radius of the window. correction: how much disagreement still counts; 0 changes
    ///            nothing.
    ///            pIOut: holds the previous result; a new image holds zeros.
    /// Values     cut. Border clamped, in place refused.
    /// Fails      as Bilateral, with "ThresholdCorrection" as the name in the texts; no Cancel.
    virtual HRESULT ThresholdCorrection(IPixmat2* pIImage, LONG kernelSize, double correction,
                                        IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept = 0;

    /// Keeps low frequencies: a Butterworth profile around frequency zero of the image's spectrum.
    /// Pixels     any that the image component converts to Float and back; a new output has the input's
    ///            descriptor, nominal bits included.
    /// Arguments  order: steepness. frequency: where the profile is 1 / sqrt(2), in pixels of the spectrum.
    /// Values     converted by the image component: rounded, limited to the nominal range.
    /// In place   allowed.
    /// Fails      E_INVALIDARG for a null image; E_POINTER for neither pIOut nor ppIPixmat; E_INVALIDARG
    ///            "LowPass: Output image must be of same size" (all four methods say so).
    virtual HRESULT LowPass(IPixmat2* pIImage, double order, double frequency, IPixmat2* pIOut,
                            IPixmat2** ppIPixmat) noexcept = 0;
    /// Keeps what LowPass takes away. Otherwise as LowPass.
    virtual HRESULT HighPass(IPixmat2* pIImage, double order, double frequency, IPixmat2* pIOut,
                             IPixmat2** ppIPixmat) noexcept = 0;
    /// Keeps what passes HighPass with the low order and frequency and LowPass with the high ones. Otherwise
    /// as LowPass.
    virtual HRESULT BandPass(IPixmat2* pIImage, double orderLow, double freqLow, double orderHigh,
                             double freqHigh, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept = 0;
    /// Keeps what BandPass takes away. Otherwise as LowPass.
    virtual HRESULT BandStop(IPixmat2* pIImage, double orderLow, double freqLow, double orderHigh,
                             double freqHigh, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept = 0;

    /// Smooths but keeps edges: each pixel becomes the mean of the calmest (least variance) of the four
    /// rectangles that have it as a corner.
    /// Pixels     no colour.
    /// Arguments  kernelWidth, kernelHeight: whole window in pixels, at least 1; 4 acts as 3.
    /// Values     cut.
    /// Border     the rectangles are clipped to the image; the clipped area counts.
    /// In place   refused.
    /// NaN        spoils its own pixel and all to the right and below, since sums come from one table.
    /// Fails      "Kuwahara: src and dst pixel types must be identical"; "Kuwahara: unsupported pixel type";
    ///            "ZELT Kuwahara input and output images must have the same size";
    ///            "ZELT Kuwahara can not be used in place"; "Kuwahara: kernel size below 1".
    virtual HRESULT Kuwahara(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight, IPixmat2* pIOut,
                             IPixmat2** ppIPixmat) noexcept = 0;
    /// Reconstructs a height map from two images that carry its gradients.
    /// Pixels     unsigned 8, 16, 32 bit, float. The result is a new Float image.
    /// Arguments  integrateImages: false only scales the divergence by 0.001. theta: the angle, in radians,
    ///            by which the gradients are rotated into x and y.
    /// Fails      E_INVALIDARG "Image sizes or pixel types do not match between the images!"; E_FAIL
    ///            "ColorMixFilter: PixelType not supported"; E_FAIL "No FFTW plan found".
    virtual HRESULT FrankotChellappa(IPixmat2* pIImageComposite1, IPixmat2* pIImageComposite2,
                                     VARIANT_BOOL integrateImages, float theta,
                                     IPixmat2** ppIPixmat) noexcept = 0;

    /// Correlates two images through their spectra: how alike they are at each displacement.
    /// Pixels     real images or spectra (Complex_Float or half-complex), which are used as they are.
    /// Arguments  options: ZELT_CorrelateOptions, added. boundaryCondition: Periodic takes images of one
    ///            size; ConstantValue extends both to the sum of their sizes, with 0 or, under SuppressMean,
    ///            with their mean.
    /// Values     the inverse transform is normalised. No displacement lies at (0, 0), or at the centre.
    /// Fails      E_INVALIDARG
    ///            "Correlation with periodic boundaries using images of different sizes is not supported",
    ///            "Correlation with constant boundaries using FFT transformed image(s) is not supported",
    ///            "Correlation with boundary conditions other than periodic or constant-value are not implemented";
    ///            what a facet that it uses answers, with its text.
    virtual HRESULT CrossCorrelate(IPixmat2* pIImage1, IPixmat2* pIImage2, ULONG options,
                                   ZELT_BoundaryCondition boundaryCondition, IPixmat2* pIOut,
                                   IPixmat2** ppIPixmat) noexcept = 0;
    /// CrossCorrelate of an image with itself.
    virtual HRESULT AutoCorrelate(IPixmat2* pIImage, ULONG options, ZELT_BoundaryCondition boundaryCondition,
                                  IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept = 0;
};

/// The first generation. Gauss works in place; an Ex method is that of IFilters2 into a new image with the
/// descriptor of the input, nominal bits included. E_INVALIDARG for a null input and E_POINTER for a null
/// ppIOut, without text, before any work.
struct IFilters : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0360-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IFilters";
    using base = IDispatch;

    virtual HRESULT Gauss(IPixmat2* pIImage, double sigma) noexcept = 0;
    virtual HRESULT GaussEx(IPixmat2* pIImage, double sigma, IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT MedianEx(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight,
                             IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT MinEx(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight,
                          IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT MaxEx(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight,
                          IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT AverageEx(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight,
                              IPixmat2** ppIOut) noexcept = 0;
    /// kernel: two dimensions of VT_R8, the leftmost one is x. E_INVALIDARG for a null one.
    virtual HRESULT ConvolveEx(IPixmat2* pIImage, SAFEARRAY* kernel, LONG kx, LONG ky,
                               IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT SobelEx(IPixmat2* pIImage, IPixmat2** ppIOut) noexcept = 0;
};

} // namespace Qor::Luxar::ZELT
