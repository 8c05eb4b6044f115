// Objects for the arguments of value interfaces for which the library has no maker of its own.
#pragma once

#include "zelt/zelt.h"

#include <complex>
#include <vector>

namespace host {

Qor::com_ptr<Qor::Luxar::ISizeInt> make_size(int32_t width, int32_t height);
Qor::com_ptr<Qor::Luxar::IRangeFloat> make_range(double low, double high);
Qor::com_ptr<Qor::Luxar::ZELT::IComplex> make_complex(std::complex<double> value);
Qor::com_ptr<Qor::Luxar::IPixmatDescriptor> make_descriptor(const Qor::Luxar::image_layout& layout);

/// low, high, then the colours. Throws std::invalid_argument for what is no colour.
Qor::com_ptr<Qor::Luxar::ILookupTable> make_lookup_table(const std::vector<double>& numbers);

} // namespace host
