// Frames for benchmarks of filters: OpenCV owns their memory, the library's kernels see views of it.
#pragma once

#include "pixel/memory_2d.h"

#include <opencv2/core.hpp>

#include <cmath>
#include <cstdint>
#include <map>
#include <string>
#include <type_traits>

namespace zelt_bench {

template <class T>
constexpr Qor::Luxar::ZELT::pixel_type type_of()
{
    using Qor::Luxar::ZELT::pixel_type;
    if constexpr (std::is_same_v<T, float>)
        return pixel_type::float_32;
    else if constexpr (std::is_same_v<T, double>)
        return pixel_type::float_64;
    else
        return static_cast<pixel_type>((std::is_signed_v<T> ? 4 : 0) + static_cast<int>(sizeof(T) / 2));
}

template <class T>
Qor::Luxar::ZELT::memory_2d view_of(const cv::Mat& m)
{
    return {type_of<T>(), m.cols, m.rows, 0, sizeof(T), static_cast<int64_t>(m.step), m.data};
}

template <class T>
const char* name_of_type()
{
    return std::is_same_v<T, float> ? "f32" : sizeof(T) == 1 ? "u8" : "u16";
}

struct frame_pair {
    cv::Mat src, dst;
};

/// A source with soft shapes, edges and camera noise, over 8 or 12 bits, or floats of the range of 8 bits, and an
/// output that is used again and again. Made at first use.
template <class T>
frame_pair& frames_of(int size)
{
    static std::map<int, frame_pair> sets;
    frame_pair& f = sets[size];
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

/// Mean and largest difference between our output and the peer's, away from the border.
struct difference {
    double mean, largest;
};
template <class Work, class Peer>
difference difference_from(frame_pair& f, int border, Work work, Peer peer)
{
    work();
    const cv::Mat ours = f.dst.clone();
    peer();
    const cv::Rect inside(border, border, f.src.cols - 2 * border, f.src.rows - 2 * border);
    cv::Mat apart;
    cv::absdiff(ours(inside), f.dst(inside), apart);
    return {cv::mean(apart)[0], cv::norm(apart, cv::NORM_INF)};
}

} // namespace zelt_bench
