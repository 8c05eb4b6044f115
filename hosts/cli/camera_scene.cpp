#include "camera_scene.h"

#include "camera_random.h"
#include "correct_pixels.h"
#include "image_file.h"

#include <algorithm>
#include <unistd.h>

namespace cli {
namespace {

// Both given to the public domain (CC0) by those who took them.
constexpr const char* photographs[] = {
    "/usr/lib/python3/dist-packages/skimage/data/camera.png",
    "/usr/lib/python3/dist-packages/skimage/data/brick.png",
};

camera_scene photograph(const char* path)
{
    camera_scene scene;
    real_rows rows(read_image(path).get());
    scene.width = rows.width();
    scene.height = rows.height();
    for (int y = 0; y < rows.height(); ++y) {
        const double* row = rows.row(y);
        for (int x = 0; x < rows.width(); ++x) scene.light.push_back(row[x] / 255);
    }
    const std::string file(path);
    scene.description = "the photograph " + file.substr(file.rfind('/') + 1) + " of python3-skimage";
    return scene;
}

/// Few bright stars, many faint ones, on a faint glow.
camera_scene star_field(uint64_t seed)
{
    constexpr int size = 512, stars = 400, reach = 8;
    constexpr double width = 1.6; // of a star, in pixels
    camera_scene scene{size, size, std::vector<double>(size * size, 0.02), "a made-up star field"};
    random_source random(seed);
    for (int star = 0; star < stars; ++star) {
        const double cx = random.between(0, size), cy = random.between(0, size);
        const double u = random.uniform();
        const double peak = 0.02 / (0.02 + u);
        for (int y = std::max(0, static_cast<int>(cy) - reach);
             y < std::min(size, static_cast<int>(cy) + reach); ++y)
            for (int x = std::max(0, static_cast<int>(cx) - reach);
                 x < std::min(size, static_cast<int>(cx) + reach); ++x) {
                const double r2 = (x - cx) * (x - cx) + (y - cy) * (y - cy);
                double& pixel = scene.light[static_cast<size_t>(y * size + x)];
                pixel = std::min(1.0, pixel + peak * std::exp(-r2 / (2 * width * width)));
            }
    }
    return scene;
}

} // namespace

camera_scene find_scene(bool stars, uint64_t seed)
{
    for (const char* path : photographs)
        if (!stars && access(path, R_OK) == 0) return photograph(path);
    return star_field(seed);
}

} // namespace cli
