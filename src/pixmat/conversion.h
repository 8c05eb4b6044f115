// The whole way of pixels from one layout to another.
#pragma once

#include "pixmat/convert_blocks.h"

#include <optional>

namespace Qor::Luxar::Convert {

struct conversion {
    load_pixels load = nullptr;
    store_pixels store = nullptr;
    nominal_range range{};
    convert_row direct = nullptr; ///< for rows whose pixels are adjacent on both sides
    bool copy = false;            ///< such rows are copied byte by byte
};

/// None when there is no mapping between the two, among them layouts without a pixel type. May throw bad_alloc.
std::optional<conversion> recode_between(const image_layout& source, const image_layout& target);
std::optional<conversion> cast_between(const image_layout& source, const image_layout& target);

/// The pixel type of a layout, if it has one.
std::optional<pixel_type> type_of(const image_layout& layout);

/// Two views of the same size and of the conversion's types.
void run(const conversion& c, const memory_2d& from, const memory_2d& to) noexcept;

} // namespace Qor::Luxar::Convert
