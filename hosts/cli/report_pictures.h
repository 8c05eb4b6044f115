// Small pictures for a page, as text that the page holds itself.
#pragma once

#include "image_pixels.h"

#include <string>

namespace cli {

struct picture {
    int width = 0, height = 0;
    double black = 0, white = 0; ///< the pixel values shown so
    std::string uri;             ///< data:image/png;base64,...
};

/// A grey image, made smaller by averaging whole blocks of pixels until it is at most `width` wide. Black and white are
/// the values between which all but the outermost half percent of the pixels lie, of those that are `chosen`.
picture make_picture(IPixmat2* image, const uint8_t* chosen = nullptr, int width = 640);

std::string base64(const uint8_t* data, size_t size);

} // namespace cli
