// FITS images and cubes. The first row of the file is the first row of the image.
#include "failure.h"
#include "image_formats.h"
#include "output_file.h"

#include <algorithm>
#include <cstring>
#include <fitsio.h>
#include <sys/stat.h>

using namespace Qor::Luxar;

namespace cli {
namespace {

/// How a pixel type stands in the file and how it is handed over.
struct fits_type {
    PixmatEncoding encoding;
    int bits;
    int stored; ///< with the offset that makes the format's signed integers unsigned
    int passed;
};
constexpr fits_type fits_types[] = {
    {PixmatEncoding_Unsigned, 8, BYTE_IMG, TBYTE},   {PixmatEncoding_Unsigned, 16, USHORT_IMG, TUSHORT},
    {PixmatEncoding_Unsigned, 32, ULONG_IMG, TUINT}, {PixmatEncoding_Unsigned, 64, ULONGLONG_IMG, TULONGLONG},
    {PixmatEncoding_Signed, 8, SBYTE_IMG, TSBYTE},   {PixmatEncoding_Signed, 16, SHORT_IMG, TSHORT},
    {PixmatEncoding_Signed, 32, LONG_IMG, TINT},     {PixmatEncoding_Signed, 64, LONGLONG_IMG, TLONGLONG},
    {PixmatEncoding_Float, 32, FLOAT_IMG, TFLOAT},   {PixmatEncoding_Float, 64, DOUBLE_IMG, TDOUBLE},
};

constexpr char bits_keyword[] = "ZELTBITS"; ///< nominal depth, for which the format has no word
constexpr int most_axes = 9;

void check_fits(int status)
{
    if (status == 0) return;
    char text[FLEN_STATUS] = "";
    fits_get_errstatus(status, text);
    fits_clear_errmsg();
    if (status == MEMORY_ALLOCATION) throw std::bad_alloc();
    throw failure("the file is truncated or damaged (" + std::string(text) + ")");
}

class fits_handle {
public:
    fits_handle() = default;
    fits_handle(const fits_handle&) = delete;
    fits_handle& operator=(const fits_handle&) = delete;
    ~fits_handle()
    {
        int status = 0;
        if (file_) fits_close_file(file_, &status);
        fits_clear_errmsg();
    }
    fitsfile** put() noexcept { return &file_; }
    fitsfile* get() const noexcept { return file_; }

private:
    fitsfile* file_ = nullptr;
};

class fits_reader final : public frame_reader {
public:
    explicit fits_reader(const std::string& path)
    {
        struct stat file_status = {};
        stat(path.c_str(), &file_status);
        file_size_ = file_status.st_size;
        int status = 0;
        fits_open_diskfile(file_.put(), path.c_str(), READONLY, &status);
        check_fits(status);
        find_image();
        check_size();
    }

    int count() const override { return frames_; }

    com_ptr<IPixmat2> read(int index) override
    {
        new_image image(width_, height_, nominal_bits_, type_->encoding);
        const LONGLONG pixels = LONGLONG{width_} * height_;
        const bool wide = type_->stored == ULONGLONG_IMG;
        int status = 0;
        // The reader of unsigned 64-bit numbers refuses the lower half of them: taken as they are stored, then offset.
        if (wide) fits_set_bscale(file_.get(), 1, 0, &status);
        fits_read_img(file_.get(), wide ? TLONGLONG : type_->passed, index * pixels + 1, pixels, nullptr,
                      image.data, nullptr, &status);
        check_fits(status);
        for (size_t i = 7; wide && i < image.row_bytes * static_cast<size_t>(height_); i += 8)
            image.data[i] ^= 0x80;
        return image.image;
    }

private:
    /// The first image with pixels, which in compressed files is not the first unit.
    void find_image()
    {
        int status = 0;
        int units = 0;
        fits_get_num_hdus(file_.get(), &units, &status);
        check_fits(status);
        for (int unit = 1; unit <= units; ++unit) {
            int kind = 0;
            fits_movabs_hdu(file_.get(), unit, &kind, &status);
            check_fits(status);
            if (kind == IMAGE_HDU && read_axes()) return;
        }
        throw failure("holds no image");
    }

