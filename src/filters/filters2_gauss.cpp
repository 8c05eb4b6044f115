// The Gaussian family.
#include "filters/filters.h"
#include "filters/first_generation.h"
#include "filters/kernels/gauss.h"
#include "frame/operation.h"

namespace Qor::Luxar::ZELT {
namespace {

/// kernel(src, dst) on the views of the input and of the output that it resolves to.
template <class Kernel>
HRESULT filtered(IPixmat2* input, IPixmat2* output, IPixmat2** result, Kernel&& kernel) noexcept
{
    return image_method<IFilters2>(result, [&] {
        auto dst = ResolveOutput(input, output);
        const ImageReadAccess src(input);
        kernel(src.view(), dst.view());
        return committed(dst);
    });
}

} // namespace

HRESULT CFilters2::Gauss(IPixmat2* pIImage, double sigma, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept
{
    return filtered(pIImage, pIOut, ppIPixmat, [&](const memory_2d& src, const memory_2d& dst) {
        Filters::gauss(src, sigma, dst, &pool());
    });
}

HRESULT CFilters2::GaussDerivative(IPixmat2* pIImage, double sigma, IPixmat2* pIOut,
                                   IPixmat2** ppIPixmat) noexcept
{
    return filtered(pIImage, pIOut, ppIPixmat, [&](const memory_2d& src, const memory_2d& dst) {
        Filters::gauss_derivative(src, sigma, dst);
    });
}

HRESULT CFilters2::LaplacianGaussian(IPixmat2* pIImage, double sigma, IPixmat2* pIOut,
                                     IPixmat2** ppIPixmat) noexcept
{
    return filtered(pIImage, pIOut, ppIPixmat, [&](const memory_2d& src, const memory_2d& dst) {
        Filters::laplacian_gaussian(src, sigma, dst);
    });
}

HRESULT CFilters2::SDGDGaussian(IPixmat2* pIImage, double sigma, IPixmat2* pIOut,
                                IPixmat2** ppIPixmat) noexcept
{
    return filtered(pIImage, pIOut, ppIPixmat, [&](const memory_2d& src, const memory_2d& dst) {
        Filters::sdgd_gaussian(src, sigma, dst);
    });
}

HRESULT CFilters::Gauss(IPixmat2* pIImage, double sigma) noexcept
{
    com_ptr<IPixmat2> same;
    return second_->Gauss(pIImage, sigma, pIImage, same.put());
}

HRESULT CFilters::GaussEx(IPixmat2* pIImage, double sigma, IPixmat2** ppIOut) noexcept
{
    return into_new_image(pIImage, ppIOut,
                          [&](IPixmat2* output) { return second_->Gauss(pIImage, sigma, output, ppIOut); });
}

} // namespace Qor::Luxar::ZELT
