#include "correct_outputs.h"

#include "failure.h"
#include "image_file.h"

#include <algorithm>
#include <filesystem>
#include <map>
#include <strings.h>

namespace fs = std::filesystem;

namespace cli {
namespace {

bool ends_in(const fs::path& path, std::initializer_list<const char*> extensions)
{
    const std::string own = path.extension().string();
    return std::ranges::any_of(extensions, [&](const char* e) { return strcasecmp(own.c_str(), e) == 0; });
}

bool is_image_name(const fs::path& path)
{
    return ends_in(path, {".tif", ".tiff", ".png", ".fits", ".fit", ".fts"});
}

/// Image files that cannot be written: not meant as folders.
bool is_other_image_name(const fs::path& path)
{
    return ends_in(path, {".jpg", ".jpeg", ".bmp", ".gif", ".webp", ".jp2", ".exr", ".raw"});
}

std::string stem_of(const std::string& exposure)
{
    const image_name name = parse_image_name(exposure);
    std::string stem = fs::path(name.path).stem().string();
    if (name.page) stem.append("_").append(std::to_string(name.page));
    return stem;
}

std::string file_in_folder(const std::string& exposure, bool only_tiff_or_fits)
{
    const fs::path path = parse_image_name(exposure).path;
    const bool keeps = is_image_name(path) && !(only_tiff_or_fits && ends_in(path, {".png"}));
    return stem_of(exposure) + (keeps ? path.extension().string() : ".tif");
}

std::string filled(const std::string& pattern, const std::string& exposure, size_t number)
{
    std::string name;
    for (size_t i = 0; i < pattern.size();) {
        if (pattern.compare(i, 2, "{}") == 0) {
            name += stem_of(exposure);
            i += 2;
        } else if (pattern.compare(i, 3, "{n}") == 0) {
            name += std::to_string(number);
            i += 3;
        } else {
            name += pattern[i++];
        }
    }
    return name;
}

} // namespace

void make_folder(const std::string& path)
{
    std::error_code error;
    fs::create_directories(path.empty() ? "." : path, error);
    if (error) throw failure(path + ": " + error.message());
    if (!path.empty() && !fs::is_directory(path)) throw failure(path + ": is not a folder");
}

std::vector<std::string> output_names(const std::vector<std::string>& exposures, const std::string& output,
                                      bool only_tiff_or_fits, const std::vector<std::string>& inputs)
{
    const bool pattern = output.find("{}") != std::string::npos || output.find("{n}") != std::string::npos;
    const bool file = !pattern && is_image_name(output) && !fs::is_directory(output);
    if (file && exposures.size() > 1)
        throw usage_error("'" + output + "' is one file for " + std::to_string(exposures.size()) +
                          " exposures: name a folder, or a pattern such as '{}" +
                          fs::path(output).extension().string() + "'");
    if (is_other_image_name(output)) throw usage_error(output + ": files end in .tif, .png or .fits");

    std::vector<std::string> names;
    std::map<std::string, std::string> exposure_of;
    for (const std::string& exposure : exposures) {
        std::string name =
            file ? output : (fs::path(output) / file_in_folder(exposure, only_tiff_or_fits)).string();
        if (pattern) name = filled(output, exposure, names.size() + 1);
        const auto [other, is_new] = exposure_of.emplace(name, exposure);
        if (!is_new)
            throw usage_error(other->second + " and " + exposure + " would both go to " + name +
                              ": a pattern with {n} numbers the files");
        for (const std::string& input : inputs) {
            std::error_code ignored;
            if (fs::equivalent(name, parse_image_name(input).path, ignored))
                throw usage_error(name + " is an input: the output needs another name");
        }
        names.push_back(name);
    }
    return names;
}

} // namespace cli
