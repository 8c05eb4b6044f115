// The image codecs: PNG, and the TIFF pages that need a decoder. They bring a hundred shared libraries along, which take
// ten times as long to load as the program itself, so they stand in a module of their own that is loaded at first use.
#pragma once

#include "image_pixels.h"

#include <vector>

namespace cli {

struct codec_table {
    com_ptr<IPixmat2> (*decode_png)(const std::vector<uint8_t>& file);
    /// Page of a TIFF file, from 0: compressed, tiled, with a palette.
    com_ptr<IPixmat2> (*decode_tiff_page)(const std::string& path, int page);
    std::vector<uint8_t> (*encode_png)(IPixmat2* image);
};

/// Loads the module. Throws failure when it, or a library that it needs, is missing.
const codec_table& codecs();

/// What the module exports.
using codec_entry = const codec_table*();
inline constexpr char codec_entry_name[] = "zelt_codec_table";
inline constexpr char codec_module_name[] = "libzelt_codecs.so";

} // namespace cli

extern "C" __attribute__((visibility("default"))) const cli::codec_table* zelt_codec_table();
