// Small pictures for a page, as text that the page holds itself.
#pragma once

#include "image_pixels.h"

#include <string>

namespace cli {

struct picture {
    int width = 0, height = 0;
    std::string uri; ///< data:image/png;base64,...
};

/// The values between which all but the outermost half percent of the finite pixels lie.
struct shades {
    double black, white;
};
shades shades_of(IPixmat2* image, const uint8_t* chosen = nullptr);

/// A grey image, made smaller by averaging whole blocks of pixels until it is at most `width` wide.
picture make_picture(IPixmat2* image, shades range, int width = 640);

std::string base64(const uint8_t* data, size_t size);

} // namespace cli
