// Contrast, brightness, gamma and sigma, and the ranges on which they act.
#pragma once

#include "pixmat/convert_blocks.h"

namespace Qor::Luxar::Convert {

struct levels {
    double contrast = 1.0;
    double brightness = 0.0;
    double gamma = 1.0;
    double sigma = 1.0;

    /// Turns up to block_size levels on [0, 1] into others, in place; NaN stays NaN. The same bits on every
    /// processor.
    void apply(double* values, int count) const noexcept;

    friend bool operator==(const levels&, const levels&) = default;
};

/// The values of a pixel type that stand for the levels 0 and 1: the nominal range of integers, 0 and 255 of
/// colour channels, 0 and 1 of floats.
struct level_scale {
    double low = 0.0;
    double span = 1.0;

    static level_scale of(pixel_type type, int32_t bits) noexcept;
    double level(double value) const noexcept { return (value - low) / span; }
    double value(double level) const noexcept { return low + level * span; }
};

} // namespace Qor::Luxar::Convert
