// Charts of a page, drawn as SVG inside it. Colours come from the page's style sheet.
#pragma once

#include "image_pixels.h"

#include <string>
#include <vector>

namespace cli {

/// Class of a line in the style sheet, with its name in the legend.
struct chart_line {
    std::string style; ///< "before", "after" or "truth"
    std::string name;
    com_ptr<IPixmat2> image;
};

/// How often pixel values occur, on a logarithmic scale, over the range of all but a few pixels.
std::string histogram_chart(const std::vector<chart_line>& lines);

/// Pixel values along a row, the mean of the five rows around `middle`.
std::string profile_chart(const std::vector<chart_line>& lines, int middle);

} // namespace cli
