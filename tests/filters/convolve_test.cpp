#include "filters/kernels/convolve.h"

#include "filter_cases.h"
#include "threads/cancellation.h"
#include "threads/single_threaded_pool.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

/// A kernel with its values and its anchor.
struct taps {
    std::vector<double> values;
    int32_t width, height;
    coordinate<int32_t> anchor;

    Filters::kernel_view view() const { return {values.data(), width, height}; }
};

/// Products of floats with values of 29 bits are exact. With 30 bits they are rounded; opposite ones still cancel where
/// pixels are alike, unless only one of them is rounded. Huge products leave the range of doubles.
enum class of { fractions, whole_numbers, small_sum, powers, opposites_29, opposites_30, huge };

taps kernel_of(size s, coordinate<int32_t> anchor, of kind)
{
    taps k{{}, s.width, s.height, anchor};
    generator random(static_cast<uint64_t>(s.width * 100 + s.height));
    const int count = s.width * s.height;
    for (int i = 0; i < count; ++i) {
        const double unit = std::ldexp(static_cast<double>(random() >> 11), -53);
        switch (kind) {
        case of::fractions: k.values.push_back(unit - 0.25); break;
        case of::whole_numbers: k.values.push_back(static_cast<double>(random() % 7) - 3); break;
        case of::small_sum:
            k.values.push_back((unit + 0.5) / count);
            break; // results stay in the range of the type
        case of::opposites_29: k.values.push_back((i % 2 == 0 ? 0x1.6789ABDp0 : -0x1.6789ABDp0)); break;
        case of::opposites_30: k.values.push_back((i % 2 == 0 ? 0x1.6789ABD8p0 : -0x1.6789ABD8p0)); break;
        case of::huge: k.values.push_back(std::ldexp(static_cast<double>(random() % 7) - 3, 1015)); break;
        case of::powers: k.values.push_back(std::ldexp(unit, static_cast<int>(random() % 80) - 40)); break;
        }
    }
    return k;
}

/// Sizes from one value to more than most of the test images have; anchors inside, at the corners, and far outside.
const std::vector<taps>& kernels()
{
    static const std::vector<taps> all{kernel_of({1, 1}, {0, 0}, of::fractions),
                                       kernel_of({3, 3}, {1, 1}, of::small_sum),
                                       kernel_of({3, 3}, {0, 2}, of::whole_numbers),
                                       kernel_of({3, 1}, {-100, 100}, of::fractions),
                                       kernel_of({2, 4}, {100, -100}, of::small_sum),
                                       kernel_of({1, 5}, {0, 2}, of::whole_numbers),
                                       kernel_of({5, 3}, {-1, 3}, of::powers),
                                       kernel_of({4, 2}, {3, 1}, of::small_sum),
                                       kernel_of({7, 7}, {3, 3}, of::small_sum),
                                       kernel_of({5, 5}, {2, 2}, of::small_sum),
                                       kernel_of({15, 9}, {7, 4}, of::small_sum),
                                       kernel_of({4, 1}, {-100, 0}, of::opposites_29),
                                       kernel_of({4, 1}, {100, 0}, of::opposites_30),
                                       kernel_of({3, 3}, {1, 1}, of::huge),
                                       kernel_of({6, 23}, {5, 0}, of::fractions),
                                       kernel_of({41, 3}, {2147483647, -2147483647}, of::fractions)};
    return all;
}

/// The sum of the definition, a product at a time.
template <class T>
T by_definition(const test_image<T>& in, int x, int y, const taps& k)
{
    const auto within = [](int64_t i, int length) {
        return static_cast<int>(std::clamp<int64_t>(i, 0, length - 1));
    };
    return each_channel<T>([&](auto channel) {
        double sum = 0.0;
        for (int j = 0; j < k.height; ++j)
            for (int i = 0; i < k.width; ++i) {
                const T p = in.at(within(int64_t{x} + k.anchor.x - i, in.width()),
                                  within(int64_t{y} + k.anchor.y - j, in.height()));
                const double product =
                    k.values[static_cast<size_t>(j * k.width + i)] * static_cast<double>(channel(p));
                sum = sum + product;
            }
        return saturated<decltype(channel(T{}))>(sum);
    });
}

