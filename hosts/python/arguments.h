// Python values as the arguments of a late-bound call.
#pragma once

#include "python.h"

#include <array>
#include <vector>

namespace python {

/// One argument that a caller gives.
struct parameter {
    explicit parameter(const argument_info& argument);

    const argument_info* info;
    PyObject* name; ///< interned, lives for ever
    enum class kind : uint8_t {
        image,
        rectangle,
        point,
        float_point,
        vector,
        size,
        range,
        complex,
        descriptor,
        object,
        enumeration,
        real,
        whole,
        boolean,
        text,
        value,
        array
    } kind;
    bool may_be_image; ///< a VARIANT operand for which a two-dimensional array is an image
    VARTYPE element;   ///< what the elements of an array must be; VT_EMPTY: what they are
};

inline constexpr size_t most_arguments = 24;

/// The values of one call, last one first as Invoke wants them.
class call_values {
public:
    explicit call_values(const method_info& method) noexcept : method_(method) {}
    ~call_values();
    call_values(const call_values&) = delete;
    call_values& operator=(const call_values&) = delete;

    /// Appends in the order of the method. Throws what Python shall see.
    void give(const parameter& p, PyObject* value);
    void leave_out(const parameter& p);
    /// A place that an out argument is written to.
    void receive(VARIANT* place);

    size_t count() const noexcept { return most_arguments - first_; }
    VARIANT* values() noexcept { return values_.data() + first_; }
    /// By its place in the order of the method.
    const VARIANT& at(size_t place) const noexcept { return values_[most_arguments - 1 - place]; }

private:
    [[noreturn]] void refuse(const parameter& p, PyObject* value, const char* wanted) const;
    [[noreturn]] void out_of_range(const parameter& p) const;
    void set_image(const parameter& p, VARIANT& v, PyObject* value);
    void set_value(const parameter& p, VARIANT& v, PyObject* value);
    void set_object(const parameter& p, VARIANT& v, PyObject* value);
    void set_real(const parameter& p, VARIANT& v, PyObject* value);
    void set_whole(const parameter& p, VARIANT& v, PyObject* value);
    void set_enumeration(const parameter& p, VARIANT& v, PyObject* value);
    std::array<double, 4> reals(const parameter& p, PyObject* value, size_t count, const char* wanted) const;
    std::array<int32_t, 4> integers(const parameter& p, PyObject* value, size_t count,
                                    const char* wanted) const;

    const method_info& method_;
    size_t first_ = most_arguments;
    uint32_t borrowed_ = 0; ///< a bit for each value that is not to be cleared
    std::array<VARIANT, most_arguments> values_;
    /// Arrays that became images in this call: the same array is the same image.
    std::array<std::pair<PyObject*, IPixmat2*>, 4> wrapped_{};
    size_t wrapped_count_ = 0;
};

/// A number by a NumPy scalar's own type, else by what it is. False for no number.
bool number_to_variant(PyObject* value, VARIANT& v);

} // namespace python
