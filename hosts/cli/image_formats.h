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

/// One page of a TIFF file that is not simply rows of pixels: compressed, tiled, with a palette.
com_ptr<IPixmat2> decode_tiff_page(const std::string& path, int page);

/// No compressor makes more of a byte than this. What claims to be larger is damaged, or meant to fill the memory.
inline constexpr int64_t highest_compression = 4096;
inline constexpr int64_t least_claim = 1 << 20; ///< not worth a refusal

/// Whether `bytes` of pixels can come from `stored` bytes of a file.
constexpr bool can_expand(int64_t stored, int64_t bytes) noexcept
{
    return bytes <= least_claim || bytes / highest_compression <= stored;
}

} // namespace cli
