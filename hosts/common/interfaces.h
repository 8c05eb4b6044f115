// Interface tables as hosts look at them.
#pragma once

#include "zelt/zelt.h"

#include <vector>

namespace host {

/// The table of any object; null for one that has none.
const Qor::interface_info* table_of(Qor::IDispatch* object);

inline bool is_image(const Qor::argument_info& a)
{
    return a.interface_id && *a.interface_id == Qor::Luxar::IPixmat2::iid;
}

/// The arguments that a caller gives, in order.
std::vector<const Qor::argument_info*> inputs_of(const Qor::method_info& method);

} // namespace host
