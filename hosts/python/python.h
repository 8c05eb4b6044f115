// What every part of the extension module shares: pybind11, the library, failures.
#pragma once

#include <pybind11/pybind11.h>

#include <pybind11/complex.h>
#include <pybind11/numpy.h>
#include <pybind11/stl.h>

#include "zelt/zelt.h"

#include <string>

namespace python {

namespace py = pybind11;
using namespace Qor;
using namespace Qor::Luxar;

/// Sets zelt.Error as the pending exception.
void set_error(HRESULT code, std::wstring_view description, std::wstring_view source);
/// The same from what the library threw, with a text for a code that came without one.
void set_error(const zelt::error& e);
/// For a failing code of a call that leaves no texts.
void check(HRESULT code);

/// A pending exception of a built-in type, thrown: throw raised(PyExc_TypeError, "...").
py::error_already_set raised(PyObject* type, const std::string& text);

/// Runs the body of a function that Python calls directly; what it throws becomes the pending exception.
template <class Result, class Body>
Result guarded(Result failure, Body&& body) noexcept
{
    try {
        return body();
    } catch (py::error_already_set& e) {
        e.restore();
    } catch (const zelt::error& e) {
        set_error(e);
    } catch (const py::builtin_exception& e) {
        e.set_error();
    } catch (const std::bad_alloc&) {
        PyErr_NoMemory();
    } catch (const std::exception& e) {
        PyErr_SetString(PyExc_RuntimeError, e.what());
    }
    return failure;
}

inline py::str text_of(std::wstring_view text)
{
    return py::reinterpret_steal<py::str>(
        PyUnicode_FromWideChar(text.data(), static_cast<Py_ssize_t>(text.size())));
}

/// str(value) in Python.
inline std::string printed(py::handle value) { return py::str(value).cast<std::string>(); }

/// "int", "numpy.ndarray", ...
std::string type_of(PyObject* value);

/// A function or class of the package's Python part: python_part("_values", "Rectangle"). Looked up once.
py::handle python_part(const char* module, const char* name);

/// The interpreter lock, held by nobody for the length of a scope.
class without_lock {
public:
    without_lock() noexcept : state_(PyEval_SaveThread()) {}
    ~without_lock() { PyEval_RestoreThread(state_); }
    without_lock(const without_lock&) = delete;
    without_lock& operator=(const without_lock&) = delete;

private:
    PyThreadState* state_;
};

} // namespace python
