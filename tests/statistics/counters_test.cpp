#include "frame/image_access.h"
#include "frame/value_objects.h"
#include "statistics/kernels/pixel_counters.h"
#include "statistics/statistics.h"
#include "support/cases.h"
#include "support/failures.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

using namespace Statistics;

/// Calls the body with each pixel as a double.
template <class T, class Body>
void each(const test_image<T>& image, Body&& body)
{
    const memory_2d view = image.view();
    for (int y = 0; y < view.height; ++y)
        for (int x = 0; x < view.width; ++x) body(x, y, static_cast<double>(image.at(x, y)));
}

TEST(Counters, CountLikeADefinitionPixelByPixel)
{
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double>(
        values::special, []<class T>(const test_case<T>& c) {
            const memory_2d src = c.input.view();
            using limits = std::numeric_limits<double>;
            for (const double value : {0.0, 7.5, -1.0, -128.5, 255.0, 4294967295.0, 1e300, limits::infinity(),
                                       -limits::infinity(), limits::quiet_NaN()}) {
                int64_t less = 0, equal = 0, more = 0, inside = 0, up = 0;
                each(c.input, [&](int, int, double v) {
                    if (!(v >= value))
                        ++less;
                    else if (v > value)
                        ++more;
                    else
                        ++equal;
                    inside += v >= value && !(v > 100.9) ? 1 : 0;
                    up += v >= -2.5 && !(v > value) ? 1 : 0;
                });
                const comparison found = compare_pixels(src, value);
                EXPECT_EQ(found.less, less);
                EXPECT_EQ(found.equal, equal);
                EXPECT_EQ(found.more, more);
                EXPECT_EQ(count_range(src, value, 100.9), inside) << value;
                EXPECT_EQ(count_range(src, -2.5, value), up) << value;
            }
        });
}

TEST(Counters, DoNotWrapInLongRows)
{
    test_image<uint8_t> image({70000, 2});
    image.fill([](int, int) { return uint8_t{9}; });
    EXPECT_EQ(compare_pixels(image.view(), 9).less, 0);
    EXPECT_EQ(compare_pixels(image.view(), 10).less, 140000);
    EXPECT_EQ(count_range(image.view(), 9, 9), 140000);
}

TEST(Counters, BoxesAndMomentsLikeTheDefinition)
{
    for_each_case<uint8_t, int16_t, uint32_t, int32_t, float, double>(
        values::plain, []<class T>(const test_case<T>& c) {
            // Mostly zeros, so that edges of the box lie anywhere.
            test_image<T> image = c.input;
            generator random(image.width() + 100 * image.height());
            image.fill([&](int x, int y) { return random() % 30 == 0 ? c.input.at(x, y) : T{0}; });
            const memory_2d src = image.view();
            rectangle box{src.width, src.height, 0, 0};
            double sum21 = 0, sum03 = 0;
            each(image, [&](int x, int y, double v) {
                sum21 += static_cast<double>(x) * x * std::pow(y, 1) * v;
                sum03 += std::pow(x, 0) * (static_cast<double>(y) * y * y) * v;
                if (v == 0 || std::isnan(v)) return;
                box = {std::min(box.left, x), std::min(box.top, y), std::max(box.right, x),
                       std::max(box.bottom, y)};
            });
            if (box.right) ++box.right;
            if (box.bottom) ++box.bottom;
            EXPECT_EQ(bounding_box(src), box);
            EXPECT_EQ(moment(src, 2, 1), sum21);
            EXPECT_EQ(moment(src, 0, 3), sum03);
        });
}

/// An image with one pixel that is not 0.
rectangle box_of_single(int x, int y)
{
    test_image<int16_t> image({5, 4}, memory_layout::padded);
    image.fill([=](int i, int j) { return static_cast<int16_t>(i == x && j == y ? -3 : 0); });
    return bounding_box(image.view());
}

TEST(Counters, BoxesEndAtZeroInTheFirstRowAndColumn)
{
    EXPECT_EQ(box_of_single(0, 0), (rectangle{0, 0, 0, 0}));
    EXPECT_EQ(box_of_single(3, 2), (rectangle{3, 2, 4, 3}));
    EXPECT_EQ(box_of_single(2, 0), (rectangle{2, 0, 3, 0}));
    EXPECT_EQ(box_of_single(0, 2), (rectangle{0, 2, 0, 3}));
    EXPECT_EQ(box_of_single(-1, -1), (rectangle{5, 4, 0, 0}));
}

TEST(Counters, MomentsTakeAnyExponent)
{
    const uint8_t ones[6] = {1, 1, 1, 1, 1, 1};
    const memory_2d src =
        view_of(packed_layout(3, 2, 8, PixmatEncoding_Unsigned), const_cast<uint8_t*>(ones));
    EXPECT_EQ(moment(src, 0, 0), 6); // 0^0 is 1
    EXPECT_EQ(moment(src, 3, 0), 2 * (0 + 1 + 8));
    EXPECT_EQ(moment(src, -1, 0), std::numeric_limits<double>::infinity());
}

/// An image of parts (pairs for complex types) read with a pixel type.
template <class Part>
memory_2d parts_of(std::vector<Part>& parts, pixel_type type)
{
    const int32_t pixels = static_cast<int32_t>(parts.size() * sizeof(Part) * 8) / GetPixmatBits(type);
    return view_of(packed_layout(pixels, 1, GetPixmatBits(type), GetPixmatEncoding(type)), parts.data());
}

