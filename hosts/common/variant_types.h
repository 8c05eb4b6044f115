// The names of VARIANT types.
#pragma once

#include "zelt/zelt.h"

#include <optional>
#include <string>

namespace host {

/// Of a number: "VT_R4". Case does not matter.
std::optional<Qor::VARTYPE> find_type(const std::string& name);

/// The name of a number's type, or null.
const char* type_name(Qor::VARTYPE type);

} // namespace host
