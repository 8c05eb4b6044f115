#include "pixel/pixel_type.h"

#include "support/cases.h"

#include <map>
#include <set>
#include <utility>

using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;
using namespace Qor::Luxar::ZELT::Test;

namespace {

// Every declaration that has a pixel type: encoding, bits, type.
constexpr int known[][3] = {
    {0, 8, 0},     {0, 9, 1},     {0, 10, 1},  {0, 11, 1},   {0, 12, 1},   {0, 13, 1},   {0, 14, 1},
    {0, 15, 1},    {0, 16, 1},    {0, 32, 2},  {0, 64, 3},   {1, 8, 4},    {1, 9, 5},    {1, 10, 5},
    {1, 11, 5},    {1, 12, 5},    {1, 13, 5},  {1, 14, 5},   {1, 15, 5},   {1, 16, 5},   {1, 32, 6},
    {1, 64, 7},    {2, 32, 8},    {2, 64, 9},  {10, 64, 10}, {12, 64, 11}, {17, 64, 12}, {10, 128, 13},
    {12, 128, 14}, {17, 128, 15}, {3, 24, 16}, {4, 32, 17},  {5, 24, 18},  {13, 32, 19},
};

// The types that a switch calls its body for, each with the size of the storage that it names; else the text.
template <class Switch>
std::map<int, size_t> accepted(Switch&& switch_on, std::set<std::string>& texts)
{
    std::map<int, size_t> seen;
    for (int i = -1; i <= pixel_type_count; ++i) try {
            switch_on(static_cast<pixel_type>(i), [&]<class T>(pixel<T>) { seen[i] = sizeof(T); });
        } catch (const std::exception& e) {
            texts.insert(std::string(typeid(e) == typeid(std::runtime_error) ? "runtime: " : "argument: ") +
                         e.what());
        }
    return seen;
}

const std::map<int, size_t> real_types{{0, 1}, {1, 2}, {2, 4}, {4, 1}, {5, 2}, {6, 4}, {8, 4}, {9, 8}};

} // namespace

TEST(PixelType, FollowsTheTableOfDeclarations)
{
    std::map<int, int> by_key; // encoding * 256 + bits
    for (const auto& k : known) by_key[k[0] * 256 + k[1]] = k[2];
    for (int encoding = -2; encoding <= 20; ++encoding)
        for (int bits = -8; bits <= 300; ++bits) {
            SCOPED_TRACE("encoding " + std::to_string(encoding) + ", bits " + std::to_string(bits));
            const auto map = [&] { return GetPixelType(static_cast<PixmatEncoding>(encoding), bits); };
            // From 256 on, bits run into the next encoding: the key alone counts.
            const auto found = by_key.find(encoding * 256 + bits);
            if (found != by_key.end())
                EXPECT_EQ(static_cast<int>(map()), found->second);
            else
                expect_throws<std::invalid_argument>(map, "Unsupported Pixmat encoding/bits");
        }
}

TEST(PixelType, RefusesDeclarationsFarOutside)
{
    for (const int encoding : {INT32_MIN, INT32_MAX, 256, -256, 1 << 24})
        for (const int bits : {INT32_MIN, INT32_MAX, 0, 8, 1 << 24})
            expect_throws<std::invalid_argument>(
                [&] { GetPixelType(static_cast<PixmatEncoding>(encoding), bits); },
                "Unsupported Pixmat encoding/bits");
}

TEST(PixelType, TellsItsEncodingAndStorageBits)
{
    constexpr int bits[] = {8, 16, 32, 64, 8, 16, 32, 64, 32, 64, 64, 64, 64, 128, 128, 128, 24, 32, 24, 32};
    constexpr int encodings[] = {0, 0, 0, 0, 1, 1, 1, 1, 2, 2, 10, 12, 17, 10, 12, 17, 3, 4, 5, 13};
    for (int i = 0; i < 20; ++i) {
        EXPECT_EQ(GetPixmatBits(static_cast<pixel_type>(i)), bits[i]) << "type " << i;
        EXPECT_EQ(GetPixmatEncoding(static_cast<pixel_type>(i)), encodings[i]) << "type " << i;
    }
    for (const int i : {20, 21, -1, INT32_MAX, INT32_MIN}) {
        const auto type = static_cast<pixel_type>(i);
        expect_throws<std::invalid_argument>([&] { GetPixmatBits(type); },
                                             "GetPixmatBits: unknown pixel_type");
        expect_throws<std::invalid_argument>([&] { GetPixmatEncoding(type); },
                                             "GetPixmatEncoding: unknown pixel_type");
    }
}

