// The directories of a TIFF file: what its pages say of themselves, checked against the size of the file.
#pragma once

#include <bit>
#include <cstdint>
#include <string>
#include <vector>

namespace cli {

/// Numbers of tags and of their values, as far as they are used here.
enum class tiff_tag : uint16_t {
    width = 256,
    height = 257,
    bits = 258,
    compression = 259,
    photometric = 262,
    fill_order = 266,
    description = 270,
    strip_offsets = 273,
    orientation = 274,
    samples = 277,
    rows_per_strip = 278,
    strip_sizes = 279,
    planar = 284,
    tile_offsets = 324,
    tile_sizes = 325,
    extra_samples = 338,
    sample_format = 339,
};

enum class tiff_samples : uint16_t { unsigned_integer = 1, signed_integer = 2, real = 3, complex = 6 };

struct tiff_page {
    int64_t width = 0;
    int64_t height = 0;
    int bits = 1; ///< of a sample
    bool equal_bits = true;
    int samples = 1;
    tiff_samples format = tiff_samples::unsigned_integer;
    int compression = 1; ///< 1 is none
    int photometric = 1; ///< 0 white is zero, 1 black is zero, 2 red green blue, 3 palette
    bool planar = false;
    bool plain_order = true; ///< first row on top, first pixel left, highest bit first
    bool tiled = false;
    int64_t rows_per_strip = 0;
    std::vector<uint64_t> offsets; ///< of strips or tiles
    std::vector<uint64_t> sizes;
    std::string description;

    int64_t stored_bytes() const noexcept
    {
        int64_t sum = 0;
        for (uint64_t size : sizes) sum += static_cast<int64_t>(size);
        return sum;
    }
};

class tiff_directory {
public:
    /// Follows the chain of directories to its end. Throws failure for a file whose structure is damaged.
    explicit tiff_directory(const std::string& path);

    int count() const noexcept { return static_cast<int>(directories_.size()); }
    /// Every strip and tile lies inside the file.
    tiff_page page(int index) const;

    void read_at(uint64_t offset, void* data, size_t size) const;
    bool byte_order_differs() const noexcept
    {
        return big_endian_ != (std::endian::native == std::endian::big);
    }

private:
    struct entry {
        uint16_t tag;
        uint16_t type;
        uint64_t count;
        uint64_t value_at;
    };

    uint64_t number_at(uint64_t offset, size_t bytes) const;
    uint64_t entries_of(uint64_t directory, uint64_t* first) const;
    entry entry_at(uint64_t offset) const;
    std::vector<uint64_t> numbers(const entry& e, uint64_t most) const;
    void place(const entry& e, tiff_page& page) const;

    struct open_file {
        explicit open_file(const std::string& path);
        ~open_file();
        open_file(const open_file&) = delete;
        open_file& operator=(const open_file&) = delete;
        int number;
    };

    open_file file_;
    uint64_t file_size_ = 0;
    bool big_endian_ = false;
    bool big_tiff_ = false;
    std::vector<uint64_t> directories_;
};

} // namespace cli
