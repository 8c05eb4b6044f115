// Frames for benchmarks of filters, of one size.
#pragma once

#include "views.h"

#include <cmath>
#include <cstdint>

namespace zelt_bench {

inline constexpr int size_of_frames = 2000;
inline constexpr auto pixels_of_frames = static_cast<std::size_t>(size_of_frames) * size_of_frames;

template <class T>
std::string frame_case(const std::string& operation)
{
    return case_name(operation, name_of_type<T>(), size_of_frames);
}

struct frame_pair {
    cv::Mat src, dst;
};

/// A source with soft shapes, edges and camera noise, over 8 or 12 bits, or floats of the range of 8 bits, and an
/// output that is used again and again. Made at first use.
template <class T>
frame_pair& frames_of()
{
    constexpr int size = size_of_frames;
    static frame_pair f;
    if (!f.src.empty()) return f;
    f = {cv::Mat(size, size, cv::DataType<T>::depth), cv::Mat(size, size, cv::DataType<T>::depth)};
    const double top = sizeof(T) == 2 ? 4095 : 255;
    uint32_t seed = 1;
    for (int y = 0; y < size; ++y)
        for (int x = 0; x < size; ++x) {
            double noise = -2;
            for (int i = 0; i < 4; ++i) {
                seed = seed * 1664525u + 1013904223u;
                noise += (seed >> 8) / 0x1p24;
            }
            const double shapes = 0.5 + 0.2 * std::sin(x * 0.013) * std::cos(y * 0.017);
            const double edges = (x / 97 + y / 61) % 3 == 0 ? 0.2 : 0;
            f.src.at<T>(y, x) = static_cast<T>((shapes + edges + 0.02 * noise) * top);
        }
    return f;
}

/// Mean and largest difference between our output and the peer's, at least `border` pixels from the edges.
struct difference {
    double mean, largest;
};
template <class T, class Work, class Peer>
difference difference_from(Work work, Peer peer, int border = 0)
{
    frame_pair& f = frames_of<T>();
    const cv::Rect inside(border, border, size_of_frames - 2 * border, size_of_frames - 2 * border);
    work();
    const cv::Mat ours = f.dst(inside).clone();
    peer();
    cv::Mat apart;
    cv::absdiff(ours, f.dst(inside), apart);
    return {cv::mean(apart)[0], cv::norm(apart, cv::NORM_INF)};
}

} // namespace zelt_bench
