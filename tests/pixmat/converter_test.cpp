#include "pixel_oracle.h"
#include "pixmat_objects.h"

namespace Qor::Luxar::Test {
namespace {

using ZELT::Test::enough_failures;
using ZELT::Test::memory_layout;
using ZELT::Test::pixel_memory;
using ZELT::Test::rotated;
using ZELT::Test::step;

enum class way { recode, cast };

struct operand {
    operand(pixel_type t, int depth, size s, memory_layout l)
        : type(t), memory(s, l, GetPixmatBits(t) / 8), layout{s.width,
                                                              s.height,
                                                              depth,
                                                              GetPixmatEncoding(t),
                                                              static_cast<int32_t>(memory.offset),
                                                              static_cast<int32_t>(memory.x_stride),
                                                              static_cast<int32_t>(memory.y_stride)}
    {
    }
    void fill(generator& random)
    {
        for (int y = 0; y < layout.height; ++y)
            for (int x = 0; x < layout.width; ++x) write_random(type, memory.at(x, y), random);
    }

    pixel_type type;
    pixel_memory memory;
    image_layout layout;
};

HRESULT convert(way w, const operand& from, const operand& to, const rectangle* area = nullptr,
                const coordinate<int32_t>* point = nullptr)
{
    const auto converter = create<IPixmatConverter>(CLSID_PixmatConverter);
    const auto method = w == way::recode ? &IPixmatConverter::ConvertRecode : &IPixmatConverter::ConvertCast;
    return (converter.get()->*method)(from.layout, from.memory.data(), to.layout, to.memory.data(), area,
                                      point);
}

/// The target is what the oracle makes of the source: the area's pixels from `point` on, all others as before.
void expect_converted(way w, const operand& from, const operand& to, const operand& before, rectangle area,
                      coordinate<int32_t> point)
{
    for (int y = 0; y < to.layout.height; ++y)
        for (int x = 0; x < to.layout.width; ++x) {
            uint8_t expected[16];
            std::memcpy(expected, before.memory.at(x, y), static_cast<size_t>(GetPixmatBits(to.type) / 8));
            const int64_t u = int64_t{x} - point.x + area.left, v = int64_t{y} - point.y + area.top;
            if (u >= area.left && u < area.right && v >= area.top && v < area.bottom) {
                sample s = read_sample(from.type, from.memory.at(u, v));
                const auto oracle = w == way::recode ? recode_sample : cast_sample;
                if (oracle(from.type, to.type, to.layout.bits, s)) write_sample(to.type, expected, s);
            }
            if (!same_pixel(to.type, to.memory.at(x, y), expected)) {
                ADD_FAILURE() << "pixel " << x << ", " << y;
                return;
            }
        }
    EXPECT_FALSE(to.memory.damage());
}

void check_all_pairs(way w)
{
    generator random(1);
    int pairs = 0;
    for (int a = 0; a < pixel_type_count; ++a)
        for (int b = 0; b < pixel_type_count && !enough_failures(); ++b) {
            const auto from_type = static_cast<pixel_type>(a);
            const auto to_type = static_cast<pixel_type>(b);
            const int full = GetPixmatBits(to_type);
            sample any;
            const auto oracle = w == way::recode ? recode_sample : cast_sample;
            const bool mapped = oracle(from_type, to_type, full, any);
            pairs += mapped;
            for (int turn = 0; turn < ZELT::Test::memory_layout_count; ++turn)
                for (const int depth : {full, 12, 9}) {
                    if (depth != full && to_type != pixel_type::unsigned_16 &&
                        to_type != pixel_type::signed_16)
                        continue;
                    const size s = turn % 2 ? size{17, 3} : size{300, 2}; // beyond one block
                    const auto layout = static_cast<memory_layout>(turn);
                    operand from(from_type, GetPixmatBits(from_type), s, layout);
                    operand to(to_type, depth, s, turn ? rotated(layout, a + b) : layout);
                    from.fill(random);
                    to.fill(random);
                    const operand before = to;
                    step("types " + std::to_string(a) + " to " + std::to_string(b) + ", bits " +
                             std::to_string(depth) + ", layout " + std::to_string(turn),
                         [&] {
                             EXPECT_EQ(convert(w, from, to), mapped ? S_OK : E_NOTIMPL);
                             const rectangle area = mapped ? rectangle{0, 0, s.width, s.height} : rectangle{};
                             expect_converted(w, from, to, before, area, {});
                         });
                }
        }
    // Counted by hand: numbers and complex, half-complex and colour among themselves.
    EXPECT_EQ(pairs, w == way::recode ? 12 * 12 + 2 * 4 + 4 * 4 + 2 * 4 * 10 : 12 * 12 + 2 * 4 + 4);
}

TEST(Converter, RecodesAllPairsOfTypes) { check_all_pairs(way::recode); }
TEST(Converter, CastsAllPairsOfTypes) { check_all_pairs(way::cast); }

TEST(Converter, ConvertsTheAreaToThePoint)
{
    generator random(2);
    struct {
        rectangle area;
        coordinate<int32_t> point;
        HRESULT answer;
    } const cases[] = {
        {{0, 0, 7, 5}, {0, 0}, S_OK},
        {{2, 1, 5, 4}, {6, 3}, S_OK},
        {{6, 4, 7, 5}, {8, 5}, S_OK},
        {{2, 1, 5, 4}, {7, 3}, E_INVALIDARG},
        {{2, 1, 5, 4}, {6, 4}, E_INVALIDARG},
        {{2, 1, 5, 4}, {-1, 0}, E_INVALIDARG},
        {{2, 1, 5, 4}, {0, -1}, E_INVALIDARG},
        {{2, 1, 5, 4}, {INT32_MAX, INT32_MAX}, E_INVALIDARG},
        {{0, 0, 8, 5}, {0, 0}, E_INVALIDARG},
        {{0, 0, 7, 6}, {0, 0}, E_INVALIDARG},
        {{-1, 0, 3, 5}, {0, 0}, E_INVALIDARG},
        {{0, -1, 3, 5}, {0, 0}, E_INVALIDARG},
        {{INT32_MIN, INT32_MIN, INT32_MAX, INT32_MAX}, {0, 0}, E_INVALIDARG},
        {{3, 1, 3, 4}, {0, 0}, S_OK}, // empty
        {{5, 1, 2, 4}, {0, 0}, S_OK}, // swapped
        {{1, 4, 3, 2}, {0, 0}, S_OK},
        {{INT32_MAX, 0, INT32_MIN, 5}, {0, 0}, S_OK},
        {{9, 9, 9, 9}, {99, 99}, S_OK}, // empty, wherever it is
    };
    for (const way w : {way::recode, way::cast})
        for (const auto& c : cases) {
            operand from(pixel_type::signed_16, 16, {7, 5}, memory_layout::transposed);
            operand to(pixel_type::float_32, 32, {9, 6}, memory_layout::flipped);
            from.fill(random);
            to.fill(random);
            const operand before = to;
            step("area " + std::to_string(c.area.left) + ' ' + std::to_string(c.area.top) + ' ' +
                     std::to_string(c.area.right) + ' ' + std::to_string(c.area.bottom),
                 [&] {
                     EXPECT_EQ(convert(w, from, to, &c.area, &c.point), c.answer);
                     expect_converted(w, from, to, before, c.answer == S_OK ? c.area : rectangle{}, c.point);
                 });
        }
}

TEST(Converter, RefusesWhatItCannotRead)
{
    const auto converter = create<IPixmatConverter>(CLSID_PixmatConverter);
    uint8_t pixels[64] = {};
    const image_layout good = packed_layout(2, 2, 8, PixmatEncoding_Unsigned);
    for (const auto& [encoding, bits] : {std::pair{PixmatEncoding_Data, 8},
                                         {PixmatEncoding_Unsigned, 7},
                                         {PixmatEncoding_Signed, 17},
                                         {PixmatEncoding_Float_Vector2D, 64}}) {
        const image_layout bad = packed_layout(2, 2, bits, encoding);
        EXPECT_EQ(converter->ConvertRecode(good, pixels, bad, pixels, nullptr, nullptr), E_NOTIMPL);
        EXPECT_EQ(converter->ConvertCast(bad, pixels, bad, pixels, nullptr, nullptr), E_NOTIMPL);
    }
    EXPECT_EQ(converter->ConvertRecode(good, nullptr, good, pixels, nullptr, nullptr), E_POINTER);
    EXPECT_EQ(converter->ConvertCast(good, pixels, good, nullptr, nullptr, nullptr), E_POINTER);
    const rectangle empty{};
    EXPECT_EQ(converter->ConvertCast(good, nullptr, good, nullptr, &empty, nullptr), S_OK);
    const image_layout negative{-5, 2, 8, PixmatEncoding_Unsigned, 0, 1, 1};
    EXPECT_EQ(converter->ConvertRecode(negative, pixels, good, pixels, nullptr, nullptr), S_OK) << "empty";
    EXPECT_EQ(converter->Reserved1(), E_NOTIMPL);
    EXPECT_EQ(converter->Reserved2(), E_NOTIMPL);
}

TEST(Converter, WorksInPlaceAndFromRepeatedPixels)
{
    const auto converter = create<IPixmatConverter>(CLSID_PixmatConverter);
    std::vector<float> pixels(600);
    for (size_t i = 0; i < pixels.size(); ++i) pixels[i] = static_cast<float>(i) + 0.5f;
    const image_layout floats = packed_layout(600, 1, 32, PixmatEncoding_Float);
    const image_layout longs = packed_layout(600, 1, 32, PixmatEncoding_Signed);
    ASSERT_EQ(converter->ConvertRecode(floats, pixels.data(), longs, pixels.data(), nullptr, nullptr), S_OK);
    int32_t last = 0;
    std::memcpy(&last, &pixels[599], sizeof last);
    EXPECT_EQ(last, 600);

    const uint16_t one = 700;
    const image_layout repeated{9, 3, 16, PixmatEncoding_Unsigned, 0, 0, 0};
    std::vector<double> spread(27);
    ASSERT_EQ(converter->ConvertCast(repeated, &one, packed_layout(9, 3, 64, PixmatEncoding_Float),
                                     spread.data(), nullptr, nullptr),
              S_OK);
    EXPECT_EQ(spread, std::vector<double>(27, 700.0));
}

} // namespace
} // namespace Qor::Luxar::Test
