#include "image.h"

#include "array_image.h"
#include "object.h"
#include "pixel_export.h"

#include <cstddef>
#include <structmember.h>
#include <unordered_map>

namespace python {
namespace {

PyTypeObject* image_type = nullptr;

/// The Python object of each image that has one, borrowed. Guarded by the interpreter lock; lives for ever.
auto& living()
{
    static auto& all = *new std::unordered_map<IPixmat2*, PyObject*>();
    return all;
}

image_body* body_of(PyObject* self) { return reinterpret_cast<image_body*>(self); }

void destroy(PyObject* self)
{
    image_body& body = *body_of(self);
    if (body.weak_references) PyObject_ClearWeakRefs(self);
    if (IPixmat2* const held = std::exchange(body.image, nullptr)) {
        living().erase(held);
        com_ptr<IPixmat2>::attach(held);
    }
    PyTypeObject* const type = Py_TYPE(self);
    type->tp_free(self);
    Py_DECREF(type);
}

PyObject* refuse_new(PyTypeObject*, PyObject*, PyObject*)
{
    PyErr_SetString(PyExc_TypeError, "zelt.image(array) makes an image over an array");
    return nullptr;
}

bool is_masked(const py::array& a)
{
    static PyObject* const masked =
        py::object(py::module_::import("numpy.ma").attr("MaskedArray")).release().ptr();
    return PyObject_IsInstance(a.ptr(), masked) == 1;
}

/// A view of the object's own memory.
py::array to_array(py::handle given)
{
    if (py::isinstance<py::array>(given)) {
        const auto a = py::reinterpret_borrow<py::array>(given);
        if (Py_TYPE(a.ptr()) != py::detail::npy_api::get().PyArray_Type_ && is_masked(a))
            throw raised(PyExc_TypeError,
                         "zelt.image: images have no mask; array.filled(value) is a copy without");
        return a;
    }
    if (!has_pixels(given.ptr()))
        throw raised(PyExc_TypeError, "zelt.image: an array is wanted, or another object with memory, not " +
                                          type_of(given.ptr()) + "; numpy.array(...) makes one of it");
    const bool dlpack_only = !PyObject_CheckBuffer(given.ptr()) && !py::hasattr(given, "__array_interface__");
    return py::module_::import("numpy")
        .attr(dlpack_only ? "from_dlpack" : "asarray")(given)
        .cast<py::array>();
}

template <class Body>
PyObject* attribute(PyObject* self, Body&& body)
{
    return guarded<PyObject*>(nullptr, [&] { return py::object(body(body_of(self))).release().ptr(); });
}

PyObject* call_python_part(const char* function, PyObject* self)
{
    return guarded<PyObject*>(
        nullptr, [&] { return python_part("_image", function)(py::handle(self)).release().ptr(); });
}

py::tuple shape_of(IPixmat2* image)
{
    const image_layout l = layout_of(image);
    const int channels = format_of(l).channels;
    return channels ? py::make_tuple(l.height, l.width, channels) : py::make_tuple(l.height, l.width);
}

py::object dtype_of(IPixmat2* image)
{
    const pixel_format f = format_of(layout_of(image));
    return py::dtype(std::string(1, f.kind) + std::to_string(f.item_bytes));
}

#define ZELT_IMAGE_ATTRIBUTE(name, value, text)                                                              \
    {                                                                                                        \
        name,                                                                                                \
            [](PyObject* self, void*) {                                                                      \
                return attribute(self, [](image_body* b) -> py::object { return value; });                   \
            },                                                                                               \
            nullptr, text, nullptr                                                                           \
    }

PyGetSetDef attributes[] = {
    ZELT_IMAGE_ATTRIBUTE("width", py::int_(layout_of(b->image).width), "pixels in a row"),
    ZELT_IMAGE_ATTRIBUTE("height", py::int_(layout_of(b->image).height), "rows"),
    ZELT_IMAGE_ATTRIBUTE("bits", py::int_(layout_of(b->image).bits),
                         "nominal depth: 12 for 12-bit data in 16-bit words"),
    ZELT_IMAGE_ATTRIBUTE(
        "encoding",
        python_part("_values", "enumeration_value")(enumeration_class(enumeration_of<PixmatEncoding>::info),
                                                    static_cast<int>(layout_of(b->image).encoding)),
        "what the bits mean, a PixmatEncoding"),
    ZELT_IMAGE_ATTRIBUTE("shape", shape_of(b->image), "(height, width), and the channels of a colour"),
    ZELT_IMAGE_ATTRIBUTE("dtype", dtype_of(b->image), "the type of the elements for NumPy"),
    ZELT_IMAGE_ATTRIBUTE("readonly", py::bool_(is_read_only(b->image)),
                         "whether no result can be written to it"),
    ZELT_IMAGE_ATTRIBUTE("__array_interface__", array_interface(b), nullptr),
    {nullptr, nullptr, nullptr, nullptr, nullptr}};

#undef ZELT_IMAGE_ATTRIBUTE

PyObject* dlpack(PyObject* self, PyObject* arguments, PyObject* names)
{
    static const char* const known[] = {"stream", "max_version", "dl_device", "copy", nullptr};
    PyObject *stream = Py_None, *version = Py_None, *device = Py_None, *copy = Py_None;
    if (!PyArg_ParseTupleAndKeywords(arguments, names, "|$OOOO", const_cast<char**>(known), &stream, &version,
                                     &device, &copy))
        return nullptr;
    return attribute(self, [&](image_body* b) { return to_dlpack(b, version, copy); });
}

PyObject* as_array(PyObject* self, PyObject* arguments, PyObject* names)
{
    return guarded<PyObject*>(nullptr, [&] {
        const auto given = py::reinterpret_borrow<py::tuple>(arguments);
        const auto named = names ? py::reinterpret_borrow<py::dict>(names) : py::dict();
        return python_part("_image", "as_array")(py::handle(self), *given, **named).release().ptr();
    });
}

/// A commit without writing.
py::object tell_of_change(image_body* b)
{
    com_ptr<IPixmatLock> lock;
    check(b->image->OpenWrite(lock.put()));
    {
        const without_lock unlocked; // sequences that listen run now
        zelt::check(lock->Commit(nullptr));
    }
    return py::none();
}

py::object copy_of(image_body* b)
{
    com_ptr<IPixmat2> copy;
    {
        const without_lock unlocked;
        zelt::check(b->image->Clone(copy.put()));
    }
    return wrap_image(copy.get());
}

PyCFunction with_names(PyObject* (*function)(PyObject*, PyObject*, PyObject*))
{
    return reinterpret_cast<PyCFunction>(reinterpret_cast<void (*)()>(function));
}

PyMethodDef methods[] = {
    {"copy", [](PyObject* self, PyObject*) { return attribute(self, copy_of); }, METH_NOARGS,
     "copy($self, /)\n--\n\nA packed image with its own memory."},
    {"changed", [](PyObject* self, PyObject*) { return attribute(self, tell_of_change); }, METH_NOARGS,
     "changed($self, /)\n--\n\nTells sequences that listen to the image that its pixels were written through "
     "an array."},
    {"__array__", with_names(as_array), METH_VARARGS | METH_KEYWORDS, nullptr},
    {"__dlpack__", with_names(dlpack), METH_VARARGS | METH_KEYWORDS, nullptr},
    {"__dlpack_device__", [](PyObject*, PyObject*) { return Py_BuildValue("(ii)", 1, 0); }, METH_NOARGS,
     nullptr},
    {"_repr_png_", [](PyObject* self, PyObject*) { return call_python_part("png", self); }, METH_NOARGS,
     nullptr},
    {"__reduce__", [](PyObject* self, PyObject*) { return call_python_part("reduce", self); }, METH_NOARGS,
     nullptr},
    {nullptr, nullptr, 0, nullptr}};

PyMemberDef members[] = {
    {"__weaklistoffset__", T_PYSSIZET, offsetof(image_body, weak_references), READONLY, nullptr},
    {nullptr, 0, 0, 0, nullptr}};

PyType_Slot slots[] = {
    {Py_tp_dealloc, reinterpret_cast<void*>(destroy)},
    {Py_tp_new, reinterpret_cast<void*>(refuse_new)},
    {Py_tp_repr, reinterpret_cast<void*>(+[](PyObject* self) { return call_python_part("text", self); })},
    {Py_bf_getbuffer, reinterpret_cast<void*>(get_buffer)},
    {Py_bf_releasebuffer, reinterpret_cast<void*>(release_buffer)},
    {Py_tp_getset, attributes},
    {Py_tp_methods, methods},
    {Py_tp_members, members},
    {Py_tp_doc,
     const_cast<char*>("Pixels with their size, depth and encoding. numpy.asarray(image) is its memory.")},
    {0, nullptr}};

PyType_Spec spec{"zelt.Image", sizeof(image_body), 0, Py_TPFLAGS_DEFAULT, slots};

} // namespace

void add_image_type(py::module_& module)
{
    image_type = reinterpret_cast<PyTypeObject*>(PyType_FromSpec(&spec));
    if (!image_type) throw py::error_already_set();
    module.attr("Image") = py::handle(reinterpret_cast<PyObject*>(image_type));
}

bool is_image_object(PyObject* value) noexcept { return Py_TYPE(value) == image_type; }

py::object wrap_image(IPixmat2* image)
{
    const auto known = living().find(image);
    if (known != living().end()) return py::reinterpret_borrow<py::object>(known->second);
    PyObject* const self = image_type->tp_alloc(image_type, 0);
    if (!self) throw py::error_already_set();
    py::object made = py::reinterpret_steal<py::object>(self);
    living().emplace(image, self);
    body_of(self)->image = com_ptr(image).detach();
    return made;
}

com_ptr<IPixmat2> image_over_array(py::handle given, py::handle bits, py::handle encoding)
{
    py::array a = to_array(given);
    const image_layout layout = layout_of_array(a, bits, encoding);
    void* const first = const_cast<void*>(a.data());
    const bool read_only = !a.writeable();
    return make_array_image(first, layout, read_only, std::move(a));
}

bool has_pixels(PyObject* value) noexcept
{
    if (py::isinstance<py::array>(value)) return true;
    if (PyBytes_Check(value) || PyUnicode_Check(value)) return false;
    return PyObject_CheckBuffer(value) || py::hasattr(value, "__array_interface__") ||
           py::hasattr(value, "__dlpack__");
}

IPixmat2* image_for_call(PyObject* image)
{
    image_body& body = *body_of(image);
    if (body.exports > 0) {
        com_ptr<IPixmatLock> lock; // opened and released without a commit: that drops them
        body.image->OpenWrite(lock.put());
    }
    return body.image;
}

bool is_read_only(IPixmat2* image)
{
    com_ptr<IPixmatLock> lock;
    return image->OpenWrite(lock.put()) == E_ACCESSDENIED;
}

} // namespace python
