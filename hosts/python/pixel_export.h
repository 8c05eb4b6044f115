// Pixels of an image in the hands of others: NumPy and whoever knows the buffer protocol, and DLPack.
#pragma once

#include "image.h"

namespace python {

/// A lock on an image for as long as somebody else looks at its pixels.
class pixel_export {
public:
    explicit pixel_export(image_body* image);
    ~pixel_export();
    pixel_export(const pixel_export&) = delete;
    pixel_export& operator=(const pixel_export&) = delete;

    void* first_pixel() const noexcept { return data_; }
    bool read_only() const noexcept { return read_only_; }
    const pixel_format& format() const noexcept { return format_; }
    int dimensions() const noexcept { return format_.channels ? 3 : 2; }
    Py_ssize_t bytes() const noexcept;

    Py_ssize_t shape[3];   ///< height, width, and the channels of a colour
    Py_ssize_t strides[3]; ///< in bytes

private:
    image_body* const image_; ///< counted
    com_ptr<IPixmatLock> lock_;
    pixel_format format_;
    void* data_;
    bool read_only_;
};

/// For the buffer protocol of Python.
int get_buffer(PyObject* image, Py_buffer* view, int flags);
void release_buffer(PyObject* image, Py_buffer* view);

/// The value of image.__array_interface__.
py::dict array_interface(image_body* image);

/// The capsule of image.__dlpack__; `max_version` and `copy` as given there.
py::object to_dlpack(image_body* image, py::handle max_version, py::handle copy);

} // namespace python
