#include "image_file.h"

#include "failure.h"
#include "image_formats.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <cstdio>
#include <cstring>
#include <strings.h>
#include <sys/stat.h>

using namespace Qor::Luxar;

namespace cli {
namespace {

std::array<unsigned char, 16> first_bytes(const std::string& path)
{
    struct stat status = {};
    if (stat(path.c_str(), &status) != 0) throw failure(std::strerror(errno));
    if (!S_ISREG(status.st_mode)) throw failure("is not a regular file");
    std::array<unsigned char, 16> bytes{};
    const std::unique_ptr<FILE, int (*)(FILE*)> file(std::fopen(path.c_str(), "rb"), std::fclose);
    if (!file) throw failure(std::strerror(errno));
    if (std::fread(bytes.data(), 1, bytes.size(), file.get()) == 0)
        throw failure(std::ferror(file.get()) ? std::strerror(errno) : "is empty");
    return bytes;
}

std::unique_ptr<frame_reader> open_by_content(const std::string& path)
{
    const auto bytes = first_bytes(path);
    const auto starts = [&](const char* text, size_t size) {
        return std::memcmp(bytes.data(), text, size) == 0;
    };
    if (starts("II*\0", 4) || starts("MM\0*", 4) || starts("II+\0", 4) || starts("MM\0+", 4))
        return open_tiff(path);
    if (starts("\x89PNG\r\n\x1a\n", 8)) return open_png(path);
    if (starts("SIMPLE  =", 9)) return open_fits(path);
    throw failure("is not a TIFF, PNG or FITS file");
}

/// The largest magnitude that a nominal depth leaves room for decides; the first pixel beyond it is told.
template <class T>
void check_depth(IPixmat2* image, int bits)
{
    const bool is_signed = T(-1) < T(0);
    const int lowest = is_signed ? -(1 << (bits - 1)) : 0;
    const int highest = is_signed ? (1 << (bits - 1)) - 1 : (1 << bits) - 1;
    pixel_rows rows(image);
    for (int y = 0; y < rows.layout().height; ++y) {
        const uint8_t* row = rows.row(y);
        for (int x = 0; x < rows.layout().width; ++x) {
            T value;
            std::memcpy(&value, row + sizeof(T) * static_cast<size_t>(x), sizeof value);
            if (value >= lowest && value <= highest) continue;
            throw failure("pixel " + std::to_string(x) + "," + std::to_string(y) + " is " +
                          std::to_string(value) + ", which does not fit " + std::to_string(bits) + " bits");
        }
    }
}

/// Adds to a format's reader what holds for all: one page, nominal depth, names in messages.
class named_reader final : public frame_reader {
public:
    named_reader(const std::string& name, const read_options& options)
        : name_(parse_image_name(name)), bits_(options.bits)
    {
        naming({}, [&] {
            reader_ = open_by_content(name_.path);
            pages_ = reader_->count();
            if (pages_ > 1 && name_.page == 0) name_.page = options.page;
            if (name_.page > pages_)
                throw failure("there is no page " + std::to_string(name_.page) + ", the last is " +
                              std::to_string(pages_));
        });
    }

    int count() const override { return name_.page ? 1 : pages_; }

    com_ptr<IPixmat2> read(int index) override
    {
        if (name_.page) index = name_.page - 1;
        com_ptr<IPixmat2> image;
        naming(pages_ > 1 ? "page " + std::to_string(index + 1) + ": " : std::string(),
               [&] { image = nominal(reader_->read(index)); });
        return image;
    }

private:
    com_ptr<IPixmat2> nominal(com_ptr<IPixmat2> image) const
    {
        const image_layout layout = layout_of(image.get());
        const bool is_signed = layout.encoding == PixmatEncoding_Signed;
        if ((layout.encoding != PixmatEncoding_Unsigned && !is_signed) || pixel_bytes(layout) != 2)
            return image;
        const int bits = bits_ ? bits_ : layout.bits;
        if (bits < 16)
            is_signed ? check_depth<int16_t>(image.get(), bits) : check_depth<uint16_t>(image.get(), bits);
        return bits == layout.bits ? image : with_bits(image.get(), bits);
    }

    template <class Body>
    void naming(const std::string& where, Body&& body) const
    {
        try {
            body();
        } catch (const failure& f) {
            throw failure(name_.path + ": " + where + f.what());
        } catch (const zelt::error& e) {
            throw failure(name_.path + ": " + where + message_of(e));
        } catch (const std::bad_alloc&) {
            throw failure(name_.path + ": " + where + "there is not enough memory");
        }
    }

    image_name name_;
    int bits_;
    int pages_ = 0;
    std::unique_ptr<frame_reader> reader_;
};

} // namespace

image_name parse_image_name(const std::string& text)
{
    const size_t colon = text.rfind(':');
    struct stat status = {};
    if (colon == std::string::npos || stat(text.c_str(), &status) == 0) return {text, 0};
    const char* first = text.data() + colon + 1;
    const char* last = text.data() + text.size();
    int page = 0;
    const auto [end, error] = std::from_chars(first, last, page);
    if (first == last || error != std::errc() || end != last) return {text, 0};
    if (page < 1) throw failure(text + ": pages count from 1");
    return {text.substr(0, colon), page};
}

std::unique_ptr<frame_reader> open_image(const std::string& name, const read_options& options)
{
    return std::make_unique<named_reader>(name, options);
}

com_ptr<IPixmat2> read_image(const std::string& name, const read_options& options)
{
    const auto reader = open_image(name, options);
    if (reader->count() > 1)
        throw failure(name + ": holds " + std::to_string(reader->count()) +
                      " pages, where one image is wanted (" + name + ":1 is the first)");
    return reader->read(0);
}

std::unique_ptr<frame_writer> create_image(const std::string& path, int frames)
{
    const size_t slash = path.rfind('/');
    const std::string file = slash == std::string::npos ? path : path.substr(slash + 1);
    if (file.empty()) throw usage_error("'" + path + "' is not the name of a file");
    const size_t dot = file.rfind('.');
    const std::string extension = dot == std::string::npos ? "" : file.substr(dot + 1);
    const auto is = [&](std::initializer_list<const char*> names) {
        return std::ranges::any_of(names,
                                   [&](const char* n) { return strcasecmp(extension.c_str(), n) == 0; });
    };
    if (extension.empty() || is({"tif", "tiff"})) return create_tiff(path, frames);
    if (is({"png"})) return create_png(path);
    if (is({"fits", "fit", "fts"})) return create_fits(path);
    throw usage_error(path + ": files end in .tif, .png or .fits, not ." + extension);
}

void write_image(const std::string& path, IPixmat2* image)
{
    const auto writer = create_image(path);
    writer->add(image);
    writer->finish();
}

} // namespace cli
