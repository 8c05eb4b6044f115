#include "pixel/rows.h"

#include "support/cases.h"

using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;
using namespace Qor::Luxar::ZELT::Test;
using namespace Qor::Luxar::ZELT::ZELT_LEVEL;

TEST(Rows, ReadAndWriteThePixelsOfEveryLayout)
{
    for_each_case<uint8_t, int32_t, double, colour_24, complex_pixel<float>>(
        []<class T>(const test_case<T>& c) {
            const auto out = c.run([&](memory_2d src, memory_2d dst) {
                with_rows<T>(src, [&](auto from) {
                    with_rows<T>(dst, [&](auto to) {
                        for (int y = 0; y < to.height; ++y)
                            for (int x = 0; x < to.width; ++x) to[y][x] = from[from.height - 1 - y][x];
                    });
                });
            });
            expect_equal(out, [&](int x, int y) { return c.input.at(x, c.input.height() - 1 - y); });
        });
}

TEST(Rows, ArePickedAsContiguousByTheXStrideAlone)
{
    const auto is_contiguous = []<class R>(R) {
        return std::is_same_v<R, contiguous_rows<typename R::value_type>>;
    };
    for_each_layout([&](memory_layout l) {
        using enum memory_layout;
        const bool apart = l == mirrored || l == transposed || l == every_second;
        const test_image<int16_t> image({5, 4}, l);
        const test_image<float> packed_image({5, 4}, packed);
        EXPECT_EQ((with_rows<int16_t>(image.view(), is_contiguous)), !apart);
        const auto both = [&](auto a, auto b) { return is_contiguous(a) && is_contiguous(b); };
        EXPECT_EQ((with_rows<int16_t, float>(image.view(), packed_image.view(), both)), !apart);
        EXPECT_EQ((with_rows<float, int16_t>(packed_image.view(), image.view(), both)), !apart);
    });
}

TEST(Rows, AssignPixelsNotReferences)
{
    test_image<int16_t> image({2, 1});
    image.set(0, 0, 7);
    with_rows<int16_t>(image.view(), [](auto rows) { rows[0][1] = rows[0][0]; });
    image.set(0, 0, 8);
    EXPECT_EQ(image.at(1, 0), 7);
}
