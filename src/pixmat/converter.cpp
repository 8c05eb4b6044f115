#include "pixmat/converter.h"

#include "pixmat/conversion.h"
#include "pixmat/transfer.h"

namespace Qor::Luxar {
namespace {

using namespace Convert;

struct operands {
    const image_layout& source_layout;
    const void* source;
    const image_layout& target_layout;
    void* target;
    const rectangle* source_area;
    const coordinate<int32_t>* target_point;
};

using find_conversion = std::optional<conversion> (*)(const image_layout&, const image_layout&);

HRESULT convert(find_conversion find, const operands& o) noexcept
try {
    const image_layout& from = o.source_layout;
    const image_layout& to = o.target_layout;
    const auto c = find(from, to);
    if (!c) return E_NOTIMPL;

    const rectangle area = o.source_area ? *o.source_area : rectangle{0, 0, from.width, from.height};
    const auto point = o.target_point ? *o.target_point : coordinate<int32_t>{};
    const int64_t width = int64_t{area.right} - area.left;
    const int64_t height = int64_t{area.bottom} - area.top;
    if (width <= 0 || height <= 0) return S_OK;
    if (!fits(area, {from.width, from.height})) return E_INVALIDARG;
    if (point.x < 0 || point.y < 0 || point.x + width > to.width || point.y + height > to.height)
        return E_INVALIDARG;
    if (!o.source || !o.target) return E_POINTER;

    const rectangle place{point.x, point.y, static_cast<int32_t>(point.x + width),
                          static_cast<int32_t>(point.y + height)};
    run(*c, view_of(from, const_cast<void*>(o.source)).make_view(&area), // read only
        view_of(to, o.target).make_view(&place));
    return S_OK;
} catch (...) {
    return E_OUTOFMEMORY; // nothing else can fail here
}

} // namespace

HRESULT CPixmatConverter::ConvertRecode(const image_layout& source_layout, const void* source,
                                        const image_layout& target_layout, void* target,
                                        const rectangle* source_area,
                                        const coordinate<int32_t>* target_point) noexcept
{
    return convert(recode_between, {source_layout, source, target_layout, target, source_area, target_point});
}

HRESULT CPixmatConverter::ConvertCast(const image_layout& source_layout, const void* source,
                                      const image_layout& target_layout, void* target,
                                      const rectangle* source_area,
                                      const coordinate<int32_t>* target_point) noexcept
{
    return convert(cast_between, {source_layout, source, target_layout, target, source_area, target_point});
}

HRESULT CPixmatConverter::ConvertCopy(const image_layout& source_layout, const image_layout& target_layout,
                                      IPixmatTransfer** out) noexcept
{
    if (!out) return E_POINTER;
    *out = try_make<CPixmatTransfer>(source_layout, target_layout).detach();
    return *out ? S_OK : E_OUTOFMEMORY;
}

} // namespace Qor::Luxar
