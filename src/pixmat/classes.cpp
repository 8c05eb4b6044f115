// The classes of the image component, for creation by identifier or name.
#include "pixmat/converter.h"
#include "pixmat/descriptor.h"
#include "pixmat/factory.h"
#include "zelt/com/class_registry.h"

namespace Qor::Luxar {
namespace {

template <class T>
HRESULT create(IUnknown* outer, const GUID& id, void** out) noexcept
{
    if (!out) return E_POINTER;
    *out = nullptr;
    if (outer) return CLASS_E_NOAGGREGATION;
    const auto object = try_make<T>();
    return object ? object->QueryInterface(id, out) : E_OUTOFMEMORY;
}

constexpr class_entry descriptor{CLSID_PixmatDescriptor, "ZELT.PixmatDescriptor.1", "ZELT.PixmatDescriptor",
                                 "size, pixel format and memory layout of an image",
                                 &create<CPixmatDescriptor>};
constexpr class_entry factory{CLSID_PixmatFactory, "ZELT.PixmatFactory.1", "ZELT.PixmatFactory",
                              "makes images", &create<CPixmatFactory>};

constexpr class_entry converter{CLSID_PixmatConverter, "ZELT.PixmatConverter.1", "ZELT.PixmatConverter",
                                "copies and converts pixels", &create<CPixmatConverter>};

class_registration registrations[] = {class_registration(descriptor), class_registration(factory),
                                      class_registration(converter)};

} // namespace
} // namespace Qor::Luxar
