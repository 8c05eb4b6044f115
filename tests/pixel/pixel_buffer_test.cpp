#include "pixel/pixel_buffer.h"

#include "support/failing_new.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <thread>
#include <vector>

namespace Qor::Luxar::Test {
namespace {

constexpr size_t megabyte = size_t{1} << 20;

bool is_zero(const uint8_t* data, size_t bytes)
{
    return std::all_of(data, data + bytes, [](uint8_t b) { return b == 0; });
}

TEST(PixelBuffer, IsAlignedZeroAndWritable)
{
    for (const size_t bytes :
         {size_t{0}, size_t{1}, size_t{100}, 4 * megabyte - 1, 4 * megabyte, 5 * megabyte + 3}) {
        const auto buffer = pixel_buffer::allocate(bytes, pixel_buffer::zeroed);
        ASSERT_TRUE(buffer) << bytes;
        EXPECT_EQ(reinterpret_cast<uintptr_t>(buffer.data()) % (bytes < 4 * megabyte ? 64 : 2 * megabyte),
                  0u);
        EXPECT_TRUE(is_zero(buffer.data(), bytes)) << bytes;
        if (bytes > 0) std::memset(buffer.data(), 255, bytes);
    }
    for (const size_t bytes :
         {SIZE_MAX, size_t{PTRDIFF_MAX}, size_t{PTRDIFF_MAX} - 3 * megabyte, size_t{1} << 60})
        EXPECT_FALSE(pixel_buffer::allocate(bytes, pixel_buffer::zeroed)) << bytes;
    EXPECT_FALSE(ZELT::Test::with_failing_allocation(
        1, [] { return pixel_buffer::allocate(megabyte, pixel_buffer::zeroed); }));
}

TEST(PixelBuffer, RecyclesBigMemoryAsZero)
{
    uint8_t* place = nullptr;
    {
        const auto used = pixel_buffer::allocate(9 * megabyte, pixel_buffer::zeroed);
        place = used.data();
        std::memset(place, 255, 9 * megabyte);
    }
    {
        const auto small = pixel_buffer::allocate(4 * megabyte, pixel_buffer::zeroed);
        EXPECT_NE(small.data(), place) << "less than half of it would be used";
        const auto again = pixel_buffer::allocate(8 * megabyte, pixel_buffer::zeroed);
        EXPECT_EQ(again.data(), place);
        EXPECT_TRUE(is_zero(again.data(), 8 * megabyte));
        std::memset(place, 7, 8 * megabyte);
    }
    const auto raw = pixel_buffer::allocate(9 * megabyte, pixel_buffer::uninitialised);
    EXPECT_EQ(raw.data(), place);
    EXPECT_EQ(raw.data()[8 * megabyte - 1], 7) << "the fill was skipped";
}

TEST(PixelBuffer, KeepsAFewBlocksAndNotMuchMemory)
{
    const auto in_use = [](size_t bytes, int count) {
        std::vector<pixel_buffer> buffers;
        for (int i = 0; i < count; ++i)
            buffers.push_back(pixel_buffer::allocate(bytes, pixel_buffer::uninitialised));
    };
    in_use(6 * megabyte, 9);
    EXPECT_EQ(pooled_bytes(), most_pooled_blocks * 6 * megabyte);
    in_use(100 * megabyte, 4);
    EXPECT_EQ(pooled_bytes(), 200 * megabyte) << "the oldest made room";
    in_use(300 * megabyte, 1);
    EXPECT_EQ(pooled_bytes(), 200 * megabyte) << "too big to keep";
}

TEST(PixelBuffer, ThreadsTakeAndGiveAtOnce)
{
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t)
        threads.emplace_back([t] {
            for (int i = 0; i < 20; ++i) {
                const size_t bytes = (4 + static_cast<size_t>(i + t) % 3) * megabyte;
                const auto buffer = pixel_buffer::allocate(bytes, pixel_buffer::zeroed);
                if (!buffer || buffer.data()[bytes - 1] != 0) ADD_FAILURE() << "thread " << t;
                buffer.data()[bytes - 1] = 1;
            }
        });
    for (auto& t : threads) t.join();
}

// Goes after the pool has closed.
struct held_to_the_end {
    pixel_buffer buffer;
} held;

TEST(PixelBuffer, MayOutliveThePool)
{
    held.buffer = pixel_buffer::allocate(4 * megabyte, pixel_buffer::zeroed);
    EXPECT_TRUE(held.buffer);
}

} // namespace
} // namespace Qor::Luxar::Test
