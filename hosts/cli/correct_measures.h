// How even a picture is, and what else is told about frames.
//
// Evenness is looked at where the flat frames are evenly lit: where flat less dark is above half of the brightest
// (the brightest thousandth of the pixels is left out of that, since it may be hot pixels). "Uneven" is the standard
// deviation of these pixels, as a part of their mean: 0 for a perfectly even picture. Vignetting, dust and pixel
// patterns raise it, and so do noise and whatever is really in the picture. "Fine" is the same after each pixel was
// divided by the mean of the lit pixels in the square of 31 x 31 around it: what is wider than that, such as
// vignetting and much of the scene, no longer counts.
#pragma once

#include "image_pixels.h"

#include <optional>
#include <vector>

namespace cli {

struct frame_numbers {
    double mean = 0, minimum = 0, maximum = 0;
    double deviation = 0; ///< standard, of all pixels
};

/// By the library's statistics.
frame_numbers measure(IPixmat2* image);

struct unevenness {
    double all = 0, fine = 0; ///< NaN where the mean is not above 0
};

/// The evenly lit pixels of a flat frame.
class lit_area {
public:
    /// `light` is flat less dark. With an area only pixels inside it count.
    explicit lit_area(IPixmat2* light, const std::optional<Qor::Luxar::rectangle>& area = {});

    size_t pixels() const noexcept { return count_; }
    double share() const noexcept;
    const uint8_t* row(int y) const noexcept
    {
        return lit_.data() + static_cast<size_t>(y) * static_cast<size_t>(width_);
    }

    /// Of the finite pixels.
    double mean(IPixmat2* image) const;
    /// Of an image from which the dark was taken.
    unevenness measure(IPixmat2* image) const;

private:
    int width_;
    size_t count_ = 0;
    std::vector<uint8_t> lit_;
};

/// Mean of the finite pixels, added row after row.
double finite_mean(IPixmat2* image);

} // namespace cli
