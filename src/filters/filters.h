// The facets of filters. Their methods lie beside this by family, those of both generations together.
#pragma once

#include "frame/facet.h"
#include "threads/multi_threaded_pool.h"
#include "zelt/interfaces/filters.h"
#include "zelt/interfaces/zelt.h"

namespace Qor::Luxar::ZELT {

/// Some filters are made of other facets' operations and ask the root for them, as a client would. The root
/// owns this object and outlives every call on it that it made itself; nobody counts this pointer.
class CFilters2 : public rounding_facet<IFilters2> {
public:
    explicit CFilters2(IZELT2* root) noexcept : root_(root) {}

    HRESULT Gauss(IPixmat2* pIImage, double sigma, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept override;
    HRESULT Median(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight, IPixmat2* pIOut,
                   IPixmat2** ppIPixmat) noexcept override;
    HRESULT Min(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight, IPixmat2* pIOut,
                IPixmat2** ppIPixmat) noexcept override;
    HRESULT Max(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight, IPixmat2* pIOut,
                IPixmat2** ppIPixmat) noexcept override;
    HRESULT Average(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight, IPixmat2* pIOut,
                    IPixmat2** ppIPixmat) noexcept override;
    HRESULT Convolve(IPixmat2* pIImage, VARIANT kernel, LONG kx, LONG ky, IPixmat2* pIOut,
                     IPixmat2** ppIPixmat) noexcept override;
    HRESULT Sobel(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept override;
    HRESULT Prewitt(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept override;
    HRESULT HanningWindow(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept override;
    HRESULT HammingWindow(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept override;
    HRESULT Taper(IPixmat2* pIImage, IPixmat2* pIOut, ICoordinateInt* pIDstPoint, double Value,
                  LONG maxWidth) noexcept override;
    HRESULT TaperEx(IPixmat2* pIImage, LONG width, LONG height, ICoordinateInt* pIDstPoint, double Value,
                    LONG maxWidth, IPixmat2** ppIPixmat) noexcept override;
    HRESULT GaussDerivative(IPixmat2* pIImage, double sigma, IPixmat2* pIOut,
                            IPixmat2** ppIPixmat) noexcept override;
    HRESULT LaplacianGaussian(IPixmat2* pIImage, double sigma, IPixmat2* pIOut,
                              IPixmat2** ppIPixmat) noexcept override;
    HRESULT SDGDGaussian(IPixmat2* pIImage, double sigma, IPixmat2* pIOut,
                         IPixmat2** ppIPixmat) noexcept override;
    HRESULT Derivative(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept override;
    HRESULT Bilateral(IPixmat2* pIImage, double sigma_dist, double sigma_brightness, IPixmat2* pIOut,
                      IPixmat2** ppIPixmat) noexcept override;
    HRESULT NonLocalMeans(IPixmat2* pIImage, LONG windowSize, LONG kernelSize, double sigma_brightness,
                          IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept override;
    HRESULT ThresholdCorrection(IPixmat2* pIImage, LONG kernelSize, double correction, IPixmat2* pIOut,
                                IPixmat2** ppIPixmat) noexcept override;
    HRESULT LowPass(IPixmat2* pIImage, double order, double frequency, IPixmat2* pIOut,
                    IPixmat2** ppIPixmat) noexcept override;
    HRESULT HighPass(IPixmat2* pIImage, double order, double frequency, IPixmat2* pIOut,
                     IPixmat2** ppIPixmat) noexcept override;
    HRESULT BandPass(IPixmat2* pIImage, double orderLow, double freqLow, double orderHigh, double freqHigh,
                     IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept override;
    HRESULT BandStop(IPixmat2* pIImage, double orderLow, double freqLow, double orderHigh, double freqHigh,
                     IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept override;
    HRESULT Kuwahara(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight, IPixmat2* pIOut,
                     IPixmat2** ppIPixmat) noexcept override;
    HRESULT FrankotChellappa(IPixmat2* pIImageComposite1, IPixmat2* pIImageComposite2,
                             VARIANT_BOOL integrateImages, float theta,
                             IPixmat2** ppIPixmat) noexcept override;
    HRESULT CrossCorrelate(IPixmat2* pIImage1, IPixmat2* pIImage2, ULONG options,
                           ZELT_BoundaryCondition boundaryCondition, IPixmat2* pIOut,
                           IPixmat2** ppIPixmat) noexcept override;
    HRESULT AutoCorrelate(IPixmat2* pIImage, ULONG options, ZELT_BoundaryCondition boundaryCondition,
                          IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept override;

protected:
    IZELT2* root() const noexcept { return root_; }
    Thread::MultiThreadedPool& pool() noexcept { return pool_; }

private:
    IZELT2* root_;
    Thread::MultiThreadedPool pool_{0, nullptr};
};
using CFilters2Disp = scripting<CFilters2>;

/// Works on a second-generation object of its own, where nothing that it calls needs a root.
class CFilters : public automation<IFilters> {
public:
    explicit CFilters(IZELT*) {}

    ZeltRoundable& roundable() noexcept { return second_->roundable(); }

    HRESULT Gauss(IPixmat2* pIImage, double sigma) noexcept override;
    HRESULT GaussEx(IPixmat2* pIImage, double sigma, IPixmat2** ppIOut) noexcept override;
    HRESULT MedianEx(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight,
                     IPixmat2** ppIOut) noexcept override;
    HRESULT MinEx(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight,
                  IPixmat2** ppIOut) noexcept override;
    HRESULT MaxEx(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight,
                  IPixmat2** ppIOut) noexcept override;
    HRESULT AverageEx(IPixmat2* pIImage, LONG kernelWidth, LONG kernelHeight,
                      IPixmat2** ppIOut) noexcept override;
    HRESULT ConvolveEx(IPixmat2* pIImage, SAFEARRAY* kernel, LONG kx, LONG ky,
                       IPixmat2** ppIOut) noexcept override;
    HRESULT SobelEx(IPixmat2* pIImage, IPixmat2** ppIOut) noexcept override;

private:
    com_ptr<CFilters2> second_ = make<CFilters2>(nullptr);
};

} // namespace Qor::Luxar::ZELT
