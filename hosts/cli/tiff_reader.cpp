// Uncompressed TIFF pages are read here, in every pixel type there is; the others go to the image codecs.
#include "codecs.h"
#include "failure.h"
#include "image_formats.h"
#include "tiff_directory.h"
#include "tiff_notes.h"

#include <algorithm>
#include <cstring>

using namespace Qor::Luxar;

namespace cli {
namespace {

struct stored_format {
    PixmatEncoding encoding;
    int bits;
    int word; ///< bytes of what a byte order turns round
};

bool is_colour(const tiff_page& page)
{
    return page.photometric == 2 && (page.samples == 3 || page.samples == 4) && page.bits == 8 &&
           page.equal_bits && page.format == tiff_samples::unsigned_integer;
}

/// How the samples of a page are a pixel here; bits 0 when they are none.
stored_format format_of(const tiff_page& page)
{
    if (is_colour(page))
        return {page.samples == 3 ? PixmatEncoding_BGR : PixmatEncoding_BGRA, 8 * page.samples, 1};
    const bool whole = page.bits == 8 || page.bits == 16 || page.bits == 32 || page.bits == 64;
    if (page.samples != 1 || page.photometric != 1) return {};
    switch (page.format) {
    case tiff_samples::unsigned_integer:
        return {PixmatEncoding_Unsigned, whole ? page.bits : 0, page.bits / 8};
    case tiff_samples::signed_integer: return {PixmatEncoding_Signed, whole ? page.bits : 0, page.bits / 8};
    case tiff_samples::real:
        return {PixmatEncoding_Float, page.bits == 32 || page.bits == 64 ? page.bits : 0, page.bits / 8};
    case tiff_samples::complex:
        return {PixmatEncoding_Complex_Float, page.bits == 64 || page.bits == 128 ? page.bits : 0,
                page.bits / 16};
    }
    return {};
}

std::string samples_name(const tiff_page& page)
{
    const char* kind = page.format == tiff_samples::signed_integer ? "signed "
                       : page.format == tiff_samples::real         ? "float "
                       : page.format == tiff_samples::complex      ? "complex "
                                                                   : "";
    std::string text = kind + std::to_string(page.bits) + "-bit samples";
    if (page.samples > 1) text += ", " + std::to_string(page.samples) + " a pixel";
    return text;
}

void reverse_words(uint8_t* data, size_t size, int word)
{
    const auto step = static_cast<size_t>(word);
    for (size_t i = 0; i + step <= size; i += step) std::reverse(data + i, data + i + step);
}

class tiff_reader final : public frame_reader {
public:
    explicit tiff_reader(const std::string& path) : path_(path), directory_(path) {}

    int count() const override { return directory_.count(); }

    com_ptr<IPixmat2> read(int index) override
    {
        const tiff_page page = directory_.page(index);
        const stored_format format = format_of(page);
        const bool simple = page.compression == 1 && !page.tiled && page.plain_order && page.equal_bits &&
                            (!page.planar || page.samples == 1);
        if (simple && format.bits > 0) return read_rows(page, format);
        return decode(page, index);
    }

private:
    com_ptr<IPixmat2> read_rows(const tiff_page& page, const stored_format& format)
    {
        const auto notes = tiff_notes::from(page.description, format.encoding, format.bits);
        const auto row_bytes = static_cast<uint64_t>(page.width) * static_cast<uint64_t>(format.bits / 8);
        const int64_t strips = (page.height + page.rows_per_strip - 1) / page.rows_per_strip;
        if (static_cast<int64_t>(page.offsets.size()) < strips) throw failure("some of its rows are missing");
        // Before memory is taken: the file must have the pixels.
        for (int64_t s = 0; s < strips; ++s)
            if (page.sizes[static_cast<size_t>(s)] / row_bytes < static_cast<uint64_t>(rows_of(page, s)))
                throw failure("some of its rows are missing");

        new_image image(page.width, page.height, notes.bits, notes.encoding);
        for (int64_t s = 0; s < strips; ++s) {
            uint8_t* rows = image.data + static_cast<size_t>(s * page.rows_per_strip) * image.row_bytes;
            const size_t size = static_cast<size_t>(rows_of(page, s)) * image.row_bytes;
            directory_.read_at(page.offsets[static_cast<size_t>(s)], rows, size);
            if (format.word > 1 && directory_.byte_order_differs()) reverse_words(rows, size, format.word);
            if (is_colour(page)) swap_red_and_blue(rows, size, static_cast<size_t>(page.samples));
        }
        return image.image;
    }

    com_ptr<IPixmat2> decode(const tiff_page& page, int index) const
    {
        // The codecs take integers of 32 bits for floats, and signed samples for unsigned ones.
        const bool small_integers = page.format == tiff_samples::unsigned_integer && page.bits <= 16;
        const bool floats = page.format == tiff_samples::real && (page.bits == 32 || page.bits == 64);
        if (!page.equal_bits || (!small_integers && !floats))
            throw failure("compressed, tiled or unusual TIFF with " + samples_name(page) +
                          " is not supported");
        const double pixels = static_cast<double>(page.width) * static_cast<double>(page.height);
        if (!can_expand(page.stored_bytes(), pixels / 8 * page.bits * page.samples))
            throw failure("the file is too small for " + std::to_string(page.width) + " x " +
                          std::to_string(page.height) + " pixels");
        const com_ptr<IPixmat2> image = codecs().decode_tiff_page(path_, index);
        const image_layout layout = layout_of(image.get());
        if (layout.width != page.width || layout.height != page.height)
            throw failure("the file is truncated or damaged");
        const auto notes = tiff_notes::from(page.description, layout.encoding, layout.bits);
        const int bits = small_integers && page.bits > 8 && page.bits < 16 ? page.bits : notes.bits;
        return bits == layout.bits ? image : with_bits(image.get(), bits);
    }

    static int64_t rows_of(const tiff_page& page, int64_t strip)
    {
        return std::min(page.rows_per_strip, page.height - strip * page.rows_per_strip);
    }

    std::string path_;
    tiff_directory directory_;
};

} // namespace

std::unique_ptr<frame_reader> open_tiff(const std::string& path)
{
    return std::make_unique<tiff_reader>(path);
}

} // namespace cli
