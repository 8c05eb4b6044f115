// Numbers as they are typed.
#pragma once

#include "common/variant_types.h"

#include <complex>
#include <optional>
#include <string>
#include <vector>

namespace cli {

/// Decimal or 0x...; the whole text must be the number.
std::optional<int64_t> parse_integer(const std::string& text);

/// VT_I4 for a whole number that fits, VT_I8 or VT_UI8 for a larger one, VT_R8 for any other. "nan" and "inf" are
/// numbers.
std::optional<Qor::variant> parse_number(const std::string& text);

/// "1,2.5,-3"; colours as "#rrggbb" give their numbers.
std::optional<std::vector<double>> parse_numbers(const std::string& text);

/// "1,2", "1+2i", "-2i".
std::optional<std::complex<double>> parse_complex(const std::string& text);

using host::find_type;

std::vector<std::string> split(const std::string& text, char separator);

} // namespace cli
