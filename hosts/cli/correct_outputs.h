// Where corrected exposures go.
#pragma once

#include <string>
#include <vector>

namespace cli {

/// A file for each exposure. `output` is
///   a pattern   {} stands for the exposure's name without its extension, {n} for its number from 1;
///   a file      when it ends as an image file does, for one exposure;
///   a folder    otherwise: files are called and stored as the exposures are, as TIFF if `only_tiff_or_fits` and the
///               exposure is PNG.
/// usage_error when two exposures would share a file and when a file would replace one of the `inputs`.
std::vector<std::string> output_names(const std::vector<std::string>& exposures, const std::string& output,
                                      bool only_tiff_or_fits, const std::vector<std::string>& inputs);

/// With the folders above it. failure with a reason.
void make_folder(const std::string& path);

} // namespace cli
