// PNG files, and the TIFF pages that need a decoder.
#include "failure.h"
#include "image_formats.h"
#include "output_file.h"
#include "tiff_notes.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <iostream>
#include <opencv2/core.hpp>
#include <opencv2/core/utils/logger.hpp>
#include <opencv2/imgcodecs.hpp>
#include <sys/stat.h>

using namespace Qor::Luxar;

namespace cli {
namespace {

/// The codecs write about damaged files to the standard error stream, beside what they throw. One message is enough,
/// and it comes from here. (The file descriptor stays: what is fatal is still told.)
class quiet_codecs {
public:
    quiet_codecs() : nowhere_(std::fopen("/dev/null", "w")), errors_(std::cerr.rdbuf(nullptr))
    {
        cv::utils::logging::setLogLevel(cv::utils::logging::LOG_LEVEL_SILENT);
        cv::redirectError([](int, const char*, const char*, const char*, int, void*) { return 0; });
        if (nowhere_) std::swap(stderr, nowhere_);
    }
    ~quiet_codecs()
    {
        if (nowhere_) {
            std::swap(stderr, nowhere_);
            std::fclose(nowhere_);
        }
        std::cerr.rdbuf(errors_);
    }
    quiet_codecs(const quiet_codecs&) = delete;
    quiet_codecs& operator=(const quiet_codecs&) = delete;

private:
    FILE* nowhere_;
    std::streambuf* errors_;
};

/// Runs a codec; what it throws becomes a failure.
template <class Body>
void with_codec(Body&& body)
{
    const quiet_codecs quiet;
    try {
        body();
    } catch (const cv::Exception& e) {
        if (e.code == cv::Error::StsNoMem) throw std::bad_alloc();
        throw failure("the file is damaged or of an unsupported kind (" + e.err + ")");
    }
}

com_ptr<IPixmat2> image_of(const cv::Mat& m)
{
    if (m.empty()) throw failure("the file is truncated or damaged");
    const int depth = m.depth();
    const int channels = m.channels();
    const int bits = static_cast<int>(8 * m.elemSize1());
    PixmatEncoding encoding = PixmatEncoding_Unsigned;
    if (channels == 1 && (depth == CV_8U || depth == CV_16U))
        encoding = PixmatEncoding_Unsigned;
    else if (channels == 1 && (depth == CV_32F || depth == CV_64F))
        encoding = PixmatEncoding_Float;
    else if (channels == 3 && depth == CV_8U)
        encoding = PixmatEncoding_BGR;
    else if (channels == 4 && depth == CV_8U)
        encoding = PixmatEncoding_BGRA;
    else
        throw failure("an image of " + std::to_string(channels) + " channels with " + std::to_string(bits) +
                      " bits each is not supported: colour has 8");
    new_image image(m.cols, m.rows, bits * channels, encoding);
    for (int y = 0; y < m.rows; ++y)
        std::memcpy(image.data + static_cast<size_t>(y) * image.row_bytes, m.ptr(y), image.row_bytes);
    return image.image;
}

uint32_t big_endian_32(const uint8_t* p)
{
    return uint32_t{p[0]} << 24 | uint32_t{p[1]} << 16 | uint32_t{p[2]} << 8 | p[3];
}

std::vector<uint8_t> whole_file(const std::string& path)
{
    const std::unique_ptr<FILE, int (*)(FILE*)> file(std::fopen(path.c_str(), "rb"), std::fclose);
    struct stat status = {};
    if (!file || fstat(fileno(file.get()), &status) != 0) throw failure(std::strerror(errno));
    std::vector<uint8_t> bytes(static_cast<size_t>(status.st_size));
    if (std::fread(bytes.data(), 1, bytes.size(), file.get()) != bytes.size())
        throw failure("cannot be read");
    return bytes;
}

/// The chunks are all there, and what the header promises can be in them.
void check_png(const std::vector<uint8_t>& file)
{
    constexpr size_t signature = 8;
    constexpr size_t around = 12; // length, name, check sum
    if (file.size() < signature + around + 13 || std::memcmp(file.data() + 12, "IHDR", 4) != 0)
        throw failure("the file is truncated or damaged");
    const int64_t width = big_endian_32(file.data() + 16);
    const int64_t height = big_endian_32(file.data() + 20);
    if (width < 1 || height < 1 || width > INT32_MAX || height > INT32_MAX)
        throw failure("has no usable width and height");
    if (!can_expand(static_cast<int64_t>(file.size()),
                    static_cast<double>(width) * static_cast<double>(height) * file[24] / 8))
        throw failure("the file is too small for " + std::to_string(width) + " x " + std::to_string(height) +
                      " pixels");
    for (size_t at = signature; file.size() - at >= around;) {
        const size_t length = big_endian_32(file.data() + at);
        if (length > file.size() - at - around) break;
        if (std::memcmp(file.data() + at + 4, "IEND", 4) == 0) return;
        at += around + length;
    }
    throw failure("the file is truncated or damaged");
}

class png_reader final : public frame_reader {
public:
    explicit png_reader(const std::string& path) : path_(path) {}
    int count() const override { return 1; }
    com_ptr<IPixmat2> read(int) override
    {
        const std::vector<uint8_t> file = whole_file(path_);
        check_png(file);
        cv::Mat m;
        with_codec([&] { m = cv::imdecode(file, cv::IMREAD_UNCHANGED); });
        return image_of(m);
    }

private:
    std::string path_;
};

class png_writer final : public frame_writer {
public:
    explicit png_writer(const std::string& path) : path_(path), file_(path) {}

