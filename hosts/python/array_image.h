// An image over memory that Python lent.
#pragma once

#include "python.h"

namespace python {

/// `owner` stays alive as long as the image. Unlike images that the library makes, this one keeps no statistics: Python
/// may write to the memory at any time without a word.
com_ptr<IPixmat2> make_array_image(void* first_pixel, const image_layout& layout, bool read_only,
                                   py::object owner);

} // namespace python
