// What TIFF has no tag for, kept in the description of a page: nominal depth and half-complex encodings.
#pragma once

#include "image_pixels.h"

#include <cstdio>
#include <utility>

namespace cli {

struct tiff_notes {
    Qor::Luxar::PixmatEncoding encoding;
    int bits;

    /// Of a page whose samples say `encoding` and `bits`; a note that does not fit them is not believed.
    static tiff_notes from(const std::string& description, Qor::Luxar::PixmatEncoding encoding, int bits)
    {
        using namespace Qor::Luxar;
        tiff_notes notes{encoding, bits};
        char name[32] = "";
        int noted = 0;
        if (std::sscanf(description.c_str(), "zelt: %31s %d", name, &noted) != 2) return notes;
        PixmatEncoding known = encoding;
        if (!find_encoding(name, &known)) return notes;
        const bool half = encoding == PixmatEncoding_Complex_Float && noted == bits &&
                          (known == PixmatEncoding_Complex_Float_Half_Even ||
                           known == PixmatEncoding_Complex_Float_Half_Odd);
        const bool integer = encoding == PixmatEncoding_Unsigned || encoding == PixmatEncoding_Signed;
        if (half) notes.encoding = known;
        if (integer && known == encoding && bits == 16 && noted >= 9 && noted <= 16) notes.bits = noted;
        return notes;
    }

    /// Empty when the samples tell everything.
    static std::string text(const image_layout& layout)
    {
        using namespace Qor::Luxar;
        const bool half = layout.encoding == PixmatEncoding_Complex_Float_Half_Even ||
                          layout.encoding == PixmatEncoding_Complex_Float_Half_Odd;
        return half || layout.bits % 8 != 0 ? "zelt: " + format_name(layout) : std::string();
    }
};

/// RGB to BGR and back, alpha stays.
inline void swap_red_and_blue(uint8_t* data, size_t size, size_t channels)
{
    for (size_t i = 0; i + channels <= size; i += channels) std::swap(data[i], data[i + 2]);
}

} // namespace cli
