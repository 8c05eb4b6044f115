// PNG files: checked here, decoded and encoded by the codecs.
#include "codecs.h"
#include "failure.h"
#include "image_formats.h"
#include "output_file.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <sys/stat.h>

using namespace Qor::Luxar;

namespace cli {
namespace {

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
        return codecs().decode_png(file);
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
        std::vector<uint8_t> bytes;
        try {
            bytes = codecs().encode_png(image);
        } catch (const failure& f) {
            throw failure(path_ + ": " + f.what());
        }
        file_.write(bytes.data(), bytes.size());
    }

    void finish() override { file_.commit(); }

private:
    std::string path_;
    output_file file_;
};

} // namespace

std::unique_ptr<frame_reader> open_png(const std::string& path) { return std::make_unique<png_reader>(path); }

std::unique_ptr<frame_writer> create_png(const std::string& path)
{
    return std::make_unique<png_writer>(path);
}

} // namespace cli
