// zelt.Image: an image of the library, or one over a NumPy array.
#pragma once

#include "common/layout_of.h"
#include "pixel_format.h"

namespace python {

struct image_body {
    PyObject_HEAD IPixmat2* image; ///< holds the reference
    PyObject* weak_references;
    Py_ssize_t exports; ///< how many others may write to the pixels without a word
};

void add_image_type(py::module_& module);

bool is_image_object(PyObject* value) noexcept;

/// The Python object of an image: the one there is, or a new one.
py::object wrap_image(IPixmat2* image);

/// An image over the memory of an array, without copying. Throws TypeError or ValueError for what cannot be one.
com_ptr<IPixmat2> image_over_array(py::handle array, py::handle bits, py::handle encoding);

/// Whether arguments that are images take it: an array, or another object with memory.
bool has_pixels(PyObject* value) noexcept;

/// The image to pass to a call. Statistics that are kept on it are dropped when Python may have written since.
IPixmat2* image_for_call(PyObject* image);

using host::layout_of;
bool is_read_only(IPixmat2* image);

} // namespace python
