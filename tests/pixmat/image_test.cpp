#include "pixmat/image.h"

#include "pixmat_objects.h"
#include "support/failing_new.h"

#include <thread>

namespace Qor::Luxar::Test {
namespace {

using ZELT::Test::step;

int64_t bytes_of(const image_layout& l) { return (int64_t{l.bits} + 7) / 8; }

uint8_t* pixel_at(const image_layout& l, uint8_t* data, int64_t x, int64_t y)
{
    return data + l.offset + y * l.y_stride + x * l.x_stride;
}

std::string text_of(const image_layout& l)
{
    std::string text;
    for (const int32_t n : {l.width, l.height, l.bits, int32_t{l.encoding}, l.offset, l.x_stride, l.y_stride})
        text += std::to_string(n) + ' ';
    return text;
}

const image_layout odd_layouts[] = {
    {5, 3, 16, PixmatEncoding_Unsigned, 0, 2, 10},      // packed
    {5, 3, 16, PixmatEncoding_Unsigned, 1000, 2, 10},   // bytes in front
    {5, 3, 16, PixmatEncoding_Unsigned, -1000, 2, 10},  // before the data pointer
    {5, 3, 12, PixmatEncoding_Signed, 3, 7, 41},        // gaps, nothing aligned
    {5, 3, 32, PixmatEncoding_Float, 0, -4, -20},       // turned round
    {5, 3, 32, PixmatEncoding_Float, 40, 4, -20},       // upside down
    {5, 3, 64, PixmatEncoding_Complex_Float, 0, 24, 8}, // columns in memory order
    {5, 3, 24, PixmatEncoding_RGB, 2, 0, 3},            // one pixel to a row
    {5, 3, 8, PixmatEncoding_Unsigned, 0, 0, 0},        // one pixel in all
    {0, 0, 8, PixmatEncoding_Unsigned, 0, 1, 0},
    {0, 7, 8, PixmatEncoding_Unsigned, 0, 1, 9},
    {65536, 1, 8, PixmatEncoding_Unsigned, 0, 1, 1},
    {1, 65536, 16, PixmatEncoding_Unsigned, 0, 2, 2},
    {3, 3, 96, PixmatEncoding_Float_Vector3D, 0, 12, 36}, // no pixel type
    {3, 3, 1, PixmatEncoding_Data, 0, 1, 3},
    {3, 3, 999, PixmatEncoding(-5), 0, 125, 375},
    {3, 2, 8, PixmatEncoding_Unsigned, 0, 3'000'000, -2'000'000}, // from a map
};

TEST(Image, HonoursEveryLayoutAndStartsZero)
{
    for (const image_layout& l : odd_layouts)
        step(text_of(l), [&] {
            const auto image = new_image(l);
            EXPECT_EQ(layout_of(image.get()), l);
            const auto lock = open_write(image.get());
            uint8_t* const data = lock->Data(0);
            ASSERT_TRUE(data);
            EXPECT_EQ(reinterpret_cast<uintptr_t>(data) % 64, 0u);
            // 16 bytes beside the outermost pixels belong to the image, too; the address sanitizer watches.
            const int64_t bytes = bytes_of(l);
            for (int64_t y = 0; y < l.height; ++y)
                for (int64_t x = 0; x < l.width; ++x)
                    for (int64_t i = -16; i < bytes + 16; ++i)
                        ASSERT_EQ(pixel_at(l, data, x, y)[i], 0) << x << ' ' << y << ' ' << i;
            for (int64_t y = 0; y < l.height; ++y)
                for (int64_t x = 0; x < l.width; ++x)
                    std::memset(pixel_at(l, data, x, y) - 16, 1, static_cast<size_t>(bytes + 32));
        });
}

TEST(Image, ClonesEveryLayoutPacked)
{
    for (const image_layout& l : odd_layouts)
        step(text_of(l), [&] {
            const auto image = new_image(l);
            uint8_t* const data = open_write(image.get())->Data(0);
            for (int64_t y = 0; y < l.height; ++y)
                for (int64_t x = 0; x < l.width; ++x)
                    for (int64_t i = 0; i < bytes_of(l); ++i)
                        pixel_at(l, data, x, y)[i] = static_cast<uint8_t>(1 + x + 7 * y + 3 * i);
            com_ptr<IPixmat2> copy;
            ASSERT_EQ(image->Clone(copy.put()), S_OK);
            const image_layout packed = packed_layout(l.width, l.height, l.bits, l.encoding);
            EXPECT_EQ(layout_of(copy.get()), packed);
            uint8_t* const copied = open_read(copy.get())->Data(0);
            ASSERT_NE(copied, data);
            for (int64_t y = 0; y < l.height; ++y)
                for (int64_t x = 0; x < l.width; ++x)
                    for (int64_t i = 0; i < bytes_of(l); ++i)
                        ASSERT_EQ(pixel_at(packed, copied, x, y)[i], pixel_at(l, data, x, y)[i]);
            for (int64_t i = 0; i < 16; ++i) ASSERT_EQ(copied[-1 - i], 0);
        });
}

TEST(Image, SpansAreExactAtTheLimitsOf32Bits)
{
    constexpr int32_t low = INT32_MIN, high = INT32_MAX;
    const byte_span down = span_of({high, high, 8, PixmatEncoding_Unsigned, low, low, low});
    EXPECT_EQ(down.first, 2 * (int64_t{high} - 1) * low + low);
    EXPECT_EQ(down.end, 0);
    const byte_span both = span_of({high, high, high, PixmatEncoding_Unsigned, high, high, low});
    EXPECT_EQ(both.first, (int64_t{high} - 1) * low + high);
    EXPECT_EQ(both.end, (int64_t{high} - 1) * high + high + (int64_t{high} + 7) / 8);
}

TEST(Image, RefusesWrongAreasAndScales)
{
    const auto image = small_image();
    const auto answer = [&](rectangle r, double scale, HRESULT area_answer = S_OK) {
        com_ptr<IPixmatLock> lock;
        const auto area = make<area_stub>(r, area_answer);
        const HRESULT hr = image->OpenRead(area.get(), scale, lock.put());
        EXPECT_EQ(lock.get() != nullptr, hr == S_OK);
        // The data are those of the whole image.
        if (lock) {
            EXPECT_EQ(lock->Data(0), open_read(image.get())->Data(0));
        }
        return hr;
    };
    EXPECT_EQ(answer({0, 0, 4, 3}, 1), S_OK);
    EXPECT_EQ(answer({1, 1, 2, 2}, 1), S_OK);
    EXPECT_EQ(answer({4, 3, 4, 3}, 1), S_OK);
    EXPECT_EQ(answer({0, 0, 5, 3}, 1), E_INVALIDARG);
    EXPECT_EQ(answer({0, 0, 4, 4}, 1), E_INVALIDARG);
    EXPECT_EQ(answer({-1, 0, 4, 3}, 1), E_INVALIDARG);
    EXPECT_EQ(answer({0, INT32_MIN, 4, 3}, 1), E_INVALIDARG);
    EXPECT_EQ(answer({3, 0, 2, 3}, 1), E_INVALIDARG);
    EXPECT_EQ(answer({0, 0, 4, 3}, 1, E_ACCESSDENIED), E_ACCESSDENIED);
    for (const double scale : {0.0, 0.5, -1.0, std::nan("")})
        EXPECT_EQ(answer({0, 0, 4, 3}, scale), E_INVALIDARG);
    EXPECT_EQ(image->OpenRead(nullptr, 1.0, nullptr), E_POINTER);
    EXPECT_EQ(image->OpenWrite(nullptr), E_POINTER);
    EXPECT_EQ(image->Clone(nullptr), E_POINTER);
    EXPECT_EQ(image->GetDescriptor(nullptr), E_POINTER);
}

TEST(Image, LivesAsLongAsALock)
{
    auto image = small_image();
    const auto reader = open_read(image.get());
    const auto writer = open_write(image.get()); // locks do not shut each other out
    image = nullptr;
    writer->Data(0)[11] = 7;
    EXPECT_EQ(reader->Data(0)[11], 7);
    EXPECT_EQ(reader->Commit(nullptr), E_INVALIDARG);
    EXPECT_EQ(writer->Commit(nullptr), S_OK);
}

TEST(Image, DescriptorsAreCopies)
{
    const auto image = small_image();
    com_ptr<IPixmatDescriptor> descriptor;
    image->GetDescriptor(descriptor.put());
    descriptor->put_Width(99);
    EXPECT_EQ(layout_of(image.get()).width, 4);
}

TEST(Image, IsReadByManyThreadsAtOnce)
{
    const auto image = small_image();
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t)
        threads.emplace_back([&image, t] {
            for (int i = 0; i < 200; ++i) {
                const auto store = image.as<IPixmatStatisticsStore>();
                const bstr key(std::to_wstring(t % 2));
                const variant number(i);
                variant found;
                if (layout_of(image.get()).width != 4 || open_read(image.get())->Data(0)[0] != 0 ||
                    failed(store->SetValue(key.get(), number.get())) ||
                    failed(store->GetValue(key.get(), found.put())))
                    ADD_FAILURE() << "thread " << t;
            }
        });
    for (auto& t : threads) t.join();
}

int releases = 0;
void count_release(void* context) noexcept
{
    EXPECT_EQ(context, &releases);
    ++releases;
}

TEST(WrappedImage, ReleasesTheMemoryOnceWhenTheLastReferenceGoes)
{
    releases = 0;
    uint8_t pixels[12] = {};
    com_ptr<IPixmat2> image;
    const image_layout turned{4, 3, 8, PixmatEncoding_Unsigned, 11, -1, -4};
    ASSERT_EQ(WrapPixmat(turned, pixels, false, count_release, &releases, image.put()), S_OK);
    EXPECT_EQ(layout_of(image.get()), turned);
    auto lock = open_write(image.get());
    EXPECT_EQ(lock->Data(0), pixels);
    com_ptr<IPixmat2> copy;
    ASSERT_EQ(image->Clone(copy.put()), S_OK);
    image = nullptr;
    EXPECT_EQ(releases, 0);
    lock = nullptr;
    EXPECT_EQ(releases, 1);
    copy = nullptr;
    EXPECT_EQ(releases, 1);
}

TEST(WrappedImage, KeepsReadOnlyMemoryFromWriters)
{
    const uint8_t pixels[12] = {1, 2, 3};
    com_ptr<IPixmat2> image;
    ASSERT_EQ(WrapPixmat(packed_layout(4, 3, 8, PixmatEncoding_Unsigned), const_cast<uint8_t*>(pixels), true,
                         nullptr, nullptr, image.put()),
              S_OK);
    com_ptr<IPixmatLock> lock;
    EXPECT_EQ(image->OpenWrite(lock.put()), E_ACCESSDENIED);
    EXPECT_FALSE(lock);
    EXPECT_EQ(open_read(image.get())->Data(0)[2], 3);
    com_ptr<IPixmat2> copy;
    ASSERT_EQ(image->Clone(copy.put()), S_OK);
    open_write(copy.get())->Data(0)[2] = 9;
}

TEST(WrappedImage, RefusalsKeepTheMemoryWithTheCaller)
{
    releases = 0;
    uint8_t pixels[12] = {};
    com_ptr<IPixmat2> image;
    const auto answer = [&](image_layout l, void* data) {
        return WrapPixmat(l, data, false, count_release, &releases, image.put());
    };
    EXPECT_EQ(answer({-1, 3, 8, PixmatEncoding_Unsigned, 0, 1, 4}, pixels), E_INVALIDARG);
    EXPECT_EQ(answer({4, -3, 8, PixmatEncoding_Unsigned, 0, 1, 4}, pixels), E_INVALIDARG);
    EXPECT_EQ(answer({4, 3, 0, PixmatEncoding_Unsigned, 0, 1, 4}, pixels), E_INVALIDARG);
    EXPECT_EQ(answer({4, 3, 8, PixmatEncoding_Unsigned, 0, 1, 4}, nullptr), E_POINTER);
    EXPECT_EQ(WrapPixmat({}, pixels, false, count_release, &releases, nullptr), E_POINTER);
    EXPECT_EQ(ZELT::Test::with_failing_allocation(
                  1,
                  [&] {
                      return answer({4, 3, 8, PixmatEncoding_Unsigned, 0, 1, 4}, pixels);
                  }),
              E_OUTOFMEMORY);
    EXPECT_EQ(releases, 0);
    EXPECT_FALSE(image);
    EXPECT_EQ(answer({0, 3, 8, PixmatEncoding_Unsigned, 0, 1, 4}, nullptr), S_OK) << "no pixels, no memory";
}

} // namespace
} // namespace Qor::Luxar::Test
