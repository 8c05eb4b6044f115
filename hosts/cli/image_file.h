// Image files by name: TIFF, PNG and FITS, one image or a stack of them.
#pragma once

#include "image_pixels.h"

#include <memory>
#include <string>

namespace cli {

/// The frames of one file. A frame is decoded when it is asked for, so a stack may be larger than the memory.
class frame_reader {
public:
    virtual ~frame_reader() = default;
    virtual int count() const = 0;
    /// A new image each time; `index` counts from 0. Throws failure.
    virtual com_ptr<IPixmat2> read(int index) = 0;
};

/// A name as typed: "stack.tif:3" is the third page of stack.tif, unless a file is called so.
struct image_name {
    std::string path;
    int page = 0; ///< counts from 1; 0 means all
};
image_name parse_image_name(const std::string& text);

/// How files are to be understood.
struct read_options {
    int bits = 0; ///< nominal depth of images with 16 bits in the file, 9..16; 0: as the file says
    int page = 0; ///< of files with several pages and no page of their own in the name; 0: all
};

/// Opens a file by its content. Every failure names the file, with the frame where there are several. A pixel
/// beyond a nominal depth is a failure.
std::unique_ptr<frame_reader> open_image(const std::string& name, const read_options& options = {});

/// open_image for one image: a stack without a page is refused.
com_ptr<IPixmat2> read_image(const std::string& name, const read_options& options = {});

/// One file being written. It gets its name in finish(); without it no trace stays.
class frame_writer {
public:
    virtual ~frame_writer() = default;
    /// Any strides. Refuses what the format cannot hold and frames that differ where it wants them alike.
    virtual void add(IPixmat2* image) = 0;
    virtual void finish() = 0;
};

/// The format follows the extension (.tif .tiff .png .fits .fit .fts; none is TIFF); usage_error for another one.
/// `frames` is how many will come, as far as that is known.
std::unique_ptr<frame_writer> create_image(const std::string& path, int frames = 1);

void write_image(const std::string& path, IPixmat2* image);

/// Pages beyond this are refused.
inline constexpr int most_frames = 1 << 20;

} // namespace cli
