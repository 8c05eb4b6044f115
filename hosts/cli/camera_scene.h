// What the simulated camera looks at.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace cli {

struct camera_scene {
    int width = 0, height = 0;
    std::vector<double> light; ///< from 0 to 1
    std::string description;
};

/// A photograph that the Debian package python3-skimage brings along; a made-up star field where it is missing, or if
/// `stars`.
camera_scene find_scene(bool stars, uint64_t seed);

} // namespace cli
