// How pixels of the library look to NumPy, and the other way round.
#pragma once

#include "python.h"

namespace python {

struct pixel_format {
    const char* format; ///< as in the struct module, with Zf and Zd for complex numbers
    char kind;          ///< 'u', 'i', 'f', 'c'
    int item_bytes;
    int channels; ///< 0: a pixel is one element
};

/// Every image has a form: pixels of no known type are a row of bytes.
pixel_format format_of(const image_layout& layout);

/// The layout of an array's elements seen as pixels. Throws TypeError or ValueError with what to do about it.
image_layout layout_of_array(const py::array& array, py::handle bits, py::handle encoding);

/// By number, or by name with or without its prefix.
PixmatEncoding to_encoding(py::handle encoding);

} // namespace python
