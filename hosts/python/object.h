// Automation objects in Python: one class for each interface, made from its table when the first such object comes.
#pragma once

#include "python.h"

namespace python {

/// An instance of zelt.Object or of a class derived from it.
struct object_body {
    PyObject_HEAD IUnknown* unknown; ///< holds the reference
    IDispatch* dispatch;             ///< null for an object that does not answer by name
};

void add_object_type(py::module_& module);

/// A new Python object for any automation object that is no image.
py::object wrap_object(IUnknown* object);

/// The class for objects of a table; `sample` is one of them.
PyTypeObject* class_of(const interface_info& table, IDispatch* sample);

bool is_object(PyObject* value) noexcept;

/// All enumerations and interface classes that are known by now, by name.
py::dict known_names();

/// The IntEnum class of an enumeration.
py::handle enumeration_class(const enumeration_info& enumeration);

} // namespace python
