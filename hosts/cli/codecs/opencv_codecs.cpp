// The codecs that OpenCV has.
#include "codecs.h"
#include "failure.h"
#include "tiff_notes.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iostream>
#include <opencv2/core.hpp>
#include <opencv2/core/utils/logger.hpp>
#include <opencv2/imgcodecs.hpp>
#include <sstream>
#include <utility>

using namespace Qor::Luxar;

namespace cli {
namespace {

/// The codecs print what they think of a file instead of telling the caller. Here it is kept: nothing of it reaches the
/// terminal, and it is the only way to learn that a TIFF decoder gave up half way. (The file descriptors stay, so what
/// is fatal is still told.)
class kept_output {
public:
    kept_output()
        : stream_(open_memstream(&text_, &size_)), out_(std::cout.rdbuf(&streams_)),
          err_(std::cerr.rdbuf(&streams_))
    {
        // Only at this level the messages of the TIFF library come through.
        cv::utils::logging::setLogLevel(cv::utils::logging::LOG_LEVEL_DEBUG);
        cv::redirectError([](int, const char*, const char*, const char*, int, void*) { return 0; });
        if (stream_) std::swap(stderr, stream_);
    }
    ~kept_output()
    {
        end();
        std::free(text_);
    }
    kept_output(const kept_output&) = delete;
    kept_output& operator=(const kept_output&) = delete;

    /// The first complaint about pixels; what is only unusual in a directory, such as an unknown tag, is none.
    std::string tiff_complaint()
    {
        end();
        std::istringstream lines(text_ ? std::string(text_, size_) : std::string());
        for (std::string line; std::getline(lines, line);) {
            constexpr std::string_view mark = "OpenCV TIFF: ";
            if (!line.starts_with(mark)) continue;
            line.erase(0, mark.size());
            if (!line.starts_with("TIFFReadDirectory") && !line.starts_with("TIFFFetchNormalTag"))
                return line;
        }
        return {};
    }

private:
    void end()
    {
        if (!std::exchange(keeping_, false)) return;
        if (stream_) {
            std::swap(stderr, stream_);
            std::fclose(stream_);
        }
        std::cout.rdbuf(out_);
        std::cerr.rdbuf(err_);
    }

    bool keeping_ = true;
    char* text_ = nullptr;
    size_t size_ = 0;
    FILE* stream_;
    std::stringbuf streams_;
    std::streambuf* out_;
    std::streambuf* err_;
};

/// Runs a codec; what it throws becomes a failure.
template <class Body>
void with_codec(Body&& body)
{
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

com_ptr<IPixmat2> decode_png(const std::vector<uint8_t>& file)
{
    cv::Mat m;
    const kept_output kept;
    with_codec([&] { m = cv::imdecode(file, cv::IMREAD_UNCHANGED); });
    return image_of(m);
}

com_ptr<IPixmat2> decode_tiff_page(const std::string& path, int page)
{
    std::vector<cv::Mat> pages;
    kept_output kept;
    with_codec([&] { cv::imreadmulti(path, pages, page, 1, cv::IMREAD_UNCHANGED); });
    if (const std::string complaint = kept.tiff_complaint(); !complaint.empty())
        throw failure("the file is damaged or of an unsupported kind (" + complaint + ")");
    return image_of(pages.empty() ? cv::Mat() : pages[0]);
}

int png_type(const image_layout& layout)
{
    if (layout.width < 1 || layout.height < 1) throw failure("an image without pixels cannot be written");
    const int bytes = pixel_bytes(layout);
    switch (layout.encoding) {
    case PixmatEncoding_Unsigned:
        if (bytes <= 2) return bytes == 1 ? CV_8UC1 : CV_16UC1;
        break;
    case PixmatEncoding_RGB:
    case PixmatEncoding_BGR:
        if (bytes == 3) return CV_8UC3;
        break;
    case PixmatEncoding_RGBA:
    case PixmatEncoding_BGRA:
        if (bytes == 4) return CV_8UC4;
        break;
    default: break;
    }
    throw failure("a PNG file cannot hold " + format_name(layout) + " pixels; .tif can");
}

std::vector<uint8_t> encode_png(IPixmat2* image)
{
    pixel_rows rows(image);
    const image_layout& layout = rows.layout();
    cv::Mat m(layout.height, layout.width, png_type(layout));
    const bool red_first = layout.encoding == PixmatEncoding_RGB || layout.encoding == PixmatEncoding_RGBA;
    for (int y = 0; y < layout.height; ++y) {
        std::memcpy(m.ptr(y), rows.row(y), rows.row_bytes());
        if (red_first) swap_red_and_blue(m.ptr(y), rows.row_bytes(), static_cast<size_t>(m.channels()));
    }
    std::vector<uint8_t> bytes;
    const kept_output kept;
    with_codec([&] { cv::imencode(".png", m, bytes); });
    if (bytes.empty()) throw failure("the image cannot be encoded");
    return bytes;
}

} // namespace
} // namespace cli

const cli::codec_table* zelt_codec_table()
{
    static constexpr cli::codec_table table{cli::decode_png, cli::decode_tiff_page, cli::encode_png};
    return &table;
}
