// TIFF files with one strip of uncompressed pixels a page, in every pixel type there is. Pages go out as they come.
#include "failure.h"
#include "image_formats.h"
#include "output_file.h"
#include "tiff_directory.h"
#include "tiff_notes.h"

#include <algorithm>
#include <cstring>

using namespace Qor::Luxar;

namespace cli {
namespace {

static_assert(std::endian::native == std::endian::little, "pixels go to the file as they are in memory");

struct sample_kind {
    tiff_samples format;
    int samples;
    int bits;
};

sample_kind kind_of(const image_layout& layout)
{
    const int storage = 8 * pixel_bytes(layout);
    switch (layout.encoding) {
    case PixmatEncoding_Unsigned: return {tiff_samples::unsigned_integer, 1, storage};
    case PixmatEncoding_Signed: return {tiff_samples::signed_integer, 1, storage};
    case PixmatEncoding_Float: return {tiff_samples::real, 1, storage};
    case PixmatEncoding_Complex_Float:
    case PixmatEncoding_Complex_Float_Half_Even:
    case PixmatEncoding_Complex_Float_Half_Odd: return {tiff_samples::complex, 1, storage};
    case PixmatEncoding_RGB:
    case PixmatEncoding_BGR:
        if (storage == 24) return {tiff_samples::unsigned_integer, 3, 8};
        break;
    case PixmatEncoding_RGBA:
    case PixmatEncoding_BGRA:
        if (storage == 32) return {tiff_samples::unsigned_integer, 4, 8};
        break;
    default: break;
    }
    throw failure("a TIFF file cannot hold " + format_name(layout) + " pixels");
}

bool blue_first(const image_layout& layout)
{
    return layout.encoding == PixmatEncoding_BGR || layout.encoding == PixmatEncoding_BGRA;
}

/// Entries of one directory, in the classic form or the one for files beyond 4 GB.
class directory_bytes {
public:
    explicit directory_bytes(bool big) : big_(big) {}

    void add(tiff_tag tag, uint64_t value, uint16_t type = 4)
    {
        std::string field(number(value, 8));
        if (type == 3) field = number(value, 2) + std::string(6, '\0');
        add_entry(tag, type, 1, field.substr(0, field_size()));
    }
    /// Several 16-bit numbers or a text, which may have to stand outside the entry.
    void add(tiff_tag tag, uint16_t type, size_t count, std::string bytes)
    {
        if (bytes.size() <= field_size()) {
            bytes.resize(field_size());
            add_entry(tag, type, count, bytes);
            return;
        }
        patches_.push_back({entries_.size() + 4 + field_size(), outside_.size()});
        add_entry(tag, type, count, std::string(field_size(), '\0'));
        outside_ += bytes;
        if (outside_.size() % 2) outside_ += '\0';
    }

    /// All bytes for a directory that will lie at `offset`, and where in them its link to the next one is.
    std::string bytes_at(uint64_t offset, uint64_t* link)
    {
        const std::string head = number(count_, big_ ? 8 : 2);
        const uint64_t outside_at = offset + head.size() + entries_.size() + field_size();
        for (const auto& [place, target] : patches_)
            entries_.replace(place, field_size(), number(outside_at + target, field_size()));
        *link = head.size() + entries_.size();
        return head + entries_ + std::string(field_size(), '\0') + outside_;
    }

    static std::string number(uint64_t value, size_t bytes)
    {
        std::string text(bytes, '\0');
        for (size_t i = 0; i < bytes; ++i) text[i] = static_cast<char>(value >> 8 * i & 0xff);
        return text;
    }
    size_t field_size() const noexcept { return big_ ? 8 : 4; }

private:
    void add_entry(tiff_tag tag, uint16_t type, uint64_t count, const std::string& field)
    {
        entries_ +=
            number(static_cast<uint16_t>(tag), 2) + number(type, 2) + number(count, field_size()) + field;
        ++count_;
    }

    bool big_;
    uint64_t count_ = 0;
    std::string entries_;
    std::string outside_;
    std::vector<std::pair<size_t, size_t>> patches_;
};

class tiff_writer final : public frame_writer {
public:
    tiff_writer(const std::string& path, int frames) : path_(path), file_(path), frames_(frames) {}

    void add(IPixmat2* image) override
    {
        try {
            add_page(image);
        } catch (const failure& f) {
            const bool named = std::string_view(f.what()).starts_with(path_);
            throw failure((named ? "" : path_ + ": ") + f.what());
        }
    }

