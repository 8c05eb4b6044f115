#include "zelt/com/types.h"

namespace Qor {

void guid_to_text(const GUID& id, char (&text)[39]) noexcept
{
    char* at = text;
    const auto put = [&](uint32_t value, int digits) {
        for (int shift = 4 * (digits - 1); shift >= 0; shift -= 4)
            *at++ = "0123456789ABCDEF"[(value >> shift) & 15];
    };
    *at++ = '{';
    put(id.data1, 8);
    *at++ = '-';
    put(id.data2, 4);
    *at++ = '-';
    put(id.data3, 4);
    *at++ = '-';
    for (int i = 0; i < 8; ++i) {
        if (i == 2) *at++ = '-';
        put(id.data4[i], 2);
    }
    *at++ = '}';
    *at = 0;
}

} // namespace Qor
