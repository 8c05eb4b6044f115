// Arrays of numbers as they are typed, or in a text file.
#pragma once

#include "zelt/zelt.h"

#include <optional>
#include <string>
#include <vector>

namespace cli {

/// "[1,2,3]" has one dimension, "[1,2;3,4]" two: rows, as pictures are written; @FILE has a row a line. The brackets
/// may be left out, ":VT_R4" after all gives the element type. Without one it is `type`; with VT_EMPTY it is VT_I4
/// when all are whole numbers, else VT_R8. Numbers such as "1+2i" make an array of complex objects.
Qor::variant parse_array(const std::string& name, const std::string& text, Qor::VARTYPE type);

/// All numbers of a text file, one after the other.
std::optional<std::vector<double>> numbers_of_file(const std::string& path);

} // namespace cli
