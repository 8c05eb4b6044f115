// The readers of image files: any bytes are an image or a message. The first byte chooses a way to read.
#include "failure.h"
#include "image_file.h"

#include <algorithm>
#include <cstdlib>
#include <string>
#include <sys/mman.h>
#include <unistd.h>

namespace {

/// Looks at every pixel, so that one outside the image's memory is noticed.
uint64_t sum_of(Qor::Luxar::IPixmat2* image)
{
    uint64_t sum = 0;
    cli::pixel_rows rows(image);
    for (int y = 0; y < rows.layout().height; ++y) {
        const uint8_t* row = rows.row(y);
        for (size_t i = 0; i < rows.row_bytes(); ++i) sum += row[i];
    }
    return sum;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    static const int file = memfd_create("image", MFD_CLOEXEC);
    static const std::string path = "/proc/self/fd/" + std::to_string(file);
    if (size == 0) return 0;
    const uint8_t way = data[0];
    if (ftruncate(file, 0) != 0 || pwrite(file, data + 1, size - 1, 0) != static_cast<ssize_t>(size - 1))
        std::abort();

    cli::read_options options;
    options.bits = way & 1 ? 12 : 0;
    options.page = way & 2 ? 2 : 0;
    try {
        const auto reader = cli::open_image(path, options);
        // A stack of many tiny frames is as good after a few.
        for (int i = 0; i < std::min(reader->count(), 4); ++i) sum_of(reader->read(i).get());
    } catch (const cli::failure& f) {
        if (std::string(f.what()).find(path) != 0) std::abort(); // every message begins with the file's name
    }
    return 0;
}
