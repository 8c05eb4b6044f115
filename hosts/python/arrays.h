// SAFEARRAY and NumPy. The leftmost dimension of a SAFEARRAY runs fastest, as NumPy's last axis does: the shape of a
// two-dimensional one is (height, width).
#pragma once

#include "python.h"

namespace python {

/// A new array from anything that NumPy makes an array of. `element` forces the type of the elements.
safe_array to_safe_array(py::handle values, VARTYPE element);

/// Takes the array over: numbers stay where they are.
py::object from_safe_array(safe_array array);

} // namespace python
