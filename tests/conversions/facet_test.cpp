#include "conversions/conversions.h"

#include "frame/value_objects.h"
#include "pixmat/pixmat_objects.h"
#include "support/failures.h"
#include "support/foreign_image.h"

#include <optional>

namespace Qor::Luxar::ZELT::Test {
namespace {

using Luxar::Test::descriptor_of;
using Luxar::Test::layout_of;
using Luxar::Test::listener;
using Luxar::Test::new_image;
using Luxar::Test::open_read;
using Luxar::Test::open_write;

com_ptr<IRectangle> area(int32_t left, int32_t top, int32_t right, int32_t bottom)
{
    com_ptr<IRectangle> object;
    EXPECT_EQ(Common::MakeRectangle(left, top, right, bottom, object.put()), S_OK);
    return object;
}

com_ptr<ICoordinateInt> point(int32_t x, int32_t y)
{
    com_ptr<ICoordinateInt> object;
    EXPECT_EQ(Common::MakeCoordinateInt(x, y, object.put()), S_OK);
    return object;
}

com_ptr<IPixmat2> wrap(const image_layout& layout, void* data, bool read_only = false)
{
    com_ptr<IPixmat2> image;
    EXPECT_EQ(WrapPixmat(layout, data, read_only, nullptr, nullptr, image.put()), S_OK);
    return image;
}

template <class T>
com_ptr<IPixmat2> wrap(const test_image<T>& image)
{
    return wrap(image.layout(), image.data());
}

/// A row of 16-bit words that is said to have a nominal depth.
com_ptr<IPixmat2> row_of_words(std::vector<uint16_t>& words, int bits, bool read_only = false)
{
    return wrap(packed_layout(static_cast<int32_t>(words.size()), 1, bits, PixmatEncoding_Unsigned),
                words.data(), read_only);
}

using conversion_method = HRESULT (CConversions2::*)(IPixmat2*, IPixmat2*, IRectangle*,
                                                     ICoordinateInt*) noexcept;
using new_image_method = HRESULT (CConversions2::*)(IPixmat2*, IPixmatDescriptor*, IRectangle*,
                                                    ICoordinateInt*, IPixmat2**) noexcept;
constexpr conversion_method both[] = {&CConversions2::Recode, &CConversions2::Cast};
constexpr new_image_method both_new[] = {&CConversions2::RecodeEx, &CConversions2::CastEx};

class Conversions : public ::testing::Test {
protected:
    com_ptr<CConversions2> facet = make<CConversions2>();

