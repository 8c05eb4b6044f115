#include "pixel/memory_2d.h"

#include "pixel/rows.h"
#include "support/cases.h"

#include <tuple>

using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;
using namespace Qor::Luxar::ZELT::Test;
using namespace Qor::Luxar::ZELT::ZELT_LEVEL;

namespace {

uint8_t somewhere;
const memory_2d six_by_four{pixel_type::unsigned_16, 6, 4, 100, -2, 40, &somewhere};

// The twenty pixel types and what a pixel of each is stored as.
template <class Body>
void for_each_type(Body&& body)
{
    const auto named = [&]<class T>(pixel<T>, std::initializer_list<int> types) {
        for (const int t : types)
            step("pixel type " + std::to_string(t), [&] { body(pixel<T>{}, static_cast<pixel_type>(t)); });
    };
    named(pixel<uint8_t>{}, {0});
    named(pixel<uint16_t>{}, {1});
    named(pixel<uint32_t>{}, {2});
    named(pixel<uint64_t>{}, {3});
    named(pixel<int8_t>{}, {4});
    named(pixel<int16_t>{}, {5});
    named(pixel<int32_t>{}, {6});
    named(pixel<int64_t>{}, {7});
    named(pixel<float>{}, {8});
    named(pixel<double>{}, {9});
    named(pixel<complex_pixel<float>>{}, {10, 11, 12});
    named(pixel<complex_pixel<double>>{}, {13, 14, 15});
    named(pixel<colour_24>{}, {16, 18});
    named(pixel<colour_32>{}, {17, 19});
}

auto fields(const memory_2d& m)
{
    return std::tuple(m.type, m.width, m.height, m.offset, m.x_stride, m.y_stride, m.data);
}

} // namespace

TEST(ImageLayout, StartsAsDataAndComparesAllFields)
{
    EXPECT_EQ(image_layout{}, (image_layout{0, 0, 0, PixmatEncoding_Data, 0, 0, 0}));
    const image_layout one{1, 2, 12, PixmatEncoding_Unsigned, 3, 4, 5};
    image_layout others[7] = {one, one, one, one, one, one, one};
    others[0].width = 9;
    others[1].height = 9;
    others[2].bits = 9;
    others[3].encoding = PixmatEncoding_Signed;
    others[4].offset = 9;
    others[5].x_stride = 9;
    others[6].y_stride = 9;
    for (const auto& other : others) EXPECT_FALSE(other == one);
    static_assert(sizeof(image_layout) == 28 && sizeof(rectangle) == 16 && sizeof(size) == 8);
}

TEST(ImageLayout, PackedStridesRoundBitsUpToBytes)
{
    constexpr int bytes_of[][2] = {{0, 0},    {1, 1},  {8, 1},  {9, 2},    {12, 2},
                                   {16, 2},   {17, 3}, {24, 3}, {32, 4},   {64, 8},
                                   {128, 16}, {-7, 0}, {-8, 0}, {-15, -1}, {INT32_MAX, 268435456}};
    for (const auto& [bits, bytes] : bytes_of) {
        const auto width = bits == INT32_MAX ? 1 : 5;
        const image_layout expected{width, 3, bits, PixmatEncoding_Signed, 0, bytes, bytes * width};
        EXPECT_EQ(packed_layout(width, 3, bits, PixmatEncoding_Signed), expected) << bits;
    }
}

TEST(Rectangle, WellFormedAndFitting)
{
    struct {
        rectangle r;
        bool well_formed, fits;
    } constexpr cases[] = {
        {{0, 0, 6, 4}, true, true},
        {{2, 1, 2, 1}, true, true},
        {{6, 4, 6, 4}, true, true},
        {{0, 0, 7, 4}, true, false},
        {{0, 0, 6, 5}, true, false},
        {{-1, 0, 6, 4}, true, false},
        {{0, -1, 6, 4}, true, false},
        {{-9, -9, -8, -8}, true, false},
        {{3, 0, 2, 4}, false, false},
        {{0, 3, 6, 2}, false, false},
        {{INT32_MIN, 0, INT32_MAX, 4}, true, false},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(is_well_formed(c.r), c.well_formed) << c.r.left << ' ' << c.r.top;
        EXPECT_EQ(fits(c.r, {6, 4}), c.fits) << c.r.left << ' ' << c.r.top;
    }
}

TEST(MakeView, WithoutRectangleIsTheWholeView)
{
    EXPECT_EQ(fields(six_by_four.make_view(nullptr)), fields(six_by_four));
}

TEST(MakeView, MovesTheOffsetByStridesAndKeepsTheRest)
{
    for (const rectangle r : {rectangle{0, 0, 6, 4},
                              {2, 1, 5, 3},
                              {2, 1, 2, 1},
                              {6, 4, 6, 4},
                              {-1, 0, 6, 4},
                              {0, -3, 1, -3},
                              {-1000000, -1000000, 6, 4}}) {
        SCOPED_TRACE(std::to_string(r.left) + ' ' + std::to_string(r.top));
        const memory_2d v = six_by_four.make_view(&r);
        const int64_t offset = 100 + 40 * r.top - 2 * r.left;
        EXPECT_EQ(fields(v), fields({pixel_type::unsigned_16, r.right - r.left, r.bottom - r.top, offset, -2,
                                     40, six_by_four.data}));
    }
}

TEST(MakeView, ComputesOffsetsBeyond32Bits)
{
    memory_2d big = six_by_four;
    big.width = big.height = INT32_MAX;
    big.y_stride = int64_t{1} << 31;
    const rectangle corner{INT32_MAX - 1, INT32_MAX - 1, INT32_MAX, INT32_MAX};
    EXPECT_EQ(big.make_view(&corner).offset, 100 + (int64_t{INT32_MAX} - 1) * (big.y_stride - 2));
}

