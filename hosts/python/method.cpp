#include "method.h"

#include "arguments.h"
#include "common/layout_of.h"
#include "common/zero_divisor.h"
#include "interrupts.h"
#include "object.h"
#include "results.h"

#include <cstddef>
#include <strings.h>
#include <structmember.h>

namespace python {
namespace {

constexpr size_t most_outputs = 8;

/// All that is known of a method before it is called.
struct method_plan {
    method_plan(const interface_info& t, const method_info& m, DISPID i)
        : table(t), info(m), id(i), divides(host::divides(t, m)), cancellable(can_be_cancelled(t)),
          locked(m.kind != DISPATCH_METHOD)
    {
        size_t outputs = 0;
        for (const argument_info& a : m.arguments) {
            if (a.way == direction::in) inputs.emplace_back(a);
            outputs += a.way == direction::out;
        }
        if (m.arguments.size() > most_arguments || outputs > most_outputs)
            throw std::length_error(std::string(m.name) + " has too many arguments");
    }

    const interface_info& table;
    const method_info& info;
    DISPID id;
    bool divides;
    bool cancellable;
    /// Properties are short, and the first reading of one makes a facet, which one thread must do.
    bool locked;
    PyTypeObject* owner = nullptr; ///< lives for ever
    std::vector<parameter> inputs;
};

/// Lives for ever, like the classes that methods belong to.
struct method_body {
    PyObject_HEAD vectorcallfunc call;
    method_plan* plan;
};

PyTypeObject* method_type = nullptr;

method_plan& plan_of(PyObject* self) { return *reinterpret_cast<method_body*>(self)->plan; }

using given_values = std::array<PyObject*, most_arguments>;

/// "pIArea" is "area" too.
bool is_short_name(const char* name, const char* given)
{
    for (const char* mark : {"ppI", "pI", "p"}) {
        const size_t length = std::strlen(mark);
        if (std::strncmp(name, mark, length) != 0) continue;
        if (name[length] >= 'A' && name[length] <= 'Z') return strcasecmp(name + length, given) == 0;
    }
    return false;
}

std::string full_name(const method_plan& m) { return std::string(m.table.name) + "." + m.info.name; }

size_t place_of(const method_plan& m, PyObject* name)
{
    for (size_t i = 0; i < m.inputs.size(); ++i)
        if (m.inputs[i].name == name) return i;
    const char* const given = PyUnicode_AsUTF8(name);
    if (!given) throw py::error_already_set();
    for (size_t i = 0; i < m.inputs.size(); ++i)
        if (strcasecmp(m.inputs[i].info->name, given) == 0) return i;
    for (size_t i = 0; i < m.inputs.size(); ++i)
        if (is_short_name(m.inputs[i].info->name, given)) return i;
    throw raised(PyExc_TypeError, full_name(m) + "() has no argument '" + given + "'");
}

void match(const method_plan& m, PyObject* const* values, size_t count, PyObject* names, given_values& given)
{
    if (count > m.inputs.size())
        throw raised(PyExc_TypeError, full_name(m) + "() takes " + std::to_string(m.inputs.size()) +
                                          (m.inputs.size() == 1 ? " argument but " : " arguments but ") +
                                          std::to_string(count) + " were given");
    for (size_t i = 0; i < count; ++i) given[i] = values[i];
    const Py_ssize_t named = names ? PyTuple_GET_SIZE(names) : 0;
    for (Py_ssize_t n = 0; n < named; ++n) {
        const size_t i = place_of(m, PyTuple_GET_ITEM(names, n));
        if (given[i])
            throw raised(PyExc_TypeError,
                         full_name(m) + "() got two values for '" + m.inputs[i].info->name + "'");
        given[i] = values[count + static_cast<size_t>(n)];
    }
}

/// Places that a call writes to.
struct outputs {
    outputs() noexcept
    {
        for (VARIANT& v : values) v = empty_variant();
    }
    ~outputs()
    {
        for (VARIANT& v : values)
            if (v.vt != VT_EMPTY) VariantClear(&v);
    }
    outputs(const outputs&) = delete;
    outputs& operator=(const outputs&) = delete;

