#include "arithmetic/kernels/expand_half_complex.h"

#include "arithmetic/kernels/expand_half_complex.inl"

namespace Qor::Luxar::ZELT {
namespace {

template <class Part>
void expand(const memory_2d& src, const memory_2d& dst)
{
    using P = complex_pixel<Part>;
    v1::with_rows<P, P>(src, dst, [](auto from, auto to) { v1::expand_half_complex<Part>(from, to); });
}

} // namespace

void ExpandHalfComplex(const memory_2d& src, const memory_2d& dst)
{
    if (dst.height != src.height || dst.width / 2 + 1 != src.width)
        throw std::invalid_argument("ExpandHalfComplex: src and dst size mismatch");
    const bool half_32 = src.type == pixel_type::half_even_32 || src.type == pixel_type::half_odd_32;
    const bool half_64 = src.type == pixel_type::half_even_64 || src.type == pixel_type::half_odd_64;
    const bool single = half_32 && dst.type == pixel_type::complex_32;
    if (!single && !(half_64 && dst.type == pixel_type::complex_64))
        throw std::invalid_argument("ExpandHalfComplex: unsupported pixel type");
    if (dst.width <= 0) return; // a stored width of 1 that claims to be even
    if (single)
        expand<float>(src, dst);
    else
        expand<double>(src, dst);
}

} // namespace Qor::Luxar::ZELT
