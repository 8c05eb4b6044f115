// What benchmarks of kernels share: views of OpenCV's memory, and the names of cases.
#pragma once

#include "pixel/memory_2d.h"

#include <opencv2/core.hpp>

#include <cstdint>
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
std::string name_of_type()
{
    const char kind = std::is_floating_point_v<T> ? 'f' : std::is_signed_v<T> ? 'i' : 'u';
    return std::string(1, kind).append(std::to_string(8 * sizeof(T)));
}

inline std::string case_name(const std::string& operation, const std::string& type, int size)
{
    return operation + "/" + type + "/" + std::to_string(size);
}

} // namespace zelt_bench
