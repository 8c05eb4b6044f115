#include "tiff_directory.h"

#include "failure.h"
#include "image_file.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <unordered_set>

namespace cli {
namespace {

size_t size_of_type(uint16_t type)
{
    switch (type) {
    case 1: // byte
    case 2: // text
        return 1;
    case 3: return 2;  // 16 bits
    case 4: return 4;  // 32 bits
    case 16: return 8; // 64 bits
    default: return 0; // no number that is used here
    }
}

[[noreturn]] void truncated() { throw failure("the file is truncated or damaged"); }

} // namespace

tiff_directory::open_file::open_file(const std::string& path)
    : number(open(path.c_str(), O_RDONLY | O_CLOEXEC))
{
    if (number < 0) throw failure(std::strerror(errno));
}

tiff_directory::open_file::~open_file() { close(number); }

tiff_directory::tiff_directory(const std::string& path) : file_(path)
{
    struct stat status = {};
    if (fstat(file_.number, &status) != 0) throw failure(std::strerror(errno));
    file_size_ = static_cast<uint64_t>(status.st_size);

    char order[2];
    read_at(0, order, 2);
    big_endian_ = order[0] == 'M';
    big_tiff_ = number_at(2, 2) == 43;
    if (big_tiff_ && (number_at(4, 2) != 8 || number_at(6, 2) != 0))
        throw failure("is not a known kind of TIFF");

    std::unordered_set<uint64_t> seen;
    uint64_t directory = big_tiff_ ? number_at(8, 8) : number_at(4, 4);
    while (directory != 0) {
        if (!seen.insert(directory).second) throw failure("its chain of pages never ends");
        if (directories_.size() >= most_frames) throw failure("it has too many pages");
        uint64_t first = 0;
        const uint64_t count = entries_of(directory, &first);
        directories_.push_back(directory);
        directory = number_at(first + count * (big_tiff_ ? 20 : 12), big_tiff_ ? 8 : 4);
    }
    if (directories_.empty()) throw failure("holds no image");
}

void tiff_directory::read_at(uint64_t offset, void* data, size_t size) const
{
    if (offset > file_size_ || size > file_size_ - offset) truncated();
    auto* bytes = static_cast<char*>(data);
    while (size > 0) {
        const ssize_t got = pread(file_.number, bytes, size, static_cast<off_t>(offset));
        if (got < 0 && errno == EINTR) continue;
        if (got < 0) throw failure(std::strerror(errno));
        if (got == 0) truncated();
        bytes += got;
        offset += static_cast<uint64_t>(got);
        size -= static_cast<size_t>(got);
    }
}

uint64_t tiff_directory::number_at(uint64_t offset, size_t bytes) const
{
    unsigned char raw[8];
    read_at(offset, raw, bytes);
    uint64_t value = 0;
    for (size_t i = 0; i < bytes; ++i) value = value << 8 | raw[big_endian_ ? i : bytes - 1 - i];
    return value;
}

uint64_t tiff_directory::entries_of(uint64_t directory, uint64_t* first) const
{
    const size_t bytes = big_tiff_ ? 8 : 2;
    *first = directory + bytes;
    const uint64_t count = number_at(directory, bytes);
    if (count > UINT16_MAX) truncated();
    return count;
}

tiff_directory::entry tiff_directory::entry_at(uint64_t offset) const
{
    entry e{};
    e.tag = static_cast<uint16_t>(number_at(offset, 2));
    e.type = static_cast<uint16_t>(number_at(offset + 2, 2));
    const size_t bytes = big_tiff_ ? 8 : 4;
    e.count = number_at(offset + 4, bytes);
    const uint64_t field = offset + 4 + bytes;
    const uint64_t size = size_of_type(e.type);
    // Values that fit into the entry stand there, others where it points.
    e.value_at = size == 0 || e.count <= bytes / size ? field : number_at(field, bytes);
    return e;
}

std::vector<uint64_t> tiff_directory::numbers(const entry& e, uint64_t most) const
{
    const size_t size = size_of_type(e.type);
    if (size == 0 || e.count == 0 || e.count > most) truncated();
    std::vector<unsigned char> raw(static_cast<size_t>(e.count) * size);
    read_at(e.value_at, raw.data(), raw.size());
    std::vector<uint64_t> values(static_cast<size_t>(e.count));
    for (size_t i = 0; i < values.size(); ++i)
        for (size_t b = 0; b < size; ++b)
            values[i] = values[i] << 8 | raw[i * size + (big_endian_ ? b : size - 1 - b)];
    return values;
}

void tiff_directory::place(const entry& e, tiff_page& page) const
{
    const auto number = [&] { return static_cast<int64_t>(numbers(e, 1)[0]); };
    const auto small = [&] { return static_cast<int>(std::clamp<int64_t>(number(), 0, INT32_MAX)); };
    const auto several = [&](bool* equal) {
        const auto values = numbers(e, UINT16_MAX);
        *equal = *equal && std::ranges::all_of(values, [&](uint64_t v) { return v == values[0]; });
        return static_cast<int>(std::min<uint64_t>(values[0], INT32_MAX));
    };
    const uint64_t most_parts = file_size_ / size_of_type(3); // each needs at least so much of the file
    switch (tiff_tag(e.tag)) {
    case tiff_tag::width: page.width = number(); break;
    case tiff_tag::height: page.height = number(); break;
    case tiff_tag::bits: page.bits = several(&page.equal_bits); break;
    case tiff_tag::compression: page.compression = small(); break;
    case tiff_tag::photometric: page.photometric = small(); break;
    case tiff_tag::fill_order:
    case tiff_tag::orientation: page.plain_order = page.plain_order && number() == 1; break;
    case tiff_tag::samples: page.samples = small(); break;
    case tiff_tag::rows_per_strip: page.rows_per_strip = number(); break;
    case tiff_tag::planar: page.planar = number() == 2; break;
    case tiff_tag::sample_format: page.format = tiff_samples(several(&page.equal_bits)); break;
    case tiff_tag::strip_offsets: page.offsets = numbers(e, most_parts); break;
    case tiff_tag::strip_sizes: page.sizes = numbers(e, most_parts); break;
    case tiff_tag::tile_offsets:
        page.offsets = numbers(e, most_parts);
        page.tiled = true;
        break;
    case tiff_tag::tile_sizes: page.sizes = numbers(e, most_parts); break;
    case tiff_tag::description:
        if (size_of_type(e.type) == 1 && e.count < 4096) {
            page.description.resize(static_cast<size_t>(e.count));
            read_at(e.value_at, page.description.data(), page.description.size());
            page.description.resize(std::strlen(page.description.c_str()));
        }
        break;
    default: break;
    }
}

tiff_page tiff_directory::page(int index) const
{
    tiff_page page;
    uint64_t first = 0;
    const uint64_t count = entries_of(directories_[static_cast<size_t>(index)], &first);
    for (uint64_t i = 0; i < count; ++i) place(entry_at(first + i * (big_tiff_ ? 20 : 12)), page);
    if (page.width <= 0 || page.height <= 0 || page.width > INT32_MAX || page.height > INT32_MAX)
        throw failure("has no usable width and height");
    if (page.offsets.empty() || page.offsets.size() != page.sizes.size())
        throw failure("does not say where its pixels are");
    for (size_t i = 0; i < page.offsets.size(); ++i)
        if (page.offsets[i] > file_size_ || page.sizes[i] > file_size_ - page.offsets[i]) truncated();
    if (page.rows_per_strip <= 0 || page.rows_per_strip > page.height) page.rows_per_strip = page.height;
    return page;
}

} // namespace cli
