#include "common/zero_divisor.h"

#include "common/layout_of.h"

#include <string>

using namespace Qor;
using namespace Qor::Luxar;

namespace host {
namespace {

bool is_reverse(const method_info& m) { return std::string_view(m.name).starts_with("Reverse"); }

bool is_integer(const image_layout& l)
{
    return (l.encoding == PixmatEncoding_Unsigned || l.encoding == PixmatEncoding_Signed) && l.bits >= 1 &&
           l.bits <= 32;
}

com_ptr<IPixmat2> image_in(const VARIANT& v)
{
    return v.vt == VT_DISPATCH || v.vt == VT_UNKNOWN ? query<IPixmat2>(v.punkVal) : nullptr;
}

/// A number as the arithmetic reads it: whole or real.
bool is_whole(const VARIANT& v)
{
    switch (v.vt) {
    case VT_I1:
    case VT_UI1:
    case VT_I2:
    case VT_UI2:
    case VT_I4:
    case VT_UI4: return true;
    default: return false;
    }
}

bool is_zero(const VARIANT& v)
{
    switch (v.vt) {
    case VT_I1:
    case VT_UI1: return v.bVal == 0;
    case VT_I2:
    case VT_UI2: return v.uiVal == 0;
    default: return v.ulVal == 0;
    }
}

template <class T>
int64_t find_zero_in_row(const uint8_t* row, int64_t width, int64_t stride)
{
    // The answer is nearly always no: a loop that only collects is one that the compiler can vectorise.
    const auto at = [&](int64_t x) {
        T value;
        __builtin_memcpy(&value, row + x * stride, sizeof value);
        return value;
    };
    bool found = false;
    if (stride == sizeof(T))
        for (int64_t x = 0; x < width; ++x) {
            T value;
            __builtin_memcpy(&value, row + x * static_cast<int64_t>(sizeof(T)), sizeof value);
            found |= value == 0;
        }
    else
        for (int64_t x = 0; x < width; ++x) found |= at(x) == 0;
    if (!found) return -1;
    int64_t x = 0;
    while (at(x) != 0) ++x;
    return x;
}

std::string refusal(const method_info& method, const argument_info& which)
{
    return std::string(method.name) + ": integer division by zero: " + which.name + " is 0";
}

/// Refuses an image with a zero; `which` names the argument.
void look_at_pixels(const method_info& method, const argument_info& which, IPixmat2* image,
                    const image_layout& l)
{
    com_ptr<IPixmatLock> lock;
    zelt::check(image->OpenRead(nullptr, 1.0, lock.put()));
    const uint8_t* const first = lock->Data(0) + l.offset;
    for (int32_t y = 0; y < l.height; ++y) {
        const uint8_t* const row = first + int64_t{y} * l.y_stride;
        const int64_t x = l.bits <= 8    ? find_zero_in_row<uint8_t>(row, l.width, l.x_stride)
                          : l.bits <= 16 ? find_zero_in_row<uint16_t>(row, l.width, l.x_stride)
                                         : find_zero_in_row<uint32_t>(row, l.width, l.x_stride);
        if (x < 0) continue;
        throw zelt::error(
            E_INVALIDARG,
            refusal(method, which).append(" at (" + std::to_string(x) + ", " + std::to_string(y) + ")"));
    }
}

} // namespace

bool divides(const interface_info& table, const method_info& method)
{
    if (table.id != ZELT::IBasicOps::iid && table.id != ZELT::IBasicOps2::iid) return false;
    return std::string_view(method.name).find("Divide") != std::string_view::npos &&
           method.arguments.size() >= 2;
}

void refuse_zero_divisor(const method_info& method, std::span<const VARIANT* const> arguments)
{
    const com_ptr<IPixmat2> a = image_in(*arguments[0]);
    if (!a) return;
    const image_layout a_layout = layout_of(a.get());
    if (!is_integer(a_layout)) return;
    const VARIANT& second = *arguments[1];
    const com_ptr<IPixmat2> b = image_in(second);
    if (!b && !is_whole(second)) return;
    if (b) {
        const image_layout b_layout = layout_of(b.get());
        const bool same_size = a_layout.width == b_layout.width && a_layout.height == b_layout.height;
        if (!same_size || !is_integer(b_layout)) return;
        if (!is_reverse(method)) return look_at_pixels(method, method.arguments[1], b.get(), b_layout);
    } else if (!is_reverse(method)) {
        if (is_zero(second) && a_layout.width > 0 && a_layout.height > 0)
            throw zelt::error(E_INVALIDARG, refusal(method, method.arguments[1]));
        return;
    }
    look_at_pixels(method, method.arguments[0], a.get(), a_layout);
}

} // namespace host
