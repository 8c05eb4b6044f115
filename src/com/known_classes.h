// The registered classes as the module's registration sees them.
#pragma once

#include "zelt/com/class_registry.h"

namespace Qor {

/// The description of a class, or null.
const class_entry* find_class(const GUID& class_id) noexcept;

} // namespace Qor