TEST(Counters, NanAndFiniteLookAtBothParts)
{
    constexpr float nan = std::numeric_limits<float>::quiet_NaN();
    constexpr float inf = std::numeric_limits<float>::infinity();
    const struct {
        std::vector<float> parts;
        bool real_nan, real_finite, complex_nan, complex_finite;
    } cases[] = {{{1, 2, 3, 4}, false, true, false, true},
                 {{1, 2, nan, 4}, true, false, false, false},
                 {{1, 2, nan, nan}, true, false, true, false},
                 {{1, -inf, 3, 4}, false, false, false, false}};
    for (const auto& c : cases) {
        std::vector<float> single = c.parts;
        std::vector<double> wide(c.parts.begin(), c.parts.end());
        EXPECT_EQ(has_nan(parts_of(single, pixel_type::float_32)), c.real_nan);
        EXPECT_EQ(is_finite(parts_of(wide, pixel_type::float_64)), c.real_finite);
        for (const pixel_type t :
             {pixel_type::complex_32, pixel_type::half_even_32, pixel_type::half_odd_32}) {
            EXPECT_EQ(has_nan(parts_of(single, t)), c.complex_nan);
            EXPECT_EQ(is_finite(parts_of(single, t)), c.complex_finite);
        }
        for (const pixel_type t :
             {pixel_type::complex_64, pixel_type::half_even_64, pixel_type::half_odd_64}) {
            EXPECT_EQ(has_nan(parts_of(wide, t)), c.complex_nan);
            EXPECT_EQ(is_finite(parts_of(wide, t)), c.complex_finite);
        }
        EXPECT_FALSE(has_nan(parts_of(single, pixel_type::unsigned_32)));
        EXPECT_TRUE(is_finite(parts_of(single, pixel_type::signed_64)));
    }
}

TEST(Counters, RefuseOtherTypesAndBadAreas)
{
    const auto s = make<CStatistics>();
    com_ptr<IPixmat2> colour;
    com_ptr<IPixmat2> grey;
    ASSERT_EQ(CreateImageFromLayout(packed_layout(2, 2, 24, PixmatEncoding_RGB), colour.put()), S_OK);
    ASSERT_EQ(CreateImageFromLayout(packed_layout(2, 2, 8, PixmatEncoding_Unsigned), grey.put()), S_OK);
    LONG n = 0;
    double d = 0;
    VARIANT_BOOL b = 0;
    com_ptr<IRectangle> box;
    expect_fails(E_INVALIDARG, L"Count: unsupported pixel type",
                 [&] { return s->Count(colour.get(), 1, 1, nullptr, &n); });
    expect_fails(E_INVALIDARG, L"CountRange: unsupported pixel type",
                 [&] { return s->CountRange(colour.get(), 1, 1, nullptr, &n); });
    expect_fails(E_INVALIDARG, L"Moment: unsupported pixel type",
                 [&] { return s->Moment(colour.get(), 1, 1, nullptr, &d); });
    expect_fails(E_INVALIDARG, L"BoundingBox: unsupported pixel type",
                 [&] { return s->BoundingBox(colour.get(), box.put()); });
    expect_fails(E_INVALIDARG, L"IsNaN: unsupported pixel type", [&] { return s->IsNaN(colour.get(), &b); });
    expect_fails(E_INVALIDARG, L"IsFinite: unsupported pixel type",
                 [&] { return s->IsFinite(colour.get(), &b); });
    expect_fails(E_INVALIDARG, L"null IPixmat2", [&] { return s->Count(nullptr, 1, 1, nullptr, &n); });
    expect_fails(E_POINTER, L"", [&] { return s->Count(grey.get(), 1, 1, nullptr, nullptr); });
    expect_fails(E_POINTER, L"", [&] { return s->BoundingBox(grey.get(), nullptr); });
    for (const rectangle& r :
         {rectangle{0, 0, 3, 2}, rectangle{-1, 0, 1, 1}, rectangle{0, -1, 1, 1}, rectangle{1, 0, 0, 1}}) {
        com_ptr<IRectangle> area;
        ASSERT_EQ(Common::MakeRectangle(r.left, r.top, r.right, r.bottom, area.put()), S_OK);
        expect_fails(E_INVALIDARG, L"memory_2d::make_view: invalid rectangle",
                     [&] { return s->Count(grey.get(), 1, 1, area.get(), &n); });
        expect_fails(E_INVALIDARG, L"memory_2d::make_view: invalid rectangle",
                     [&] { return s->Moment(grey.get(), 1, 1, area.get(), &d); });
    }
}

TEST(Counters, CompareBitsAddUp)
{
    const auto s = make<CStatistics>();
    com_ptr<IPixmat2> image;
    ASSERT_EQ(CreateImageFromLayout(packed_layout(5, 1, 32, PixmatEncoding_Float), image.put()), S_OK);
    {
        ImageWriteAccess access(image.get());
        const float pixels[5] = {1, 2, 2, 3, std::numeric_limits<float>::quiet_NaN()};
        std::memcpy(access.view().data, pixels, sizeof pixels);
        ASSERT_EQ(access.Commit(), S_OK);
    }
    const LONG counts[] = {3, 2, 2, 4, 1, 3, 3, 5}; // not equal, =, <, <=, >, >=, <>, all
    for (LONG compare = 0; compare < 8; ++compare) {
        LONG n = -1;
        EXPECT_EQ(s->Count(image.get(), 2, compare, nullptr, &n), S_OK);
        EXPECT_EQ(n, counts[compare]) << "compare " << compare;
    }
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
