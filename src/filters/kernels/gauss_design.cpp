#include "filters/kernels/gauss_design.h"

#include <cmath>

#include <sleef.h>

namespace Qor::Luxar::ZELT::Filters {
namespace {

/// A complex pair and a real pole for a sigma of 2.
struct pole_triple {
    double real, imaginary, magnitude, angle;
    double single;
};
constexpr pole_triple first_order{1.31553, 0.97057, 1.6348165969918462, 0.635633478432331, 1.77635};
constexpr pole_triple second_order{1.22886, 0.93058, 1.5414525733865445, 0.6481383099251729, 1.70493};

} // namespace

recursion young_van_vliet(double sigma)
{
    const double q =
        sigma >= 2.5 ? 0.98711 * sigma - 0.9633 : 3.97156 - 4.14554 * std::sqrt(1 - 0.26891 * sigma);
    const double q2 = q * q, q3 = q2 * q;
    const double b0 = 1.57825 + 2.44413 * q + 1.4281 * q2 + 0.422205 * q3;
    const double b1 = (2.44413 + 2.85619 * q + 1.26661 * q2) * q;
    const double b2 = -(1.4281 + 1.26661 * q) * q2;
    const double b3 = 0.422205 * q3;
    const double a1 = b1 / b0, a2 = b2 / b0, a3 = b3 / b0;
    return {1 - (a1 + a2 + a3), a1, a2, a3};
}

recursion pole_scaled(double sigma, pole_set poles)
{
    const pole_triple& at_2 = poles == pole_set::first_derivative ? first_order : second_order;
    double re = at_2.real, im = at_2.imaginary, d = at_2.single;
    if (sigma != 2) {
        // The same on every processor, which the functions of the C library are not.
        const double p = 2 / sigma;
        const double magnitude = Sleef_cinz_powd1_u10purec(at_2.magnitude, p);
        re = magnitude * Sleef_cinz_cosd1_u10purec(at_2.angle * p);
        im = magnitude * Sleef_cinz_sind1_u10purec(at_2.angle * p);
        d = Sleef_cinz_powd1_u10purec(at_2.single, p);
    }
    const double n = re * re + im * im;
    const double a3 = 1 / (n * d);
    const double a1 = (2 * d * re + n) * a3;
    const double a2 = (2 * re + d) * a3;
    return {1 - a1 + a2 - a3, a1, -a2, a3};
}

small_gaussian gaussian_3x3(double sigma)
{
    small_gaussian kernel;
    double sum = 0;
    double* value = kernel.values;
    for (int j = -1; j <= 1; ++j)
        for (int i = -1; i <= 1; ++i, ++value) {
            *value = Sleef_cinz_expd1_u10purec(-(i * i + j * j) / (2 * sigma * sigma));
            sum += *value;
        }
    for (double& v : kernel.values) v /= sum;
    return kernel;
}

} // namespace Qor::Luxar::ZELT::Filters