    void finish() override
    {
        if (pages_ == 0) throw failure(path_ + ": there is nothing to write");
        file_.commit();
    }

private:
    static constexpr uint64_t classic_limit = UINT32_MAX;

    void add_page(IPixmat2* image)
    {
        pixel_rows rows(image);
        const image_layout& layout = rows.layout();
        if (layout.width < 1 || layout.height < 1) throw failure("an image without pixels cannot be written");
        const sample_kind kind = kind_of(layout);
        const uint64_t page_bytes = rows.row_bytes() * static_cast<uint64_t>(layout.height);
        if (pages_ == 0) begin(page_bytes);
        if (!big_ && file_.size() + page_bytes + 4096 > classic_limit)
            throw failure("more than 4 GB need the number of frames in advance");

        const uint64_t pixels_at = file_.size();
        write_pixels(rows, kind);
        if (file_.size() % 2) file_.write("", 1);

        directory_bytes d = describe(layout, kind, pixels_at, page_bytes);
        const uint64_t directory_at = file_.size();
        uint64_t link = 0;
        const std::string bytes = d.bytes_at(directory_at, &link);
        file_.write(bytes.data(), bytes.size());
        const std::string pointer = directory_bytes::number(directory_at, d.field_size());
        file_.write_at(link_at_, pointer.data(), pointer.size());
        link_at_ = directory_at + link;
        ++pages_;
    }

    void begin(uint64_t page_bytes)
    {
        big_ = (page_bytes + 4096) * static_cast<uint64_t>(std::max(frames_, 1)) > classic_limit;
        const std::string head =
            big_ ? std::string("II+\0\x08\0\0\0\0\0\0\0\0\0\0\0", 16) : std::string("II*\0\0\0\0\0", 8);
        file_.write(head.data(), head.size());
        link_at_ = head.size() - (big_ ? 8 : 4);
    }

    void write_pixels(pixel_rows& rows, const sample_kind& kind)
    {
        constexpr size_t chunk = 1 << 20;
        std::vector<uint8_t> waiting;
        waiting.reserve(chunk + rows.row_bytes());
        for (int y = 0; y < rows.layout().height; ++y) {
            const uint8_t* row = rows.row(y);
            waiting.insert(waiting.end(), row, row + rows.row_bytes());
            if (blue_first(rows.layout()))
                swap_red_and_blue(waiting.data() + waiting.size() - rows.row_bytes(), rows.row_bytes(),
                                  static_cast<size_t>(kind.samples));
            if (waiting.size() < chunk && y + 1 < rows.layout().height) continue;
            file_.write(waiting.data(), waiting.size());
            waiting.clear();
        }
    }

    directory_bytes describe(const image_layout& layout, const sample_kind& kind, uint64_t pixels_at,
                             uint64_t page_bytes) const
    {
        const auto repeated = [&](uint64_t value) {
            std::string text;
            for (int i = 0; i < kind.samples; ++i) text += directory_bytes::number(value, 2);
            return text;
        };
        const auto samples = static_cast<size_t>(kind.samples);
        const uint16_t wide = big_ ? 16 : 4;
        directory_bytes d(big_); // tags rise
        d.add(tiff_tag::width, static_cast<uint64_t>(layout.width));
        d.add(tiff_tag::height, static_cast<uint64_t>(layout.height));
        d.add(tiff_tag::bits, 3, samples, repeated(static_cast<uint64_t>(kind.bits)));
        d.add(tiff_tag::compression, 1, 3);
        d.add(tiff_tag::photometric, kind.samples == 1 ? 1 : 2, 3);
        if (std::string text = tiff_notes::text(layout); !text.empty()) {
            text += '\0';
            d.add(tiff_tag::description, 2, text.size(), text);
        }
        d.add(tiff_tag::strip_offsets, pixels_at, wide);
        d.add(tiff_tag::samples, samples, 3);
        d.add(tiff_tag::rows_per_strip, static_cast<uint64_t>(layout.height));
        d.add(tiff_tag::strip_sizes, page_bytes, wide);
        d.add(tiff_tag::planar, 1, 3);
        if (kind.samples == 4) d.add(tiff_tag::extra_samples, 2, 3); // the fourth is a plain alpha
        d.add(tiff_tag::sample_format, 3, samples, repeated(static_cast<uint64_t>(kind.format)));
        return d;
    }

    std::string path_;
    output_file file_;
    int frames_;
    int pages_ = 0;
    bool big_ = false;
    uint64_t link_at_ = 0;
};

} // namespace

std::unique_ptr<frame_writer> create_tiff(const std::string& path, int frames)
{
    return std::make_unique<tiff_writer>(path, frames);
}

} // namespace cli
