// Values as text for people and as JSON for programs.
#pragma once

#include "zelt/zelt.h"

#include <string>

namespace cli {

/// The shortest text that reads back as the same number; "nan", "inf", "-inf".
std::string number_text(double value);
std::string number_text(float value);

/// Numbers, texts, arrays (a row a line), rectangles and coordinates ("1,2"), other objects by their properties,
/// collections an item a line.
std::string value_text(const Qor::VARIANT& value);

/// The same as JSON. An array of two dimensions becomes rows; numbers that are not finite become null.
std::string value_json(const Qor::VARIANT& value);

std::string json_string(const std::string& text);

} // namespace cli
