// Methods and properties of the interface classes: callable from Python, bound late.
#pragma once

#include "python.h"

namespace python {

void add_method_type(py::module_& module);

/// A callable that takes the object first. Its place of use calls own_method when the class is there.
py::object make_method(const interface_info& table, const method_info& method, DISPID id);
void own_method(py::handle method, PyTypeObject* owner);

} // namespace python