TEST(PixelType, EncodingsHaveNames)
{
    constexpr const char* names[] = {
        "Unsigned",
        "Signed",
        "Float",
        "RGB",
        "RGBA",
        "BGR",
        "Reserved3",
        "Reserved4",
        "Data",
        "Reserved1",
        "Complex_Float",
        "Reserved2",
        "Complex_Float_Half_Even",
        "BGRA",
        "Float_Vector2D",
        "Float_Vector3D",
        "Float_Vector4D",
        "Complex_Float_Half_Odd",
    };
    for (int i = 0; i < 18; ++i)
        EXPECT_STREQ(GetPixmatEncodingName(static_cast<PixmatEncoding>(i)), names[i]);
    for (const int i : {18, 19, -1, INT32_MAX, INT32_MIN})
        EXPECT_STREQ(GetPixmatEncodingName(static_cast<PixmatEncoding>(i)), "Unknown_Encoding") << i;
}

TEST(PixelType, HalfComplexStandsForAFullWidth)
{
    for (int encoding = 0; encoding < 18; ++encoding)
        for (const int width : {1, 2, 5, 1000}) {
            const image_layout layout{width, 1, 64, static_cast<PixmatEncoding>(encoding), 0, 8, 8};
            const int full = encoding == 12 ? 2 * width - 2 : encoding == 17 ? 2 * width - 1 : width;
            EXPECT_EQ(full_width(layout), full) << "encoding " << encoding << ", width " << width;
            EXPECT_EQ(is_half_complex(layout.encoding), encoding == 12 || encoding == 17);
        }
    // Evaluated by the compiler, which takes no overflow.
    constexpr image_layout widest{INT32_MAX, 1, 64, PixmatEncoding_Complex_Float_Half_Odd, 0, 8, 8};
    static_assert(full_width(widest) == -3);
}

TEST(PixelType, StandardSwitchTakesTheEightRealTypes)
{
    std::set<std::string> texts;
    EXPECT_EQ(accepted([](pixel_type t, auto body) { switch_scalar(t, body); }, texts), real_types);
    EXPECT_EQ(texts, std::set<std::string>{"runtime: SWITCH_PIXELENCODING: Format not supported"});
}

TEST(PixelType, ColourSwitchTakesThreeByteColoursInOneInstantiation)
{
    auto expected = real_types;
    expected[16] = expected[18] = 3;
    std::set<std::string> texts;
    EXPECT_EQ(accepted([](pixel_type t, auto body) { switch_scalar_or_colour(t, body); }, texts), expected);
    EXPECT_EQ(texts, std::set<std::string>{"runtime: SWITCH_PIXELENCODING: Format not supported"});
}

TEST(PixelType, FamilySwitchFailsWithItsOwnText)
{
    std::set<std::string> texts;
    const auto gauss = [](pixel_type t, auto body) {
        switch_scalar(t, "Gauss: unsupported pixel type", body);
    };
    EXPECT_EQ(accepted(gauss, texts), real_types);
    EXPECT_EQ(texts, std::set<std::string>{"argument: Gauss: unsupported pixel type"});
}

TEST(PixelType, SwitchNamesTheStorageThatTheTypeHas)
{
    for (const auto& [i, bytes] : real_types)
        switch_scalar(static_cast<pixel_type>(i), [&, type = i]<class T>(pixel<T>) {
            EXPECT_EQ(static_cast<int>(default_type<T>()), type);
        });
}
