// The table of arithmetic, filled once for each instruction-set level.
#include "arithmetic/kernels/blocks.inl"
#include "arithmetic/kernels/direct.inl"
#include "arithmetic/kernels/mixed.inl"
#include "arithmetic/kernels/narrow_numbers.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL {
namespace arithmetic {

using Arithmetic::arithmetic_table;
using Arithmetic::computing;
using Arithmetic::storage;

template <class... T>
struct types {
};
using real_types = types<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>;
using integer_types = types<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t>;

template <class T>
constexpr int index_of()
{
    if constexpr (is_same<T, complex_pixel<float>>) return static_cast<int>(storage::c32);
    if constexpr (is_same<T, complex_pixel<double>>) return static_cast<int>(storage::c64);
    if constexpr (is_same<T, float>) return static_cast<int>(storage::f32);
    if constexpr (is_same<T, double>) return static_cast<int>(storage::f64);
    if constexpr (is_integer<T>) return (is_signed<T> ? 3 : 0) + static_cast<int>(sizeof(T) / 2);
}
constexpr int index(computing c) { return static_cast<int>(c); }
constexpr int index(operation o) { return static_cast<int>(o); }
constexpr int index(mixed_form f) { return static_cast<int>(f); }
constexpr int index(form f) { return static_cast<int>(f); }
constexpr int wrap = static_cast<int>(rounding::wrap);
constexpr int saturate = static_cast<int>(rounding::saturate);

template <class W, class... S>
constexpr void fill_loads(arithmetic_table& t, computing c, types<S...>)
{
    ((t.load[index(c)][index_of<S>()] = load<W, S>), ...);
}

template <class W, class... T>
constexpr void fill_stores(arithmetic_table& t, computing c, types<T...>)
{
    ((t.store[index(c)][index_of<T>()][wrap] = store<W, T, rounding::wrap>), ...);
    if constexpr (is_pair<W>)
        ((t.store[index(c)][index_of<T>()][saturate] = store<W, T, rounding::wrap>), ...);
    else
        ((t.store[index(c)][index_of<T>()][saturate] = store<W, T, rounding::saturate>), ...);
}

template <class W>
constexpr void fill_operators(arithmetic_table& t, computing c)
{
    t.apply[index(operation::add)][index(c)] = apply<operation::add, W>;
    t.apply[index(operation::subtract)][index(c)] = apply<operation::subtract, W>;
    t.apply[index(operation::multiply)][index(c)] = apply<operation::multiply, W>;
    t.apply[index(operation::divide)][index(c)] = apply<operation::divide, W>;
    if constexpr (!is_pair<W>) {
        t.apply[index(operation::min)][index(c)] = apply<operation::min, W>;
        t.apply[index(operation::max)][index(c)] = apply<operation::max, W>;
    }
}

/// Min and Max never leave the type and never saturate.
template <operation Op, form Form, class... T>
constexpr void fill_direct(arithmetic_table& t, types<T...>)
{
    const auto fill = [&]<class P>(P) {
        auto& entry = t.direct[index(Op)][index(Form)][index_of<P>()];
        entry[wrap] = direct<Op, Form, rounding::wrap, P>;
        if constexpr (Op != operation::min && Op != operation::max)
            entry[saturate] = direct<Op, Form, rounding::saturate, P>;
    };
    (fill(T{}), ...);
}

/// Sums and products have the image of the output's type on the left.
template <operation Op, mixed_form Form, class... T>
constexpr void fill_mixed(arithmetic_table& t, types<T...>)
{
    const auto fill = [&]<class P>(P) {
        auto& entry = t.mixed[index(Op)][index(Form)][index_of<P>()];
        entry[wrap] = mixed<Op, Form, rounding::wrap, P>;
        entry[saturate] = mixed<Op, Form, rounding::saturate, P>;
    };
    (fill(T{}), ...);
}

template <operation Op>
constexpr void fill_mixed_forms(arithmetic_table& t)
{
    using narrow = types<uint8_t, uint16_t, int16_t>;
    constexpr bool ordered = Op == operation::subtract || Op == operation::divide;
    fill_mixed<Op, mixed_form::real_right>(t, narrow{});
    fill_mixed<Op, mixed_form::number_right>(t, types<float>{});
    if constexpr (ordered) {
        fill_mixed<Op, mixed_form::real_left>(t, narrow{});
        fill_mixed<Op, mixed_form::number_left>(t, types<float>{});
    }
    if constexpr (Op == operation::multiply || Op == operation::divide)
        fill_mixed<Op, mixed_form::number_right>(t, narrow{}); // the factors that times_number can not have
    if constexpr (Op == operation::divide) fill_mixed<Op, mixed_form::number_left>(t, narrow{});
}

template <class... T>
constexpr void fill_narrow(arithmetic_table& t, types<T...>)
{
    ((t.plus_number[index_of<T>()] = plus_number<T>), ...);
    ((t.times_number[index_of<T>()] = times_number<T>), ...);
}

template <class Part>
constexpr void fill_complex(arithmetic_table& t)
{
    using P = complex_pixel<Part>;
    const auto fill = [&](operation op, Arithmetic::direct_function function) {
        t.direct[index(op)][index(form::images)][index_of<P>()][wrap] = function;
        t.direct[index(op)][index(form::images)][index_of<P>()][saturate] = function;
    };
    fill(operation::add, direct_parts<operation::add, Part>);
    fill(operation::subtract, direct_parts<operation::subtract, Part>);
}

constexpr arithmetic_table make_table()
{
    using c32 = complex_pixel<float>;
    using c64 = complex_pixel<double>;
    arithmetic_table t{};
    fill_loads<uint32_t>(t, computing::u32, integer_types{});
    fill_loads<uint32_t>(t, computing::i32, integer_types{}); // the same bits
    fill_loads<float>(t, computing::f32, real_types{});
    fill_loads<double>(t, computing::f64, real_types{});
    fill_loads<c32>(t, computing::c32, types<float, double, c32, c64>{});
    fill_loads<c64>(t, computing::c64, types<float, double, c32, c64>{});
    t.load_byte[0] = load_byte<float>;
    t.load_byte[1] = load_byte<double>;

    fill_operators<uint32_t>(t, computing::u32);
    fill_operators<int32_t>(t, computing::i32);
    fill_operators<float>(t, computing::f32);
    fill_operators<double>(t, computing::f64);
    fill_operators<c32>(t, computing::c32);
    fill_operators<c64>(t, computing::c64);

    fill_stores<uint32_t>(t, computing::u32, real_types{});
    fill_stores<int32_t>(t, computing::i32, types<int8_t, int16_t, int32_t>{});
    fill_stores<float>(t, computing::f32, real_types{});
    fill_stores<double>(t, computing::f64, real_types{});
    fill_stores<c32>(t, computing::c32, types<c32>{});
    fill_stores<c64>(t, computing::c64, types<c64>{});

    const auto fill_forms = [&]<operation Op>() {
        fill_direct<Op, form::images>(t, real_types{});
        if constexpr (Op == operation::divide) // narrow integers: times_number
            fill_direct<Op, form::value_right>(t, types<uint32_t, int32_t, float, double>{});
        else
            fill_direct<Op, form::value_right>(t, real_types{});
    };
    fill_forms.template operator()<operation::add>();
    fill_forms.template operator()<operation::subtract>();
    fill_forms.template operator()<operation::multiply>();
    fill_forms.template operator()<operation::divide>();
    fill_forms.template operator()<operation::min>();
    fill_forms.template operator()<operation::max>();
    fill_direct<operation::subtract, form::value_left>(t, real_types{});
    fill_direct<operation::divide, form::value_left>(t, real_types{});
    fill_mixed_forms<operation::add>(t);
    fill_mixed_forms<operation::subtract>(t);
    fill_mixed_forms<operation::multiply>(t);
    fill_mixed_forms<operation::divide>(t);
    fill_narrow(t, types<uint8_t, uint16_t, int8_t, int16_t>{});
    fill_complex<float>(t);
    fill_complex<double>(t);
    return t;
}

} // namespace arithmetic

extern const Arithmetic::arithmetic_table arithmetic_loops;
constinit const Arithmetic::arithmetic_table arithmetic_loops = arithmetic::make_table();

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL
