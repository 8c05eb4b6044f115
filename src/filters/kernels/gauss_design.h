// The coefficients of the recursive filters.
#pragma once

#include "filters/kernels/gauss_table.h"

namespace Qor::Luxar::ZELT::Filters {

/// Sigmas from here on are smoothed by recursion. NaN is not.
inline constexpr double least_recursive_sigma = 0.5;

/// After Young and van Vliet, for smoothing.
recursion young_van_vliet(double sigma);

/// Poles fitted for a sigma of 2, for differences of the first and of the second order, and scaled to others.
enum class pole_set { first_derivative, second_derivative };
recursion pole_scaled(double sigma, pole_set poles);

/// The nine values of a Gaussian around its centre, of sum 1, row after row. Sigma 0 gives NaN.
struct small_gaussian {
    double values[9];
};
small_gaussian gaussian_3x3(double sigma);

} // namespace Qor::Luxar::ZELT::Filters
