#include "pixel_export.h"

#include <memory>

namespace python {

pixel_export::pixel_export(image_body* image) : image_(image), read_only_(is_read_only(image->image))
{
    const image_layout l = layout_of(image->image);
    format_ = format_of(l);
    check(read_only_ ? image->image->OpenRead(nullptr, 1.0, lock_.put())
                     : image->image->OpenWrite(lock_.put()));
    data_ = lock_->Data(0) + l.offset;
    shape[0] = l.height;
    shape[1] = l.width;
    shape[2] = format_.channels;
    strides[0] = l.y_stride;
    strides[1] = l.x_stride;
    strides[2] = 1;
    Py_INCREF(reinterpret_cast<PyObject*>(image));
    if (!read_only_) ++image->exports;
}

pixel_export::~pixel_export()
{
    lock_ = nullptr; // which drops the statistics, since pixels may have changed
    if (!read_only_) --image_->exports;
    Py_DECREF(reinterpret_cast<PyObject*>(image_));
}

Py_ssize_t pixel_export::bytes() const noexcept
{
    return shape[0] * shape[1] * format_.item_bytes * (format_.channels ? format_.channels : 1);
}

int get_buffer(PyObject* image, Py_buffer* view, int flags)
{
    view->obj = nullptr;
    return guarded(-1, [&] {
        auto pixels = std::make_unique<pixel_export>(reinterpret_cast<image_body*>(image));
        if ((flags & PyBUF_WRITABLE) && pixels->read_only())
            throw raised(PyExc_BufferError, "the image is read-only");
        view->buf = pixels->first_pixel();
        view->len = pixels->bytes();
        view->itemsize = pixels->format().item_bytes;
        view->readonly = pixels->read_only();
        view->ndim = pixels->dimensions();
        view->format = const_cast<char*>(pixels->format().format);
        view->shape = pixels->shape;
        view->strides = pixels->strides;
        view->suboffsets = nullptr;

        const auto wants = [&](int request) { return (flags & request) == request; };
        const char* order = nullptr;
        if (wants(PyBUF_C_CONTIGUOUS) || !wants(PyBUF_STRIDES)) order = "C";
        if (wants(PyBUF_F_CONTIGUOUS)) order = "F";
        if (wants(PyBUF_ANY_CONTIGUOUS)) order = "A";
        if (order && !PyBuffer_IsContiguous(view, *order))
            throw raised(PyExc_BufferError, "the rows of the image do not follow each other without a gap");
        if (!wants(PyBUF_FORMAT)) view->format = nullptr;
        if (!wants(PyBUF_STRIDES)) view->strides = nullptr;
        if (!wants(PyBUF_ND)) view->shape = nullptr;

        Py_INCREF(image);
        view->obj = image;
        view->internal = pixels.release();
        return 0;
    });
}

void release_buffer(PyObject*, Py_buffer* view) { delete static_cast<pixel_export*>(view->internal); }

py::dict array_interface(image_body* image)
{
    using namespace py::literals;
    const pixel_export pixels(image);
    // Nobody says when the address is no longer in use.
    if (!pixels.read_only()) ++image->exports;
    py::tuple shape(pixels.dimensions()), strides(pixels.dimensions());
    for (int i = 0; i < pixels.dimensions(); ++i) {
        shape[static_cast<size_t>(i)] = pixels.shape[i];
        strides[static_cast<size_t>(i)] = pixels.strides[i];
    }
    const pixel_format f = pixels.format();
    const std::string type =
        (f.item_bytes == 1 ? "|" : "<") + std::string(1, f.kind) + std::to_string(f.item_bytes);
    return py::dict(
        "version"_a = 3, "typestr"_a = type, "shape"_a = shape, "strides"_a = strides,
        "data"_a = py::make_tuple(reinterpret_cast<uintptr_t>(pixels.first_pixel()), pixels.read_only()));
}

namespace {

// The binary interface of DLPack, as both sides of it know it.
struct dl_tensor {
    void* data;
    int32_t device_type;
    int32_t device_id;
    int32_t ndim;
    uint8_t code;
    uint8_t bits;
    uint16_t lanes;
    int64_t* shape;
    int64_t* strides; ///< in elements
    uint64_t byte_offset;
};

struct unversioned_tensor {
    dl_tensor tensor;
    void* context;
    void (*release)(unversioned_tensor*);
};

struct versioned_tensor {
    uint32_t major;
    uint32_t minor;
    void* context;
    void (*release)(versioned_tensor*);
    uint64_t flags;
    dl_tensor tensor;
};

constexpr int32_t dl_cpu = 1;
constexpr uint64_t dl_read_only = 1;

struct dl_context {
    explicit dl_context(image_body* image) : pixels(image) {}
    pixel_export pixels;
    int64_t shape[3];
    int64_t strides[3];
};

uint8_t dl_code(char kind) { return kind == 'i' ? 0 : kind == 'u' ? 1 : kind == 'f' ? 2 : 5; }

dl_tensor describe(dl_context& c)
{
    const pixel_format f = c.pixels.format();
    for (int i = 0; i < c.pixels.dimensions(); ++i) {
        if (c.pixels.strides[i] % f.item_bytes != 0)
            throw raised(PyExc_BufferError,
                         "DLPack counts strides in elements, and those of the image are none");
        c.shape[i] = c.pixels.shape[i];
        c.strides[i] = c.pixels.strides[i] / f.item_bytes;
    }
    return {c.pixels.first_pixel(),
            dl_cpu,
            0,
            c.pixels.dimensions(),
            dl_code(f.kind),
            static_cast<uint8_t>(8 * f.item_bytes),
            1,
            c.shape,
            c.strides,
            0};
}

/// The consumer may call it without the interpreter lock.
template <class Tensor>
void release_tensor(Tensor* tensor)
{
    const py::gil_scoped_acquire locked;
    delete static_cast<dl_context*>(tensor->context);
    delete tensor;
}

/// A consumer renames the capsule and takes over what it holds.
template <class Tensor>
void release_unused(PyObject* capsule, const char* name)
{
    if (!PyCapsule_IsValid(capsule, name)) return;
    auto* const tensor = static_cast<Tensor*>(PyCapsule_GetPointer(capsule, name));
    tensor->release(tensor);
}

template <class Tensor>
py::object make_capsule(std::unique_ptr<Tensor> tensor, const char* name, PyCapsule_Destructor destructor)
{
    PyObject* const capsule = PyCapsule_New(tensor.get(), name, destructor);
    if (!capsule) {
        Tensor* const unused = tensor.release();
        unused->release(unused);
        throw py::error_already_set();
    }
    static_cast<void>(tensor.release());
    return py::reinterpret_steal<py::object>(capsule);
}

constexpr char unversioned_name[] = "dltensor";
constexpr char versioned_name[] = "dltensor_versioned";

} // namespace

py::object to_dlpack(image_body* image, py::handle max_version, py::handle copy)
{
    if (!copy.is_none() && copy.cast<bool>())
        throw raised(PyExc_BufferError, "the image lends its pixels and makes no copy: image.copy() does");
    auto context = std::make_unique<dl_context>(image);
    const bool read_only = context->pixels.read_only();
    if (!max_version.is_none() && max_version.cast<py::tuple>()[0].cast<int>() >= 1) {
        auto tensor = std::make_unique<versioned_tensor>();
        *tensor = {1,
                   0,
                   nullptr,
                   release_tensor<versioned_tensor>,
                   read_only ? dl_read_only : 0,
                   describe(*context)};
        tensor->context = context.release();
        return make_capsule(std::move(tensor), versioned_name,
                            [](PyObject* c) { release_unused<versioned_tensor>(c, versioned_name); });
    }
    if (read_only)
        throw raised(PyExc_BufferError,
                     "the image is read-only, which only DLPack 1.0 can say: ask for it with "
                     "max_version, or use numpy.asarray(image)");
    auto tensor = std::make_unique<unversioned_tensor>();
    *tensor = {describe(*context), nullptr, release_tensor<unversioned_tensor>};
    tensor->context = context.release();
    return make_capsule(std::move(tensor), unversioned_name,
                        [](PyObject* c) { release_unused<unversioned_tensor>(c, unversioned_name); });
}

} // namespace python