    bool read_axes()
    {
        int status = 0;
        int type = 0;
        int axes = 0;
        LONGLONG size[most_axes] = {};
        fits_get_img_equivtype(file_.get(), &type, &status);
        fits_get_img_dim(file_.get(), &axes, &status);
        check_fits(status);
        if (axes < 1) return false;
        if (axes > most_axes) throw failure("has " + std::to_string(axes) + " axes");
        fits_get_img_sizell(file_.get(), axes, size, &status);
        check_fits(status);
        LONGLONG frames = 1;
        for (int i = 0; i < axes; ++i)
            if (size[i] == 0)
                return false;
            else if (size[i] < 0 || size[i] > INT32_MAX)
                throw failure("has no usable width and height");
        for (int i = 2; i < axes; ++i)
            if ((frames *= size[i]) > most_frames) throw failure("holds too many frames");
        double offset = 0; // of unsigned 64-bit numbers, which are taken for signed ones
        if (type == LONGLONG_IMG &&
            fits_read_key(file_.get(), TDOUBLE, "BZERO", &offset, nullptr, &status) == 0 &&
            offset == 9223372036854775808.0)
            type = ULONGLONG_IMG;
        status = 0;
        fits_clear_errmsg();
        const auto found = std::ranges::find(fits_types, type, &fits_type::stored);
        if (found == std::end(fits_types)) throw failure("has an unknown kind of pixels");
        type_ = &*found;
        width_ = static_cast<int>(size[0]);
        height_ = axes > 1 ? static_cast<int>(size[1]) : 1;
        frames_ = static_cast<int>(frames);
        nominal_bits_ = type_->bits;
        int bits = 0;
        if (type_->bits == 16 &&
            fits_read_key(file_.get(), TINT, bits_keyword, &bits, nullptr, &status) == 0 && bits >= 9 &&
            bits <= 16)
            nominal_bits_ = bits;
        fits_clear_errmsg();
        return true;
    }

    /// Before memory is taken: the file must have the pixels. (A scaled image is stored smaller than it is read.)
    void check_size() const
    {
        int status = 0;
        int stored = 0;
        fits_get_img_type(file_.get(), &stored, &status);
        check_fits(status);
        const bool compressed = fits_is_compressed_image(file_.get(), &status) != 0;
        const int64_t frame = int64_t{width_} * height_;
        const int64_t least = compressed ? 1 : std::abs(stored) / 8;
        const bool there = compressed ? can_expand(file_size_, static_cast<double>(frame))
                                      : frame <= file_size_ / frames_ / least;
        if (!there)
            throw failure("the file is too small for " + std::to_string(width_) + " x " +
                          std::to_string(height_) + " pixels in " + std::to_string(frames_) + " frames");
    }

    fits_handle file_;
    int64_t file_size_ = 0;
    const fits_type* type_ = nullptr;
    int width_ = 0;
    int height_ = 0;
    int frames_ = 0;
    int nominal_bits_ = 0;
};

class fits_writer final : public frame_writer {
public:
    explicit fits_writer(const std::string& path) : path_(path), output_(path) {}

    void add(IPixmat2* image) override
    {
        pixel_rows rows(image);
        const image_layout& layout = rows.layout();
        if (frames_ == 0)
            begin(layout);
        else if (layout.width != first_.width || layout.height != first_.height ||
                 layout.bits != first_.bits || layout.encoding != first_.encoding)
            throw failure(path_ + ": the frames of a FITS cube must have one size and pixel type");
        else
            grow();
        const auto width = static_cast<LONGLONG>(layout.width);
        int status = 0;
        for (int y = 0; y < layout.height; ++y)
            fits_write_img(file_.get(), type_->passed, (frames_ * LONGLONG{layout.height} + y) * width + 1,
                           width, const_cast<uint8_t*>(rows.row(y)), &status);
        check_write(status);
        ++frames_;
    }

    void finish() override
    {
        if (frames_ == 0) throw failure(path_ + ": there is nothing to write");
        int status = 0;
        fits_close_file(std::exchange(*file_.put(), nullptr), &status);
        check_write(status);
        output_.commit();
    }

private:
    void check_write(int status) const
    {
        if (status == 0) return;
        char text[FLEN_STATUS] = "";
        fits_get_errstatus(status, text);
        fits_clear_errmsg();
        throw failure(path_ + ": " + text);
    }

    void begin(const image_layout& layout)
    {
        if (layout.width < 1 || layout.height < 1)
            throw failure(path_ + ": an image without pixels cannot be written");
        const auto found = std::ranges::find_if(fits_types, [&](const fits_type& t) {
            return t.encoding == layout.encoding && t.bits == 8 * pixel_bytes(layout);
        });
        if (found == std::end(fits_types))
            throw failure(path_ + ": a FITS file cannot hold " + format_name(layout) + " pixels; .tif can");
        type_ = &*found;
        first_ = layout;
        int status = 0;
        long size[2] = {layout.width, layout.height};
        fits_create_diskfile(file_.put(), output_.temporary().c_str(), &status);
        fits_create_img(file_.get(), type_->stored, 2, size, &status);
        if (layout.bits % 8 != 0)
            fits_write_key(file_.get(), TINT, bits_keyword, &first_.bits, "nominal depth of the pixels",
                           &status);
        check_write(status);
    }

    void grow()
    {
        int status = 0;
        long size[3] = {first_.width, first_.height, frames_ + 1};
        fits_resize_img(file_.get(), type_->stored, 3, size, &status);
        check_write(status);
    }

    std::string path_;
    output_file output_;
    fits_handle file_; // closed before the output's file goes
    const fits_type* type_ = nullptr;
    image_layout first_;
    LONGLONG frames_ = 0;
};

} // namespace

std::unique_ptr<frame_reader> open_fits(const std::string& path)
{
    return std::make_unique<fits_reader>(path);
}

std::unique_ptr<frame_writer> create_fits(const std::string& path)
{
    return std::make_unique<fits_writer>(path);
}

} // namespace cli