/// Convolves an image with one or more of the kernels, by turns, on one of the pools.
template <class T>
void expect_definition(const test_case<T>& c)
{
    static const test_image<T>* previous = nullptr;
    static size_t turn = 0;
    if (std::exchange(previous, &c.input) != &c.input) ++turn; // the same for all levels
    const taps& k = kernels()[turn * 5 % kernels().size()];
    const auto out = c.run([&](memory_2d src, memory_2d dst) {
        Filters::convolve(src, k.view(), k.anchor, dst, pool_of(static_cast<int>(turn / 3)));
    });
    const ::testing::ScopedTrace trace(
        __FILE__, __LINE__, "kernel " + std::to_string(k.width) + " x " + std::to_string(k.height));
    expect_equal(out, [&](int x, int y) { return by_definition(c.input, x, y, k); });
}

TEST(Convolve, IsTheSumOfTheDefinitionForEveryType)
{
    for_each_case<uint8_t, uint16_t, uint32_t, int8_t, int16_t, int32_t, float, double, colour_24>(
        []<class T>(const test_case<T>& c) { expect_definition(c); });
}

TEST(Convolve, IsTheSumOfTheDefinitionForFloatsOfEveryKind)
{
    for_each_case<float, double>(values::special,
                                 []<class T>(const test_case<T>& c) { expect_definition(c); });
}

/// Larger images, whose rows meet in every worker, with every kernel and pool.
template <class T>
void expect_definition_of_an_image(values kind)
{
    const auto in = random_image<T>({61, 47}, memory_layout::padded, 5, kind);
    for_each_level([&](level) {
        for (const taps& k : kernels())
            for (int workers = 0; workers < 4; ++workers) {
                test_image<T> out({61, 47}, memory_layout::every_second);
                Filters::convolve(in.view(), k.view(), k.anchor, out.view(), pool_of(workers));
                step("kernel " + std::to_string(k.width) + " x " + std::to_string(k.height),
                     [&] { expect_equal(out, [&](int x, int y) { return by_definition(in, x, y, k); }); });
            }
    });
}
TEST(Convolve, IsTheSameOnAnyPoolWithAnyKernel)
{
    expect_definition_of_an_image<uint8_t>(values::plain);
    expect_definition_of_an_image<int16_t>(values::extreme);
    expect_definition_of_an_image<float>(values::plain);
}

TEST(Convolve, TreatsBgrAsRgbAndFlatImagesLikeOthers)
{
    for (const taps& k : kernels()) {
        const auto in =
            random_image<colour_24>({19, 7}, memory_layout::packed, 3, values::plain, pixel_type::bgr);
        test_image<colour_24> out({19, 7}, memory_layout::flipped, pixel_type::bgr);
        Filters::convolve(in.view(), k.view(), k.anchor, out.view(), nullptr);
        expect_equal(out, [&](int x, int y) { return by_definition(in, x, y, k); });

        test_image<uint16_t> flat({19, 7}), flat_out({19, 7});
        flat.fill([](int x, int) { return static_cast<uint16_t>(x < 9 ? 1000 : 65535); });
        Filters::convolve(flat.view(), k.view(), k.anchor, flat_out.view(), nullptr);
        expect_equal(flat_out, [&](int x, int y) { return by_definition(flat, x, y, k); });
    }
}

