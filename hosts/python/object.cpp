#include "object.h"

#include "common/interfaces.h"
#include "image.h"
#include "method.h"

#include <unordered_map>

namespace python {
namespace {

PyTypeObject* object_type = nullptr;

/// Both live for ever: so do the tables.
auto& classes()
{
    static auto& all = *new std::unordered_map<const interface_info*, PyTypeObject*>();
    return all;
}
auto& enumerations()
{
    static auto& all = *new std::unordered_map<const enumeration_info*, PyObject*>();
    return all;
}

object_body& body_of(PyObject* self) { return *reinterpret_cast<object_body*>(self); }

void destroy(PyObject* self)
{
    PyTypeObject* const type = Py_TYPE(self);
    if (IUnknown* const held = std::exchange(body_of(self).unknown, nullptr)) com_ptr<IUnknown>::attach(held);
    type->tp_free(self);
    Py_DECREF(type);
}

PyObject* refuse_new(PyTypeObject* type, PyObject*, PyObject*)
{
    PyErr_Format(PyExc_TypeError,
                 "%s objects come from the library: zelt.create(\"ZELT.Main2\") makes the first",
                 type->tp_name);
    return nullptr;
}

PyObject* represent(PyObject* self)
{
    return guarded<PyObject*>(
        nullptr, [&] { return python_part("_describe", "object_text")(py::handle(self)).release().ptr(); });
}

PyObject* compare(PyObject* a, PyObject* b, int operation)
{
    if ((operation != Py_EQ && operation != Py_NE) || !is_object(b)) Py_RETURN_NOTIMPLEMENTED;
    const bool same = same_object(body_of(a).unknown, body_of(b).unknown);
    return PyBool_FromLong(same == (operation == Py_EQ));
}

Py_hash_t hash(PyObject* self) { return _Py_HashPointer(query<IUnknown>(body_of(self).unknown).get()); }

PyType_Slot slots[] = {{Py_tp_dealloc, reinterpret_cast<void*>(destroy)},
                       {Py_tp_new, reinterpret_cast<void*>(refuse_new)},
                       {Py_tp_repr, reinterpret_cast<void*>(represent)},
                       {Py_tp_richcompare, reinterpret_cast<void*>(compare)},
                       {Py_tp_hash, reinterpret_cast<void*>(hash)},
                       {Py_tp_doc, const_cast<char*>("An object of the library.")},
                       {0, nullptr}};

PyType_Spec spec{"zelt.Object", sizeof(object_body), 0, Py_TPFLAGS_DEFAULT | Py_TPFLAGS_BASETYPE, slots};

const method_info* put_of(const interface_info& table, const method_info& get)
{
    for (const method_info& m : table.methods)
        if (m.kind == DISPATCH_PROPERTYPUT && std::string_view(m.name) == get.name && m.arguments.size() == 1)
            return &m;
    return nullptr;
}

bool has(const interface_info& table, const char* name)
{
    for (const method_info& m : table.methods)
        if (std::string_view(m.name) == name) return true;
    return false;
}

DISPID id_of(IDispatch* sample, const method_info& m)
{
    std::wstring name = widen(m.name);
    OLECHAR* names[] = {name.data()};
    DISPID id = DISPID_UNKNOWN;
    check(sample->GetIDsOfNames(GUID_NULL, names, 1, LOCALE_USER_DEFAULT, &id));
    return id;
}

/// A class with the table's names as its attributes. What is counted is small and needed to the end.
PyTypeObject* make_class(const interface_info& table, IDispatch* sample)
{
    py::dict names;
    std::vector<py::object> methods;
    const auto make = [&](const method_info& m) {
        methods.push_back(make_method(table, m, id_of(sample, m)));
        return methods.back();
    };
    const py::handle property = reinterpret_cast<PyObject*>(&PyProperty_Type);
    for (const method_info& m : table.methods) {
        for (const argument_info& a : m.arguments)
            if (a.enumeration) enumeration_class(*a.enumeration);
        if (m.name[0] == '_' || m.kind == DISPATCH_PROPERTYPUT) continue;
        if (m.kind == DISPATCH_METHOD || m.arguments.size() != 1) {
            names[m.name] = make(m);
            continue;
        }
        const method_info* const put = put_of(table, m);
        const py::object get = make(m);
        names[m.name] = property(get, put ? make(*put) : py::object(py::none()), py::none(), m.help);
    }
    names["__slots__"] = py::tuple();
    names["__module__"] = "zelt";
    names["__doc__"] = table.help;

    py::list bases;
    bases.append(py::handle(reinterpret_cast<PyObject*>(object_type)));
    if (has(table, "Count") && has(table, "Item")) bases.append(python_part("_values", "Collection"));
    const py::handle type = reinterpret_cast<PyObject*>(&PyType_Type);
    py::object made = type(table.name, py::tuple(bases), names);
    auto* const result = reinterpret_cast<PyTypeObject*>(made.release().ptr());
    for (const py::object& m : methods) own_method(m, result);
    return result;
}

} // namespace

void add_object_type(py::module_& module)
{
    object_type = reinterpret_cast<PyTypeObject*>(PyType_FromSpec(&spec));
    if (!object_type) throw py::error_already_set();
    module.attr("Object") = py::handle(reinterpret_cast<PyObject*>(object_type));
}

bool is_object(PyObject* value) noexcept { return PyObject_TypeCheck(value, object_type); }

PyTypeObject* class_of(const interface_info& table, IDispatch* sample)
{
    const auto known = classes().find(&table);
    if (known != classes().end()) return known->second;
    PyTypeObject* const made = make_class(table, sample);
    classes().emplace(&table, made);
    return made;
}

py::object wrap_object(IUnknown* object)
{
    com_ptr<IDispatch> dispatch = query<IDispatch>(object);
    const interface_info* const table = host::table_of(dispatch.get());
    PyTypeObject* const type = table ? class_of(*table, dispatch.get()) : object_type;
    PyObject* const self = type->tp_alloc(type, 0);
    if (!self) throw py::error_already_set();
    body_of(self).dispatch = dispatch.get();
    body_of(self).unknown = dispatch ? static_cast<IUnknown*>(dispatch.detach()) : com_ptr(object).detach();
    return py::reinterpret_steal<py::object>(self);
}

py::handle enumeration_class(const enumeration_info& enumeration)
{
    PyObject*& known = enumerations()[&enumeration];
    if (!known) {
        py::list values;
        for (const enumeration_value& v : enumeration.values) values.append(py::make_tuple(v.name, v.value));
        known = python_part("_values", "make_enumeration")(enumeration.name, values).release().ptr();
    }
    return known;
}

py::dict known_names()
{
    py::dict names;
    for (const auto& [table, type] : classes())
        names[table->name] = py::handle(reinterpret_cast<PyObject*>(type));
    for (const auto& [enumeration, type] : enumerations()) names[enumeration->name] = py::handle(type);
    return names;
}

} // namespace python
