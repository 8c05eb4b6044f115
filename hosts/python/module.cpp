// The extension module. Its Python part is the package around it.
#include "common/value_objects.h"
#include "files.h"
#include "image.h"
#include "method.h"
#include "object.h"
#include "variant_object.h"

namespace python {
namespace {

py::object create(const std::string& name) { return wrap_object(zelt::create<IDispatch>(name).get()); }

py::object image(const py::object& array, const py::object& bits, const py::object& encoding)
{
    const bool as_it_is = bits.is_none() && encoding.is_none();
    if (is_image_object(array.ptr()) && as_it_is) return array;
    return wrap_image(image_over_array(array, bits, encoding).get());
}

py::object descriptor(int32_t width, int32_t height, int32_t bits, const py::object& encoding)
{
    return wrap_object(
        host::make_descriptor(packed_layout(width, height, bits, to_encoding(encoding))).get());
}

py::object lookup_table(const std::vector<double>& colours, const std::pair<double, double>& range)
{
    std::vector<double> numbers{range.first, range.second};
    numbers.insert(numbers.end(), colours.begin(), colours.end());
    return wrap_object(host::make_lookup_table(numbers).get());
}

} // namespace
} // namespace python

PYBIND11_MODULE(_zelt, module)
{
    using namespace python;
    py::register_exception_translator([](std::exception_ptr p) {
        try {
            if (p) std::rethrow_exception(p);
        } catch (const zelt::error& e) {
            set_error(e);
        }
    });
    add_object_type(module);
    add_method_type(module);
    add_image_type(module);
    add_variant_type(module);
    add_file_functions(module);
    module.def("create", &create);
    module.def("image", &image);
    module.def("descriptor", &descriptor);
    module.def("lookup_table", &lookup_table);
    module.def("known_names", &known_names);
}
