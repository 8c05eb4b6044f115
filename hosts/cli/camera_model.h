// A simulated camera with the faults that dark and flat frames are for.
#pragma once

#include "camera_random.h"
#include "image_pixels.h"

#include <vector>

namespace cli {

struct camera_design {
    int width = 0, height = 0;
    int bits = 14;
    double electrons_per_count = 2;
    double offset = 240;      ///< counts
    double read_noise = 6;    ///< electrons
    double dark_current = 40; ///< electrons in an exposure
    double corner_light = 0.45;
    double pixel_spread = 0.02;   ///< of the gains of pixels
    double column_spread = 0.008; ///< of those of column amplifiers
    int dust_spots = 16;
    double hot_share = 1e-3;
    double dead_share = 8e-5;
};

class simulated_camera {
public:
    simulated_camera(const camera_design& design, uint64_t seed);

    const camera_design& design() const noexcept { return design_; }
    size_t pixels() const noexcept { return response_.size(); }

    /// One exposure of so many electrons for a perfect pixel, each with fresh noise.
    com_ptr<IPixmat2> expose(const std::vector<double>& light);
    com_ptr<IPixmat2> expose_evenly(double light);

    double mean_response() const noexcept;
    double mean_dark() const noexcept; ///< counts, with the offset
    /// Not dead, and not near its end under so much light.
    bool works(size_t pixel, double light) const noexcept;
    /// Variance of one exposure, in counts.
    double variance(size_t pixel, double light) const noexcept;
    double response(size_t pixel) const noexcept { return response_[pixel]; }

private:
    void shade_corners();
    void spread_gains();
    void drop_dust();
    void break_pixels();

    camera_design design_;
    random_source random_;
    std::vector<double> response_; ///< part of the light that becomes electrons
    std::vector<double> dark_;     ///< electrons
};

} // namespace cli
