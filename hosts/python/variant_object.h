// zelt.Variant: a value whose type the caller forces.
#pragma once

#include "python.h"

namespace python {

void add_variant_type(py::module_& module);

/// What a zelt.Variant holds; null for any other object.
const variant* forced_value(PyObject* value);

} // namespace python
