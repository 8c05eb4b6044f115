// Division of whole numbers by zero is a fault of the processor, which would take the whole host along.
#pragma once

#include "zelt/zelt.h"

#include <span>

namespace host {

/// True for the methods of IBasicOps and IBasicOps2 that divide.
bool divides(const Qor::interface_info& table, const Qor::method_info& method);

/// For a method that divides: looks for the zero that would fault, in the arguments as the method takes them, first one
/// first. Throws zelt::error with E_INVALIDARG that says where the zero is. Calls that the method itself refuses or
/// that divide real numbers pass.
void refuse_zero_divisor(const Qor::method_info& method, std::span<const Qor::VARIANT* const> arguments);

} // namespace host
