// Results of calls as Python values.
#pragma once

#include "python.h"

namespace python {

/// `a` says what the value is; it may be null. An array leaves the value, which is empty then.
py::object to_python(VARIANT& v, const argument_info* a);

} // namespace python
