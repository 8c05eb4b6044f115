// What holds for every method of every facet, whatever it computes. New methods are found by themselves.
#include "support/facets.h"
#include "support/failing_new.h"
#include "zelt/com/error_info.h"

#include <set>

namespace Qor::Luxar::ZELT::Test {
namespace {

std::vector<variant> arguments_of(const method_info& m, const ordinary_arguments& ordinary)
{
    std::vector<variant> arguments;
    for (size_t i = 0; i < m.arguments.size(); ++i)
        if (m.arguments[i].way != direction::result)
            arguments.push_back(m.arguments[i].way == direction::in ? ordinary.value(m.arguments[i], i)
                                                                    : variant::attach(missing_argument()));
    return arguments;
}

/// One value of every type that a VARIANT can have, an object of no interest among them.
std::vector<variant> every_kind_of_value()
{
    com_ptr<ICoordinateInt> stranger;
    EXPECT_EQ(Common::MakeCoordinateInt(1, 2, stranger.put()), S_OK);
    std::vector<variant> values;
    for (const VARTYPE type :
         {VT_EMPTY, VT_NULL, VT_I2, VT_I4, VT_R4, VT_R8, VT_ERROR, VT_BOOL, VT_I1, VT_UI1, VT_UI2, VT_UI4,
          VT_I8, VT_UI8, VT_INT, VT_UINT, VT_UNKNOWN, VT_DISPATCH, VT_BSTR}) {
        VARIANT zero = empty_variant();
        zero.vt = type;
        values.push_back(variant::attach(zero));
    }
    for (const double number :
         {-1.0, 1e300, std::numeric_limits<double>::quiet_NaN(), -2147483648.0, 4294967295.0})
        values.emplace_back(number);
    values.emplace_back(L"no number");
    values.emplace_back(stranger.get());
    for (const VARTYPE type : {VT_UI1, VT_R8, VT_VARIANT}) {
        VARIANT array = empty_variant();
        array.vt = static_cast<VARTYPE>(VT_ARRAY | type);
        array.parray = SafeArrayCreateVector(type, 0, 2);
        values.push_back(variant::attach(array));
    }
    VARIANT nothing = empty_variant();
    nothing.vt = VT_BYREF | VT_R8;
    values.push_back(variant::attach(nothing));
    return values;
}

TEST(Sweep, EveryMethodIsDescribed)
{
    size_t methods = 0;
    for_each_facet([&](IDispatch*, const interface_info& facet, const std::string&) {
        EXPECT_STRNE(facet.help, "") << facet.name;
        for (const method_info& m : facet.methods) {
            ++methods;
            EXPECT_STRNE(m.help, "") << facet.name << "." << m.name;
            std::set<std::string> names;
            for (size_t i = 0; i < m.arguments.size(); ++i) {
                EXPECT_TRUE(names.insert(m.arguments[i].name).second) << facet.name << "." << m.name;
                if (m.arguments[i].way == direction::result) {
                    EXPECT_EQ(i + 1, m.arguments.size()) << facet.name << "." << m.name;
                }
            }
        }
    });
    EXPECT_GT(methods, 100u);
}

TEST(Sweep, AnyValueInAnyPlaceGetsACodeAndLeaksNothing)
{
    const std::vector<variant> values = every_kind_of_value();
    for_each_facet([&](IDispatch* object, const interface_info& facet, const std::string&) {
        const ordinary_arguments ordinary;
        for (const method_info& m : facet.methods) {
            // Integer division by a zero among the values is a fault by definition, not a code.
            if (std::string_view(m.name).find("Divide") != std::string_view::npos) continue;
            const std::vector<variant> good = arguments_of(m, ordinary);
            variant result;
            late_call(object, m, good)(&result); // what is kept between calls is there from now on
            const auto sweep = [&] {
                for (size_t place = 0; place < good.size(); ++place)
                    for (const variant& value : values) {
                        std::vector<variant> arguments = good;
                        arguments[place] = value;
                        late_call(object, m, arguments)(&result);
                    }
                result = {};
                SetErrorInfo(0, nullptr);
            };
            sweep();
            const int64_t before = live_allocations();
            sweep();
            EXPECT_EQ(live_allocations(), before) << facet.name << "." << m.name;

            std::vector<variant> many = good;
            while (many.size() < 30) many.emplace_back(1);
            EXPECT_EQ(late_call(object, m, many)(&result), DISP_E_BADPARAMCOUNT)
                << facet.name << "." << m.name;
        }
    });
}

TEST(Sweep, FailingMemoryIsToldAndChangesNothing)
{
    for_each_facet([&](IDispatch* object, const interface_info& facet, const std::string&) {
        for (const method_info& m : facet.methods) {
            const ordinary_arguments reference;
            variant result;
            const std::vector<variant> ordinary = arguments_of(m, reference);
            const HRESULT answer = late_call(object, m, ordinary)(&result);
            for (int n = 1;; ++n) {
                const ordinary_arguments fresh;
                const std::vector<variant> arguments = arguments_of(m, fresh);
                const std::vector<uint8_t> before = fresh.pixels();
                late_call call(object, m, arguments);
                bool reached = false;
                const HRESULT hr = [&] {
                    const failing_allocation armed(n);
                    const HRESULT code = call(&result);
                    reached = armed.happened();
                    return code;
                }();
                if (!reached) {
                    EXPECT_EQ(hr, answer) << facet.name << "." << m.name;
                    break;
                }
                EXPECT_TRUE(hr == E_OUTOFMEMORY || hr == answer)
                    << facet.name << "." << m.name << ", allocation " << n << ", code " << std::hex << hr;
                if (failed(hr)) {
                    EXPECT_EQ(fresh.pixels(), before) << facet.name << "." << m.name << ", allocation " << n;
                }
                ASSERT_LT(n, 1000) << facet.name << "." << m.name;
            }
        }
    });
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
