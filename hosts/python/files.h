// Image files, by the readers and writers of the command line.
#pragma once

#include "python.h"

namespace python {

void add_file_functions(py::module_& module);

} // namespace python