TEST(MakeView, RefusesWhatIsMalformedOrTooFarRightOrDown)
{
    for (const rectangle r : {rectangle{0, 0, 7, 4},
                              {0, 0, 6, 5},
                              {3, 0, 2, 4},
                              {0, 3, 6, 2},
                              {7, 0, 7, 4},
                              {0, 5, 6, 5},
                              {0, 0, INT32_MAX, 4}})
        expect_throws<std::invalid_argument>([&] { (void)six_by_four.make_view(&r); },
                                             "memory_2d::make_view: invalid rectangle");
}

TEST(MakeView, ShowsThePixelsInsideTheRectangleInEveryLayout)
{
    for_each_layout([](memory_layout l) {
        const auto image = random_image<colour_24>({9, 7}, l, 5);
        const rectangle r{2, 3, 8, 6};
        with_rows<colour_24>(image.view().make_view(&r), [&](auto rows) {
            ASSERT_EQ((size{rows.width, rows.height}), (size{6, 3}));
            for (int y = 0; y < 3; ++y)
                for (int x = 0; x < 6; ++x)
                    EXPECT_TRUE(same_bits<colour_24>(rows[y][x], image.at(x + 2, y + 3)));
        });
    });
}

TEST(ViewOf, TakesTheLayoutAndItsPixelType)
{
    uint8_t byte = 0;
    const memory_2d v = view_of({7, 5, 12, PixmatEncoding_Signed, -3, -2, 99}, &byte);
    EXPECT_EQ(fields(v), fields({pixel_type::signed_16, 7, 5, -3, -2, 99, &byte}));
    expect_throws<std::invalid_argument>(
        [&] {
            view_of({7, 5, 17, PixmatEncoding_Signed, 0, 2, 99}, &byte);
        },
        "Unsupported Pixmat encoding/bits");
}

TEST(CopyPixels, CopiesEveryTypeBetweenAllLayouts)
{
    for_each_type([]<class T>(pixel<T>, pixel_type type) {
        for (const size s : {size{0, 0}, {5, 0}, {0, 5}, {1, 1}, {7, 3}, {33, 2}})
            for_each_layout([&](memory_layout from) {
                const auto source = random_image<T>(s, from, 1, values::special, type);
                for_each_layout([&](memory_layout to) {
                    auto target = random_image<T>(s, to, 2, values::plain, type);
                    copy_pixels(target.layout(), target.data(), source.layout(), source.data());
                    // Bytes, not values: a copy keeps a NaN's payload.
                    expect_intact(target);
                    for (int y = 0; y < s.height; ++y)
                        for (int x = 0; x < s.width; ++x) {
                            const T a = source.at(x, y), b = target.at(x, y);
                            ASSERT_EQ(std::memcmp(&a, &b, sizeof a), 0) << "at " << x << ", " << y;
                        }
                });
            });
    });
}

TEST(CopyPixels, KeepsThePayloadOfASignallingNan)
{
    const uint32_t bits[3] = {0x7fa12345u, 0xff800001u, 0x7fc54321u};
    uint32_t target[6] = {};
    const image_layout apart{3, 1, 32, PixmatEncoding_Float, 0, 8, 24};
    copy_pixels(apart, target, packed_layout(3, 1, 32, PixmatEncoding_Float), bits);
    EXPECT_EQ(target[0], bits[0]);
    EXPECT_EQ(target[2], bits[1]);
    EXPECT_EQ(target[4], bits[2]);
}

TEST(CopyPixels, RefusesInOrderAndBeforeAnythingIsWritten)
{
    const auto layout = [](int width, int height, int bits,
                           PixmatEncoding encoding = PixmatEncoding_Unsigned) {
        return packed_layout(width, height, bits, encoding);
    };
    struct {
        image_layout target, source;
        const char* text;
    } const cases[] = {
        {layout(1, 1, 17), layout(2, 2, 8), "Unsupported Pixmat encoding/bits"},
        {layout(1, 1, 8), layout(2, 2, 8, PixmatEncoding_Data), "Unsupported Pixmat encoding/bits"},
        {layout(1, 1, 8), layout(2, 2, 8, PixmatEncoding_Signed),
         "target pixel_type and source pixel_type not identical"},
        {layout(1, 1, 24, PixmatEncoding_RGB), layout(1, 1, 24, PixmatEncoding_BGR),
         "target pixel_type and source pixel_type not identical"},
        {layout(1, 1, 8), layout(2, 2, 8), "target width and source width not identical"},
        {layout(2, 1, 8), layout(2, 2, 8), "target height and source height not identical"},
    };
    for (const auto& c : cases) {
        uint8_t target[16] = {}, source[16] = {1, 1, 1, 1, 1, 1, 1, 1};
        expect_throws<std::invalid_argument>([&] { copy_pixels(c.target, target, c.source, source); },
                                             c.text);
        EXPECT_EQ(std::count(target, target + 16, 0), 16) << c.text;
    }
}

TEST(CopyPixels, ComparesTypesNotNominalBits)
{
    const uint16_t source[2] = {5, 6};
    uint16_t target[2] = {};
    copy_pixels(packed_layout(2, 1, 16, PixmatEncoding_Unsigned), target,
                packed_layout(2, 1, 12, PixmatEncoding_Unsigned), source);
    EXPECT_EQ(target[0], 5);
    EXPECT_EQ(target[1], 6);
}
