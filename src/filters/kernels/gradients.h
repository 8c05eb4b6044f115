// Magnitudes of gradients over 3 x 3 pixels.
#pragma once

#include "pixel/memory_2d.h"

namespace Qor::Luxar::ZELT::Filters {

// The methods of IFilters2 with these names. They throw std::invalid_argument with the texts told there.
void sobel(const memory_2d& src, const memory_2d& dst);
void prewitt(const memory_2d& src, const memory_2d& dst);
void derivative(const memory_2d& src, const memory_2d& dst);

} // namespace Qor::Luxar::ZELT::Filters
