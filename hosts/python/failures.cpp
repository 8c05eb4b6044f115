#include "python.h"

#include <map>

namespace python {

void set_error(HRESULT code, std::wstring_view description, std::wstring_view source)
{
    guarded(0, [&] {
        const py::handle type = python_part("_errors", "Error");
        const py::object error =
            type(py::int_(static_cast<uint32_t>(code)), text_of(description), text_of(source));
        PyErr_SetObject(type.ptr(), error.ptr());
        return 0;
    });
}

void set_error(const zelt::error& e)
{
    std::wstring description = e.description;
    if (description.empty())
        if (const char* meaning = system_message(e.hresult)) description = widen(meaning);
    set_error(e.hresult, description, e.source);
}

void check(HRESULT code)
{
    if (failed(code)) throw zelt::error(code);
}

py::error_already_set raised(PyObject* type, const std::string& text)
{
    PyErr_SetString(type, text.c_str());
    return py::error_already_set();
}

std::string type_of(PyObject* value)
{
    const std::string name = Py_TYPE(value)->tp_name;
    return name;
}

py::handle python_part(const char* module, const char* name)
{
    // Never released: the interpreter may be gone when static objects are.
    static auto& known = *new std::map<std::pair<std::string, std::string>, PyObject*>();
    PyObject*& part = known[{module, name}];
    if (!part) {
        const std::string full = std::string("zelt.") + module;
        part = py::object(py::module_::import(full.c_str()).attr(name)).release().ptr();
    }
    return part;
}

} // namespace python