TEST(Convolve, FlipsTheKernelAndGivesZeroForNone)
{
    const auto in = random_image<int32_t>({5, 4}, memory_layout::packed, 1);
    test_image<int32_t> out({5, 4});
    const double row[] = {1, 0, 0};
    Filters::convolve(in.view(), {row, 3, 1}, {1, 0}, out.view(), nullptr);
    expect_equal(out, [&](int x, int y) { return in.clamped(x + 1, y); });
    for (const size none : {size{0, 3}, size{3, 0}, size{0, 0}}) {
        out = in;
        Filters::convolve(in.view(), {row, none.width, none.height}, {1, 0}, out.view(), nullptr);
        expect_equal(out, [](int, int) { return 0; });
    }
}

/// Runs indices on the calling thread, as if it had more, and asks for a stop before one of them.
class stopping_pool final : public Thread::ThreadPool {
public:
    stopping_pool(int threads, int32_t at) : threads_(threads), at_(at) {}
    int GetThreadCount() const override { return threads_; }
    int GetCurrentWorker() const override { return 0; }
    void parallel(Thread::range indices, const Thread::parallel_body& body) override
    {
        for (int32_t i = indices.start; i < indices.end; ++i) {
            if (i == at_) RequestCancel();
            body(i, {0});
            ++done;
        }
    }

    int done = 0;

private:
    int threads_;
    int32_t at_;
};

TEST(Convolve, StopsBeforeTheNextRowsAndLeavesThemAlone)
{
    const taps& k = kernels()[1];
    const auto in = random_image<float>({9, 40}, memory_layout::packed, 1, values::plain);
    const auto before = random_image<float>({9, 40}, memory_layout::packed, 2, values::plain);
    auto out = before;
    stopping_pool pool(1, 3);
    EXPECT_THROW(Filters::convolve(in.view(), k.view(), k.anchor, out.view(), &pool), Cancelled);
    int done = 0;
    while (done < 40 && same_bits(out.at(0, done), by_definition(in, 0, done, k))) ++done;
    EXPECT_GE(done, 3);
    EXPECT_LT(done, 40);
    expect_equal(out, [&](int x, int y) { return y < done ? by_definition(in, x, y, k) : before.at(x, y); });

    Filters::convolve(in.view(), k.view(), k.anchor, out.view(), nullptr);
    expect_equal(out, [&](int x, int y) { return by_definition(in, x, y, k); });
}

TEST(Convolve, HandsOutSingleRowsWhereWorkersWouldGetNone)
{
    const taps& k = kernels()[1];
    const auto in = random_image<float>({9, 11}, memory_layout::packed, 1, values::plain);
    test_image<float> out({9, 11});
    stopping_pool pool(3, -1);
    Filters::convolve(in.view(), k.view(), k.anchor, out.view(), &pool);
    EXPECT_EQ(pool.done, 11);
    expect_equal(out, [&](int x, int y) { return by_definition(in, x, y, k); });
}

TEST(Convolve, RefusesInItsOrderAndLeavesARequestToStopStanding)
{
    const taps& k = kernels()[1];
    const test_image<uint8_t> bytes({3, 4});
    const test_image<uint16_t> words({4, 4});
    const test_image<uint64_t> wide({4, 3}), wider({3, 3});
    const auto convolve = [&](memory_2d src, memory_2d dst) {
        Filters::convolve(src, k.view(), k.anchor, dst, nullptr);
    };
    RequestCancel();
    expect_throws<std::invalid_argument>([&] { convolve(wide.view(), words.view()); },
                                         "Convolve: src and dst pixel types must be identical");
    expect_throws<std::invalid_argument>([&] { convolve(wide.view(), wider.view()); },
                                         "Convolve: unsupported pixel type");
    auto same_memory = words.view();
    same_memory.width = 2;
    expect_throws<std::invalid_argument>([&] { convolve(words.view(), same_memory); },
                                         "ZELT Convolve input and output images must have the same size");
    expect_throws<std::invalid_argument>([&] { convolve(bytes.view(), bytes.view()); },
                                         "ZELT Convolve can not be used in place");
    EXPECT_TRUE(IsCancelled());
    EXPECT_THROW(ThrowIfCancelled(), Cancelled);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
