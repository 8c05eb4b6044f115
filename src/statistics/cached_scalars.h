// The scalar statistics of an image, from its store where it has them, else from a pass.
#pragma once

#include "statistics/kernels/scalar_statistics.h"
#include "zelt/pixmat/pixmat.h"

namespace Qor::Luxar::ZELT::Statistics {

inline constexpr HRESULT from_store = 0;
inline constexpr HRESULT from_pass = 1;

/// A failure code, from_store when `value` holds the answer, from_pass when `record` was computed. Throws
/// HResultException when a write to the store fails.
HRESULT read_statistic(IPixmat2* image, IRectangle* area, statistic_flag flag, LONG subsample_factor,
                       double* value, image_statistics& record);

/// What a record says of a flag.
double value_of(const image_statistics& record, statistic_flag flag) noexcept;

} // namespace Qor::Luxar::ZELT::Statistics
