#include "support/cases.h"

#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define __SANITIZE_ADDRESS__ 1
#endif
#endif
#ifdef __SANITIZE_ADDRESS__
#include <sanitizer/asan_interface.h>
#endif

namespace Qor::Luxar::ZELT::Test {
namespace {

uint8_t guard_byte(int64_t i) { return static_cast<uint8_t>(0xA5 + 59 * i); }

} // namespace

const char* name(memory_layout l) noexcept
{
    constexpr const char* names[memory_layout_count] = {
        "packed", "padded", "flipped", "mirrored", "transposed", "every second", "misaligned", "inset"};
    return names[static_cast<int>(l)];
}

const char* name(level l) noexcept { return l == level::v4 ? "v4" : l == level::v3 ? "v3" : "v1"; }

std::string name(size s) { return std::to_string(s.width) + " x " + std::to_string(s.height); }

pixel_memory::pixel_memory(size s, memory_layout l, int64_t pixel_bytes)
    : offset(0), x_stride(pixel_bytes), y_stride(s.width * pixel_bytes), size_(s), pixel_bytes_(pixel_bytes),
      first_(64), end_(64)
{
    const int64_t right = std::max(s.width - 1, 0);
    const int64_t bottom = std::max(s.height - 1, 0);
    int64_t guards = 64;
    switch (l) {
    case memory_layout::packed: break;
    case memory_layout::padded: y_stride += 3 * pixel_bytes; break;
    case memory_layout::flipped: y_stride = -y_stride; break;
    case memory_layout::mirrored: x_stride = -x_stride; break;
    case memory_layout::transposed:
        x_stride = s.height * pixel_bytes;
        y_stride = pixel_bytes;
        break;
    case memory_layout::every_second:
        x_stride *= 2;
        y_stride *= 2;
        break;
    case memory_layout::misaligned:
        first_ += 1;
        y_stride += 1 + pixel_bytes % 2; // the next row is misaligned too
        break;
    case memory_layout::inset: // three rows above and below, five pixels left, eleven in all beside each row
        y_stride += 11 * pixel_bytes;
        guards = 3 * y_stride + 64;
        first_ += 3 * y_stride + 5 * pixel_bytes;
        break;
    }
    offset = first_ - std::min<int64_t>(x_stride, 0) * right - std::min<int64_t>(y_stride, 0) * bottom;
    const bool empty = s.width == 0 || s.height == 0;
    end_ = empty ? first_ : first_ + std::abs(x_stride) * right + std::abs(y_stride) * bottom + pixel_bytes;
    lines_.resize(static_cast<size_t>((end_ + guards + 63) / 64));
    for (int64_t i = 0; i < static_cast<int64_t>(lines_.size() * 64); ++i) data()[i] = guard_byte(i);
    guard(true);
}

pixel_memory::pixel_memory(const pixel_memory& other)
    : offset(other.offset), x_stride(other.x_stride), y_stride(other.y_stride), size_(other.size_),
      pixel_bytes_(other.pixel_bytes_), first_(other.first_), end_(other.end_)
{
    other.guard(false);
    lines_ = other.lines_;
    other.guard(true);
    guard(true);
}

pixel_memory& pixel_memory::operator=(pixel_memory other) noexcept
{
    offset = other.offset;
    x_stride = other.x_stride;
    y_stride = other.y_stride;
    size_ = other.size_;
    pixel_bytes_ = other.pixel_bytes_;
    first_ = other.first_;
    end_ = other.end_;
    lines_.swap(other.lines_);
    return *this;
}

std::optional<int64_t> pixel_memory::damage() const
{
    guard(false);
    std::vector<bool> owned(lines_.size() * 64);
    for (int64_t y = 0; y < size_.height; ++y)
        for (int64_t x = 0; x < size_.width; ++x)
            for (int64_t b = 0; b < pixel_bytes_; ++b)
                owned[static_cast<size_t>(at(x, y) - data() + b)] = true;
    std::optional<int64_t> place;
    for (int64_t i = 0; i < static_cast<int64_t>(owned.size()) && !place; ++i)
        if (!owned[static_cast<size_t>(i)] && data()[i] != guard_byte(i)) place = i - offset;
    guard(true);
    return place;
}

void pixel_memory::guard([[maybe_unused]] bool on) const
{
#ifdef __SANITIZE_ADDRESS__
    const auto bytes = lines_.size() * 64;
    __asan_unpoison_memory_region(data(), bytes);
    if (!on) return;
    __asan_poison_memory_region(data(), static_cast<size_t>(first_));
    __asan_poison_memory_region(data() + end_, bytes - static_cast<size_t>(end_));
#endif
}

bool enough_failures()
{
    return ::testing::UnitTest::GetInstance()->current_test_info()->result()->total_part_count() >= 8;
}

} // namespace Qor::Luxar::ZELT::Test
