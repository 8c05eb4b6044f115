#include "camera_model.h"

#include <algorithm>
#include <cstring>
#include <numeric>

using namespace Qor::Luxar;

namespace cli {

simulated_camera::simulated_camera(const camera_design& design, uint64_t seed)
    : design_(design), random_(seed),
      response_(static_cast<size_t>(design.width) * static_cast<size_t>(design.height), 1.0),
      dark_(response_.size())
{
    shade_corners();
    spread_gains();
    drop_dust();
    break_pixels();
}

void simulated_camera::shade_corners()
{
    const double cx = design_.width / 2.0, cy = design_.height / 2.0;
    size_t i = 0;
    for (int y = 0; y < design_.height; ++y)
        for (int x = 0; x < design_.width; ++x) {
            const double dx = x - cx, dy = y - cy;
            const double r2 = (dx * dx + dy * dy) / (cx * cx + cy * cy);
            response_[i++] *= 1 - (1 - design_.corner_light) * r2;
        }
}

void simulated_camera::spread_gains()
{
    std::vector<double> columns(static_cast<size_t>(design_.width));
    for (double& gain : columns) gain = 1 + design_.column_spread * random_.normal();
    for (size_t i = 0; i < response_.size(); ++i) {
        response_[i] *= columns[i % columns.size()] * (1 + design_.pixel_spread * random_.normal());
        dark_[i] = design_.dark_current * std::max(0.1, 1 + 0.3 * random_.normal());
    }
}

/// Soft discs, darker towards their rim, as dust out of focus looks.
void simulated_camera::drop_dust()
{
    for (int spot = 0; spot < design_.dust_spots; ++spot) {
        const double cx = random_.between(0, design_.width), cy = random_.between(0, design_.height);
        const double radius = random_.between(4, 15), depth = random_.between(0.08, 0.35);
        const int reach = static_cast<int>(radius) + 2;
        for (int y = std::max(0, static_cast<int>(cy) - reach);
             y < std::min(design_.height, static_cast<int>(cy) + reach); ++y)
            for (int x = std::max(0, static_cast<int>(cx) - reach);
                 x < std::min(design_.width, static_cast<int>(cx) + reach); ++x) {
                const double r = std::sqrt((x - cx) * (x - cx) + (y - cy) * (y - cy));
                const double edge = std::clamp((radius - r) / 2 + 0.5, 0.0, 1.0);
                const size_t i =
                    static_cast<size_t>(y) * static_cast<size_t>(design_.width) + static_cast<size_t>(x);
                response_[i] *= 1 - depth * edge * (0.6 + 0.4 * r * r / (radius * radius));
            }
    }
}

void simulated_camera::break_pixels()
{
    const auto some = [&](double share) {
        return static_cast<size_t>(share * static_cast<double>(response_.size()) + 0.5);
    };
    const auto any = [&] { return static_cast<size_t>(random_.bits() % response_.size()); };
    for (size_t n = some(design_.hot_share); n > 0; --n) dark_[any()] = random_.between(1000, 16000);
    for (size_t n = some(design_.dead_share); n > 0; --n) response_[any()] = 0;
}

com_ptr<IPixmat2> simulated_camera::expose(const std::vector<double>& light)
{
    const new_image frame(design_.width, design_.height, design_.bits, PixmatEncoding_Unsigned);
    const double top = std::ldexp(1.0, design_.bits) - 1;
    for (size_t i = 0; i < pixels(); ++i) {
        const double electrons =
            random_.poisson(light[i] * response_[i] + dark_[i]) + design_.read_noise * random_.normal();
        const double counts = std::floor(electrons / design_.electrons_per_count + design_.offset + 0.5);
        const auto value = static_cast<uint16_t>(std::clamp(counts, 0.0, top));
        std::memcpy(frame.data + i * sizeof value, &value, sizeof value);
    }
    return frame.image;
}

com_ptr<IPixmat2> simulated_camera::expose_evenly(double light)
{
    return expose(std::vector<double>(pixels(), light));
}

double simulated_camera::mean_response() const noexcept
{
    return std::accumulate(response_.begin(), response_.end(), 0.0) / static_cast<double>(pixels());
}

double simulated_camera::mean_dark() const noexcept
{
    return std::accumulate(dark_.begin(), dark_.end(), 0.0) / static_cast<double>(pixels()) /
               design_.electrons_per_count +
           design_.offset;
}

bool simulated_camera::works(size_t pixel, double light) const noexcept
{
    const double expected =
        (light * response_[pixel] + dark_[pixel]) / design_.electrons_per_count + design_.offset;
    const double noise = std::sqrt(variance(pixel, light));
    return response_[pixel] > 0 && expected + 5 * noise < std::ldexp(1.0, design_.bits) - 1;
}

double simulated_camera::variance(size_t pixel, double light) const noexcept
{
    const double electrons =
        light * response_[pixel] + dark_[pixel] + design_.read_noise * design_.read_noise;
    constexpr double rounding = 1.0 / 12;
    return electrons / (design_.electrons_per_count * design_.electrons_per_count) + rounding;
}

} // namespace cli