    void add(IPixmat2* image) override
    {
        if (file_.size() > 0)
            throw failure(path_ + ": a PNG file holds one image; .tif and .fits hold stacks");
        pixel_rows rows(image);
        const image_layout& layout = rows.layout();
        cv::Mat m(layout.height, layout.width, type_of(layout));
        const bool red_first =
            layout.encoding == PixmatEncoding_RGB || layout.encoding == PixmatEncoding_RGBA;
        for (int y = 0; y < layout.height; ++y) {
            std::memcpy(m.ptr(y), rows.row(y), rows.row_bytes());
            if (red_first) swap_red_and_blue(m.ptr(y), rows.row_bytes(), static_cast<size_t>(m.channels()));
        }
        std::vector<uint8_t> bytes;
        bool encoded = false;
        with_codec([&] { encoded = cv::imencode(".png", m, bytes); });
        if (!encoded) throw failure(path_ + ": the image cannot be encoded");
        file_.write(bytes.data(), bytes.size());
    }

    void finish() override { file_.commit(); }

private:
    int type_of(const image_layout& layout) const
    {
        if (layout.width < 1 || layout.height < 1)
            throw failure(path_ + ": an image without pixels cannot be written");
        const int bytes = pixel_bytes(layout);
        switch (layout.encoding) {
        case PixmatEncoding_Unsigned:
            if (bytes <= 2) return bytes == 1 ? CV_8UC1 : CV_16UC1;
            break;
        case PixmatEncoding_RGB:
        case PixmatEncoding_BGR: return CV_8UC3;
        case PixmatEncoding_RGBA:
        case PixmatEncoding_BGRA: return CV_8UC4;
        default: break;
        }
        throw failure(path_ + ": a PNG file cannot hold " + format_name(layout) + " pixels; .tif can");
    }

    std::string path_;
    output_file file_;
};

} // namespace

com_ptr<IPixmat2> decode_tiff_page(const std::string& path, int page)
{
    std::vector<cv::Mat> pages;
    with_codec([&] { cv::imreadmulti(path, pages, page, 1, cv::IMREAD_UNCHANGED); });
    return image_of(pages.empty() ? cv::Mat() : pages[0]);
}

std::unique_ptr<frame_reader> open_png(const std::string& path) { return std::make_unique<png_reader>(path); }

std::unique_ptr<frame_writer> create_png(const std::string& path)
{
    return std::make_unique<png_writer>(path);
}

} // namespace cli