    HRESULT recode(const com_ptr<IPixmat2>& dst, const com_ptr<IPixmat2>& src,
                   const com_ptr<IRectangle>& a = {}, const com_ptr<ICoordinateInt>& p = {})
    {
        return facet->Recode(dst.get(), src.get(), a.get(), p.get());
    }
    HRESULT cast(const com_ptr<IPixmat2>& dst, const com_ptr<IPixmat2>& src,
                 const com_ptr<IRectangle>& a = {}, const com_ptr<ICoordinateInt>& p = {})
    {
        return facet->Cast(dst.get(), src.get(), a.get(), p.get());
    }
};

TEST_F(Conversions, EqualFormatsAreCopiedWithoutTheConverter)
{
    using words = std::vector<uint16_t>;
    const struct {
        int from, to;
        com_ptr<IRectangle> area;
        com_ptr<ICoordinateInt> point;
        uint16_t want;
    } cases[] = {{12, 12, {}, {}, 60000}, // the converter would limit it to 12 bits
                 {16, 12, {}, {}, 60000}, // one pixel type, other depths
                 {12, 12, {}, point(0, 0), 4095},
                 {12, 12, area(0, 0, 2, 1), {}, 4095}};
    for (const auto& c : cases) {
        words src{60000, 7}, dst{1, 1};
        EXPECT_EQ(recode(row_of_words(dst, c.to), row_of_words(src, c.from), c.area, c.point), S_OK);
        EXPECT_EQ(dst, (words{c.want, 7}));
    }
}

TEST_F(Conversions, OtherSizesGoThroughTheConverter)
{
    std::vector<uint16_t> src{60000, 7}, dst{1, 1, 1};
    EXPECT_EQ(recode(row_of_words(dst, 12), row_of_words(src, 12)), S_OK);
    EXPECT_EQ(dst, (std::vector<uint16_t>{4095, 7, 1}));
}

TEST_F(Conversions, CastNeverLimits)
{
    std::vector<uint16_t> src{60000}, dst{1};
    EXPECT_EQ(cast(row_of_words(dst, 12), row_of_words(src, 12), {}, point(0, 0)), S_OK);
    EXPECT_EQ(dst[0], 60000);
    uint8_t byte = 0;
    EXPECT_EQ(cast(wrap(packed_layout(1, 1, 8, PixmatEncoding_Unsigned), &byte), row_of_words(src, 16)),
              S_OK);
    EXPECT_EQ(byte, 60000 & 255);
}

/// Source (3, 2) to (6, 6) lands at (1, 0), from any layout in any layout; nothing beside is touched.
template <class From, class To, class Mapped>
void expect_region_converted(const com_ptr<CConversions2>& facet, conversion_method how, Mapped&& mapped)
{
    for_each_layout([&](memory_layout l) {
        for (int turn = 0; turn < memory_layout_count; ++turn) {
            const auto src = random_image<From>({9, 7}, l, 5, values::plain);
            auto dst = random_image<To>({5, 6}, rotated(l, turn), 6, values::plain);
            const auto before = dst;
            EXPECT_EQ((facet.get()->*how)(wrap(dst).get(), wrap(src).get(), area(3, 2, 6, 6).get(),
                                          point(1, 0).get()),
                      S_OK);
            expect_equal(dst, [&](int x, int y) {
                const bool inside = x >= 1 && x < 4 && y < 4;
                return inside ? mapped(src.at(x + 2, y + 2)) : before.at(x, y);
            });
        }
    });
}

TEST_F(Conversions, RegionsLandWhereTheyShouldInEveryLayout)
{
    expect_region_converted<uint16_t, uint8_t>(facet, &CConversions2::Recode, [](uint16_t v) {
        return static_cast<uint8_t>(std::min<uint16_t>(v, 255));
    });
    expect_region_converted<int16_t, double>(facet, &CConversions2::Recode,
                                             [](int16_t v) { return static_cast<double>(v); });
    expect_region_converted<int16_t, uint8_t>(facet, &CConversions2::Cast,
                                              [](int16_t v) { return static_cast<uint8_t>(v); });
    expect_region_converted<float, int16_t>(facet, &CConversions2::Cast,
                                            [](float v) { return static_cast<int16_t>(v); });
}

TEST_F(Conversions, WholeImagesAreCopiedInEveryLayout)
{
    const auto expect_copied = [&]<class T>(pixel<T>) {
        for_each_layout([&](memory_layout l) {
            const auto src = random_image<T>({7, 5}, l, 5, values::extreme);
            auto dst = random_image<T>({7, 5}, rotated(l, 3), 6, values::extreme);
            EXPECT_EQ(recode(wrap(dst), wrap(src)), S_OK);
            expect_equal(dst, src);
        });
    };
    expect_copied(pixel<uint8_t>{});
    expect_copied(pixel<int16_t>{});
    expect_copied(pixel<uint64_t>{});
    expect_copied(pixel<float>{});
    expect_copied(pixel<double>{});
    expect_copied(pixel<complex_pixel<double>>{});
    expect_copied(pixel<colour_24>{});
    expect_copied(pixel<colour_32>{});
}

TEST_F(Conversions, ChangedRegionIsAnnounced)
{
    const struct {
        size target;
        com_ptr<IRectangle> area;
        com_ptr<ICoordinateInt> point;
        rectangle want;
    } cases[] = {{{8, 6}, {}, {}, {0, 0, 8, 6}},
                 {{20, 20}, {}, {}, {0, 0, 8, 6}},
                 {{20, 20}, area(2, 1, 5, 5), {}, {0, 0, 3, 4}},
                 {{20, 20}, area(2, 1, 5, 5), point(18, 10), {18, 10, 20, 14}},
                 {{20, 20}, {}, point(-3, 2), {0, 2, 5, 8}},
                 {{20, 20}, {}, point(25, 2), {25, 2, 20, 8}}};
    for (const conversion_method how : both)
        for (const auto& c : cases) {
            std::vector<rectangle> heard;
            const auto sink =
                make<listener>([&](IPixmat2*, const rectangle* r) { heard.push_back(r ? *r : rectangle{}); });
            const auto src = new_image(packed_layout(8, 6, 16, PixmatEncoding_Unsigned));
            const auto dst =
                new_image(packed_layout(c.target.width, c.target.height, 16, PixmatEncoding_Unsigned));
            dst->StartNotifications(sink.get(), PixmatEventMode_AfterCommit);
            EXPECT_EQ((facet.get()->*how)(dst.get(), src.get(), c.area.get(), c.point.get()), S_OK);
            EXPECT_EQ(heard, std::vector{c.want});
        }
}

TEST_F(Conversions, RefusalsLeaveTheTargetAndItsListenersAlone)
{
    const com_ptr<IPixmat2> nothing;
    std::vector<uint16_t> words{1, 2}, other_words{3, 4};
    const auto src = row_of_words(words, 16);
    const auto dst = row_of_words(other_words, 16);
    const auto wider = new_image(packed_layout(3, 1, 16, PixmatEncoding_Unsigned));
    const auto colour = new_image(packed_layout(2, 1, 24, PixmatEncoding_RGB));
    const auto half = new_image(packed_layout(2, 1, 64, PixmatEncoding_Complex_Float_Half_Even));
    const auto data = new_image(packed_layout(2, 1, 16, PixmatEncoding_Data));
    const auto small_data = new_image(packed_layout(1, 1, 16, PixmatEncoding_Data));
    const auto locked = row_of_words(other_words, 16, true);
    int heard = 0;
    const auto sink = make<listener>([&](IPixmat2*, const rectangle*) { ++heard; });
    for (const auto& image : {dst, data, colour, half})
        image->StartNotifications(sink.get(), PixmatEventMode_AfterCommit);
    const struct {
        com_ptr<IPixmat2> dst, src;
        com_ptr<IRectangle> area;
        HRESULT recode, cast;
        const wchar_t* recode_text;
    } cases[] = {
        {nothing, src, {}, E_INVALIDARG, E_INVALIDARG, L""},
        {dst, nothing, {}, E_INVALIDARG, E_INVALIDARG, L""},
        {dst, src, area(0, 0, 3, 1), E_INVALIDARG, E_INVALIDARG, L""}, // leaves the source
        {dst, src, area(1, 0, 0, 1), E_INVALIDARG, E_INVALIDARG, L""}, // swapped
        {dst, wider, {}, E_INVALIDARG, E_INVALIDARG, L""},             // does not fit the target
        {dst, half, {}, E_NOTIMPL, E_NOTIMPL, L""},                    // no such mapping
        {colour, src, area(0, 0, 2, 1), S_OK, E_NOTIMPL, L""},         // Recode has it, Cast has not
        {data, data, {}, E_INVALIDARG, E_NOTIMPL, L"Unsupported Pixmat encoding/bits"},
        {data, small_data, {}, E_NOTIMPL, E_NOTIMPL, L""}, // sizes are compared first
        {locked, src, {}, E_ACCESSDENIED, E_ACCESSDENIED, L""},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(&c - cases);
        heard = 0;
        expect_fails(c.cast, L"", [&] { return cast(c.dst, c.src, c.area); });
        EXPECT_EQ(heard, 0);
        expect_fails(c.recode, c.recode_text, [&] { return recode(c.dst, c.src, c.area); });
        EXPECT_EQ(heard, succeeded(c.recode) ? 1 : 0);
        EXPECT_EQ(other_words, (std::vector<uint16_t>{3, 4}));
    }
}

TEST_F(Conversions, LockTheSourceFirstAndReturnWhatImagesAnswer)
{
    using calls = std::vector<std::string>;
    uint16_t from = 0, to = 0;
    const auto layout = packed_layout(1, 1, 16, PixmatEncoding_Unsigned);
    const auto run = [&](failing at_source, failing at_target, HRESULT want, const calls& wanted) {
        const auto src = make<foreign_image>(layout, &from, at_source);
        const auto dst = make<foreign_image>(layout, &to, at_target);
        EXPECT_EQ(recode(dst, src), want);
        EXPECT_EQ(dst->calls, wanted);
    };
    using enum failing;
    run(nothing, nothing, S_OK, {"write", "commit", "release write"});
    run(nothing, commit, E_ACCESSDENIED, {"write", "commit", "release write"});
    run(nothing, open_write, E_ACCESSDENIED, {"write"});
    for (const failing where : {descriptor, descriptor_value, open_read})
        run(where, nothing, E_ACCESSDENIED, {});
    run(nothing, descriptor, E_ACCESSDENIED, {});
}

TEST_F(Conversions, NewImagesHaveTheDescribedLayout)
{
    std::vector<uint16_t> words{60000, 7, 9};
    const auto src = row_of_words(words, 16);
    const image_layout flipped{2, 3, 12, PixmatEncoding_Unsigned, 40, 4, -16};
    const uint16_t recoded[] = {7, 9}, cast_to_12[] = {60000, 7};
    const auto expect = [&](new_image_method how, const com_ptr<IRectangle>& a, const uint16_t(&want)[2]) {
        const auto descriptor = descriptor_of(flipped);
        com_ptr<IPixmat2> out;
        ASSERT_EQ((facet.get()->*how)(src.get(), descriptor.get(), a.get(), nullptr, out.put()), S_OK);
        EXPECT_EQ(layout_of(out.get()), flipped);
        descriptor->put_Width(99); // the image has a copy of it
        EXPECT_EQ(layout_of(out.get()), flipped);
        const uint8_t* first = open_read(out.get())->Data(0) + flipped.offset;
        for (int x = 0; x < 2; ++x) EXPECT_EQ(*reinterpret_cast<const uint16_t*>(first + 4 * x), want[x]);
        EXPECT_EQ(*reinterpret_cast<const uint16_t*>(first + flipped.y_stride), 0); // the other rows are zero
    };
    expect(&CConversions2::RecodeEx, area(1, 0, 3, 1), recoded);
    expect(&CConversions2::CastEx, area(0, 0, 2, 1), cast_to_12);
}

TEST_F(Conversions, NewImagesAreRefusedInOrderAndNotHandedOut)
{
    std::vector<uint16_t> words{1, 2};
    const auto src = row_of_words(words, 16);
    const auto good = descriptor_of(packed_layout(2, 1, 8, PixmatEncoding_Unsigned));
    const auto small = descriptor_of(packed_layout(1, 1, 8, PixmatEncoding_Unsigned));
    const auto negative = descriptor_of(packed_layout(-2, 1, 8, PixmatEncoding_Unsigned));
    const auto data = descriptor_of(packed_layout(2, 1, 16, PixmatEncoding_Data));
    for (const new_image_method how : both_new) {
        const auto call = [&](IPixmat2* in, IPixmatDescriptor* d, IPixmat2** out) {
            return (facet.get()->*how)(in, d, nullptr, nullptr, out);
        };
        com_ptr<IPixmat2> out;
        expect_fails(E_INVALIDARG, L"", [&] { return call(nullptr, good.get(), nullptr); });
        expect_fails(E_INVALIDARG, L"", [&] { return call(src.get(), nullptr, nullptr); });
        expect_fails(E_POINTER, L"", [&] { return call(src.get(), good.get(), nullptr); });
        expect_fails(E_INVALIDARG, L"", [&] { return call(src.get(), small.get(), out.put()); });
        expect_fails(E_INVALIDARG, L"", [&] { return call(src.get(), negative.get(), out.put()); });
        EXPECT_FALSE(out);
        EXPECT_TRUE(failed(call(src.get(), data.get(), out.put())));
        EXPECT_FALSE(out);
        EXPECT_EQ(call(src.get(), good.get(), out.put()), S_OK);
        EXPECT_TRUE(out);
    }
}

/// Images that share memory: each case against separate images of the same pixels.
TEST_F(Conversions, InPlaceEqualsSeparateImages)
{
    constexpr size_t bytes = 512;
    const auto u16 = PixmatEncoding_Unsigned;
    const struct {
        image_layout from, to;
        com_ptr<IRectangle> area;
        com_ptr<ICoordinateInt> point;
    } cases[] = {
        {packed_layout(9, 7, 16, u16), packed_layout(9, 7, 16, u16), {}, {}},
        {packed_layout(9, 7, 12, u16), packed_layout(9, 7, 12, u16), {}, point(0, 0)},
        {packed_layout(9, 7, 16, u16), packed_layout(9, 7, 16, u16), {}, point(1, 0)},
        {packed_layout(9, 7, 16, u16), packed_layout(9, 7, 16, u16), area(2, 3, 8, 7), point(3, 1)},
        {packed_layout(9, 7, 16, u16), packed_layout(9, 7, 16, u16), {}, point(-1, -2)},
        {packed_layout(9, 7, 16, u16), {9, 7, 16, u16, 6 * 18, 2, -18}, {}, {}}, // upside down
        {packed_layout(9, 7, 16, u16), packed_layout(9, 7, 8, u16), {}, {}},     // packed closer
        {packed_layout(9, 7, 8, u16), packed_layout(9, 7, 16, u16), {}, {}},     // packed wider
        {{9, 7, 16, u16, 0, 2, 18}, {9, 7, 16, u16, 18, 2, 18}, {}, {}},         // one row on
        {{4, 7, 16, u16, 0, 2, 18}, {4, 7, 12, u16, 8, 2, 18}, {}, {}},          // beside each other
    };
    for (const conversion_method how : both)
        for (const auto& c : cases) {
            SCOPED_TRACE(&c - cases);
            alignas(8) uint8_t shared[bytes], source[bytes], target[bytes];
            generator random(11);
            for (size_t i = 0; i < bytes; ++i)
                shared[i] = source[i] = target[i] = static_cast<uint8_t>(random());
            EXPECT_EQ((facet.get()->*how)(wrap(c.to, target).get(), wrap(c.from, source).get(), c.area.get(),
                                          c.point.get()),
                      S_OK);
            EXPECT_EQ((facet.get()->*how)(wrap(c.to, shared).get(), wrap(c.from, shared).get(), c.area.get(),
                                          c.point.get()),
                      S_OK);
            EXPECT_EQ(std::memcmp(shared, target, bytes), 0);
        }
    std::vector<uint16_t> words{60000, 7};
    const auto image = row_of_words(words, 12);
    EXPECT_EQ(recode(image, image, {}, point(1, 0)), S_OK);
    EXPECT_EQ(words, (std::vector<uint16_t>{60000, 4095}));
}

TEST_F(Conversions, FirstGenerationForwards)
{
    const auto first = make<CConversions>();
    std::vector<uint16_t> src{60000, 7}, dst{1, 1};
    EXPECT_EQ(first->Recode(row_of_words(dst, 12).get(), row_of_words(src, 16).get(), area(0, 0, 1, 1).get(),
                            point(1, 0).get()),
              S_OK);
    EXPECT_EQ(dst, (std::vector<uint16_t>{1, 4095}));
    com_ptr<IPixmat2> out;
    const auto descriptor = descriptor_of(packed_layout(2, 1, 8, PixmatEncoding_Unsigned));
    EXPECT_EQ(first->RecodeEx(row_of_words(src, 16).get(), descriptor.get(), nullptr, nullptr, out.put()),
              S_OK);
    EXPECT_EQ(open_read(out.get())->Data(0)[0], 255);
    EXPECT_EQ(first->RecodeEx(nullptr, descriptor.get(), nullptr, nullptr, out.put()), E_INVALIDARG);
    EXPECT_EQ(first->Cast(row_of_words(src, 16).get(), descriptor.get()), E_NOTIMPL);
    EXPECT_EQ(first->Cast(nullptr, nullptr), E_NOTIMPL);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
