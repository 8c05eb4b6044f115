// The classes that a client can create.
#include "frame/value_objects.h"
#include "host/roots.h"
#include "zelt/com/class_registry.h"

namespace Qor::Luxar::ZELT {
namespace {

template <class Root>
HRESULT create_root(IUnknown* outer, const GUID& id, void** out) noexcept
{
    auto* root = new (std::nothrow) Root(outer);
    if (!root) return E_OUTOFMEMORY;
    const auto own = com_ptr<IUnknown>::attach(root->inner());
    return own->QueryInterface(id, out);
}

HRESULT create_complex(IUnknown* outer, const GUID& id, void** out) noexcept
{
    if (outer) return CLASS_E_NOAGGREGATION;
    const com_ptr<Common::CoComplex> object = try_make<Common::CoComplex>();
    return object ? object->QueryInterface(id, out) : E_OUTOFMEMORY;
}

constexpr class_entry zelt{CLSID_ZELT, "ZELT.Main.1", "ZELT.Main", "ZELT Class", create_root<CZelt>};
constexpr class_entry zelt2{CLSID_ZELT2, "ZELT.Main2.1", "ZELT.Main2", "ZELT2 Class", create_root<CZelt2>};
constexpr class_entry zelt2_no_dispatch{CLSID_ZELT2NoDispatch, nullptr, nullptr,
                                        "ZELT2 Class, no full IDispatch support",
                                        create_root<CZelt2NoDispatch>};
constexpr class_entry complex{CLSID_Complex, "ZELT.Complex.1", "ZELT.Complex", "Complex Class",
                              create_complex};

class_registration registrations[] = {class_registration(zelt), class_registration(zelt2),
                                      class_registration(zelt2_no_dispatch), class_registration(complex)};

} // namespace
} // namespace Qor::Luxar::ZELT