    VARIANT values[most_outputs];
};

struct exception_record : EXCEPINFO {
    exception_record() noexcept : EXCEPINFO{} {}
    ~exception_record()
    {
        SysFreeString(bstrSource);
        SysFreeString(bstrDescription);
        SysFreeString(bstrHelpFile);
    }
    exception_record(const exception_record&) = delete;
    exception_record& operator=(const exception_record&) = delete;
};

/// What a code alone does not tell: which image cannot be written.
std::string explain_denial(const method_plan& m, const call_values& values)
{
    std::string names;
    size_t place = 0;
    for (const argument_info& a : m.info.arguments) {
        if (a.way == direction::result) continue;
        const VARIANT& v = values.at(place++);
        const bool object = v.vt == VT_DISPATCH || v.vt == VT_UNKNOWN;
        const com_ptr<IPixmat2> image = object ? query<IPixmat2>(v.punkVal) : nullptr;
        com_ptr<IPixmatLock> lock;
        if (image && image->OpenWrite(lock.put()) == E_ACCESSDENIED)
            names += (names.empty() ? "" : ", ") + std::string(a.name);
    }
    return names.empty() ? names
                         : full_name(m) + ": the result cannot be written to a read-only image (" + names +
                               "); a copy of the array could be";
}

[[noreturn]] void fail(const method_plan& m, const call_values& values, HRESULT code,
                       const exception_record& e, uint32_t bad_argument)
{
    std::wstring_view description, source;
    if (code == DISP_E_EXCEPTION) {
        code = e.scode;
        if (e.bstrDescription) description = {e.bstrDescription, SysStringLen(e.bstrDescription)};
        if (e.bstrSource) source = {e.bstrSource, SysStringLen(e.bstrSource)};
    }
    std::string text;
    if (code == E_ACCESSDENIED) text = explain_denial(m, values);
    if (text.empty() && description.empty()) {
        const char* const meaning = system_message(code);
        text = full_name(m) + ": " + (meaning ? meaning : "failed");
        const size_t place = values.count() - 1 - bad_argument;
        size_t visible = 0;
        for (const argument_info& a : m.info.arguments)
            if (a.way != direction::result && bad_argument < values.count() && visible++ == place)
                text += std::string(" (") + a.name + ")";
    }
    set_error(code, text.empty() ? description : std::wstring_view(widen(text)), source);
    throw py::error_already_set();
}

void look_for_zero(const method_plan& m, const call_values& values)
{
    std::array<const VARIANT*, most_arguments> arguments{};
    for (size_t i = 0; i < values.count(); ++i) arguments[i] = &values.at(i);
    host::refuse_zero_divisor(m.info, {arguments.data(), values.count()});
}

/// Calls on small images end before anybody could interrupt them, and are not to pay for a watch.
bool may_take_long(const method_plan& m, const call_values& values)
{
    constexpr int64_t small_image = 64 * 64;
    if (!m.cancellable || values.count() == 0 || values.at(0).vt != VT_DISPATCH) return false;
    const com_ptr<IPixmat2> image = query<IPixmat2>(values.at(0).punkVal);
    if (!image) return false;
    const image_layout l = host::layout_of(image.get());
    return int64_t{l.width} * l.height >= small_image;
}

py::object results_of(const method_plan& m, VARIANT& result, outputs& out)
{
    py::object first;
    std::vector<py::object> all;
    size_t place = 0, count = 0;
    for (const argument_info& a : m.info.arguments) {
        if (a.way == direction::in) continue;
        py::object value = to_python(a.way == direction::result ? result : out.values[place++], &a);
        if (++count == 1) {
            first = std::move(value);
            continue;
        }
        if (count == 2) all.push_back(first);
        all.push_back(std::move(value));
    }
    if (count == 0) return py::none();
    if (count == 1) return first;
    py::tuple tuple(all.size());
    for (size_t i = 0; i < all.size(); ++i) tuple[i] = std::move(all[i]);
    return tuple;
}

py::object call_plan(const method_plan& m, IDispatch* object, const given_values& given)
{
    // Before the values, which are cleared first, so that what they refer to is still there.
    outputs out;
    variant result;
    exception_record exception;
    call_values values(m.info);
    size_t input = 0, output = 0;
    for (const argument_info& a : m.info.arguments) {
        if (a.way == direction::out) values.receive(&out.values[output++]);
        if (a.way != direction::in) continue;
        const parameter& p = m.inputs[input];
        if (PyObject* const value = given[input++])
            values.give(p, value);
        else
            values.leave_out(p);
    }

    DISPID put = DISPID_PROPERTYPUT;
    const bool is_put = m.info.kind == DISPATCH_PROPERTYPUT;
    DISPPARAMS params{values.values(), is_put ? &put : nullptr, static_cast<uint32_t>(values.count()),
                      is_put ? 1u : 0u};
    auto bad_argument = static_cast<uint32_t>(-1);
    HRESULT code;
    const auto invoke = [&] {
        if (m.divides) look_for_zero(m, values);
        code = object->Invoke(m.id, GUID_NULL, LOCALE_USER_DEFAULT, m.info.kind, &params, result.get(),
                              &exception, &bad_argument);
    };
    bool interrupted = false;
    if (m.locked) {
        invoke();
    } else {
        const without_lock unlocked;
        interrupt_watch watch(may_take_long(m, values));
        invoke();
        interrupted = watch.end();
    }
    // What Python makes of it, usually KeyboardInterrupt, tells more than a cancelled call.
    if (interrupted && PyErr_CheckSignals() != 0) throw py::error_already_set();
    if (failed(code)) fail(m, values, code, exception, bad_argument);
    return results_of(m, *result.get(), out);
}

PyObject* call_method(PyObject* self, PyObject* const* arguments, size_t flags, PyObject* names)
{
    return guarded<PyObject*>(nullptr, [&] {
        const method_plan& m = plan_of(self);
        const auto count = static_cast<size_t>(PyVectorcall_NARGS(flags));
        if (count == 0 || !PyObject_TypeCheck(arguments[0], m.owner))
            throw raised(PyExc_TypeError, full_name(m) + "() must be called on an " + m.table.name);
        IDispatch* const object = reinterpret_cast<object_body*>(arguments[0])->dispatch;
        given_values given{};
        match(m, arguments + 1, count - 1, names, given);
        return call_plan(m, object, given).release().ptr();
    });
}

PyObject* bind(PyObject* self, PyObject* object, PyObject*)
{
    if (object && object != Py_None) return PyMethod_New(self, object);
    Py_INCREF(self);
    return self;
}

PyObject* represent(PyObject* self)
{
    return PyUnicode_FromFormat("<method %s of zelt.%s>", plan_of(self).info.name, plan_of(self).table.name);
}

/// The row of the table, for the Python part that writes signatures and documentation of it.
py::dict row_of(const method_plan& m)
{
    using namespace py::literals;
    py::list arguments;
    for (const argument_info& a : m.info.arguments) {
        const bool number =
            !a.interface_id && a.type != VT_VARIANT && !(a.type & VT_ARRAY) && a.type != VT_BSTR;
        arguments.append(
            py::dict("name"_a = a.name, "type"_a = a.type_name, "vartype"_a = static_cast<int>(a.type),
                     "way"_a = a.way == direction::in ? "in" : "out", "optional"_a = a.optional,
                     "default"_a = number ? py::object(py::float_(a.default_number)) : py::object(py::none()),
                     "enumeration"_a = a.enumeration ? py::object(py::reinterpret_borrow<py::object>(
                                                           enumeration_class(*a.enumeration)))
                                                     : py::object(py::none())));
    }
    return py::dict("interface"_a = m.table.name, "name"_a = m.info.name, "help"_a = m.info.help,
                    "pixels"_a = m.info.pixels, "kind"_a = static_cast<int>(m.info.kind),
                    "arguments"_a = arguments);
}

PyObject* described_by(const char* function, PyObject* self)
{
    return guarded<PyObject*>(
        nullptr, [&] { return python_part("_describe", function)(row_of(plan_of(self))).release().ptr(); });
}

PyGetSetDef attributes[] = {
    {"__name__", [](PyObject* self, void*) { return PyUnicode_FromString(plan_of(self).info.name); }, nullptr,
     nullptr, nullptr},
    {"__qualname__",
     [](PyObject* self, void*) {
         return PyUnicode_FromFormat("%s.%s", plan_of(self).table.name, plan_of(self).info.name);
     },
     nullptr, nullptr, nullptr},
    {"__module__", [](PyObject*, void*) { return PyUnicode_FromString("zelt"); }, nullptr, nullptr, nullptr},
    {"__doc__", [](PyObject* self, void*) { return described_by("documentation", self); }, nullptr, nullptr,
     nullptr},
    {"__signature__", [](PyObject* self, void*) { return described_by("signature", self); }, nullptr, nullptr,
     nullptr},
    {"_row",
     [](PyObject* self, void*) {
         return guarded<PyObject*>(nullptr, [&] { return row_of(plan_of(self)).release().ptr(); });
     },
     nullptr, nullptr, nullptr},
    {nullptr, nullptr, nullptr, nullptr, nullptr}};

PyMemberDef members[] = {{"__vectorcalloffset__", T_PYSSIZET, offsetof(method_body, call), READONLY, nullptr},
                         {nullptr, 0, 0, 0, nullptr}};

PyType_Slot slots[] = {{Py_tp_call, reinterpret_cast<void*>(PyVectorcall_Call)},
                       {Py_tp_descr_get, reinterpret_cast<void*>(bind)},
                       {Py_tp_repr, reinterpret_cast<void*>(represent)},
                       {Py_tp_getset, attributes},
                       {Py_tp_members, members},
                       {0, nullptr}};

PyType_Spec spec{"zelt.Method", sizeof(method_body), 0,
                 Py_TPFLAGS_DEFAULT | Py_TPFLAGS_METHOD_DESCRIPTOR | Py_TPFLAGS_HAVE_VECTORCALL |
                     Py_TPFLAGS_DISALLOW_INSTANTIATION,
                 slots};

} // namespace

void add_method_type(py::module_&)
{
    method_type = reinterpret_cast<PyTypeObject*>(PyType_FromSpec(&spec));
    if (!method_type) throw py::error_already_set();
}

py::object make_method(const interface_info& table, const method_info& method, DISPID id)
{
    auto plan = std::make_unique<method_plan>(table, method, id);
    auto* const self = PyObject_New(method_body, method_type);
    if (!self) throw py::error_already_set();
    self->call = call_method;
    self->plan = plan.release();
    return py::reinterpret_steal<py::object>(reinterpret_cast<PyObject*>(self));
}

void own_method(py::handle method, PyTypeObject* owner) { plan_of(method.ptr()).owner = owner; }

} // namespace python
