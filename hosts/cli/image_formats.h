// What each file format offers to image_file.cpp.
#pragma once

#include "image_file.h"

#include <vector>

namespace cli {

std::unique_ptr<frame_reader> open_tiff(const std::string& path);
std::unique_ptr<frame_reader> open_png(const std::string& path);
std::unique_ptr<frame_reader> open_fits(const std::string& path);

std::unique_ptr<frame_writer> create_tiff(const std::string& path, int frames);
std::unique_ptr<frame_writer> create_png(const std::string& path);
std::unique_ptr<frame_writer> create_fits(const std::string& path);

/// Whether so many bytes of pixels can come from `stored` bytes of a file. No compressor makes more of a byte; what
/// claims to be larger is damaged, or meant to fill the memory. (In real numbers: claims may be beyond any integer.)
constexpr bool can_expand(int64_t stored, double bytes) noexcept
{
    constexpr double highest_compression = 4096;
    constexpr double not_worth_a_refusal = 1 << 20;
    return bytes <= not_worth_a_refusal || bytes / highest_compression <= static_cast<double>(stored);
}

} // namespace cli
