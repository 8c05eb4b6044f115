// Many threads on the facets of one root. Meant for the thread sanitizer; it checks every result besides.
#include "frame/image_access.h"
#include "frame/value_objects.h"
#include "support/failing_new.h"
#include "zelt/com/class_registry.h"
#include "zelt/com/error_info.h"
#include "zelt/interfaces/zelt.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <vector>

namespace Qor::Luxar::ZELT::Test {
namespace {

constexpr int threads = 6;
constexpr int rounds = 10;
constexpr int32_t width = 33;
constexpr int32_t height = 21;

com_ptr<IPixmat2> grey_image(uint16_t value)
{
    com_ptr<IPixmat2> image;
    CheckHResult(
        CreateImageFromLayout(packed_layout(width, height, 16, PixmatEncoding_Unsigned), image.put()));
    ImageWriteAccess access(image.get());
    auto* pixels = reinterpret_cast<uint16_t*>(access.view().data);
    std::fill_n(pixels, width * height, value);
    CheckHResult(access.Commit());
    return image;
}

uint16_t first_pixel(IPixmat2* image)
{
    const ImageReadAccess access(image);
    return *reinterpret_cast<const uint16_t*>(access.view().data);
}

struct facets {
    com_ptr<IZELT2> root;
    com_ptr<IStatistics> statistics;
    com_ptr<IFlatFielding> flat;
    com_ptr<IConversions2> conversions;

    facets()
    {
        CheckHResult(CoCreateInstance(CLSID_ZELT2, nullptr, CLSCTX_ALL, IZELT2::iid, root.put_void()));
        CheckHResult(root->get_Statistics(statistics.put()));
        CheckHResult(root->get_FlatFielding(flat.put()));
        CheckHResult(root->get_Conversions(conversions.put()));
    }
};

/// Counts what did not come out as it should; an EXPECT in many threads would only tell it a thousand times.
struct tally {
    std::atomic<int> wrong{0};
    void expect(bool good) { wrong += good ? 0 : 1; }
};

void work(const facets& f, IPixmat2* shared, IPixmat2* dark, IPixmat2* gain, int id, tally& t)
{
    const auto own = grey_image(static_cast<uint16_t>(1000 + id));
    const auto out = grey_image(0);
    com_ptr<IRectangle> area;
    CheckHResult(Common::MakeRectangle(1, 1, width, height, area.put()));
    for (int round = 0; round < rounds; ++round) {
        double value = -1;
        t.expect(f.statistics->Mean(shared, nullptr, &value) == S_OK && value == 500); // the shared cache
        t.expect(f.statistics->Maximum(shared, area.get(), &value) == S_OK && value == 500);
        com_ptr<ICoordinateInt> where;
        t.expect(f.statistics->MinimumPosition(shared, nullptr, where.put()) == S_OK);

        const auto level = static_cast<uint16_t>(1000 + id + round);
        {
            ImageWriteAccess access(own.get());
            std::fill_n(reinterpret_cast<uint16_t*>(access.view().data), width * height, level);
            t.expect(access.Commit() == S_OK);
        }
        t.expect(f.statistics->Minimum(own.get(), nullptr, &value) == S_OK && value == level);
        t.expect(f.flat->Flatten(out.get(), own.get(), dark, gain, 1) == S_OK);
        t.expect(first_pixel(out.get()) == level - 100);
        t.expect(f.conversions->Recode(out.get(), own.get(), nullptr, nullptr) == S_OK);
        t.expect(first_pixel(out.get()) == level);
        t.expect(f.statistics->Minimum(nullptr, nullptr, &value) == E_INVALIDARG); // failures of their own
        t.expect(f.conversions->Recode(out.get(), nullptr, nullptr, nullptr) == E_INVALIDARG);
    }
}

void run_all(const facets& f, tally& t)
{
    const auto shared = grey_image(500);
    const auto dark = grey_image(100);
    const auto gain = grey_image(32768); // exactly 1
    std::vector<std::thread> workers;
    for (int id = 0; id < threads; ++id)
        workers.emplace_back([&, id] {
            work(f, shared.get(), dark.get(), gain.get(), id, t);
            SetErrorInfo(0, nullptr);
        });
    for (std::thread& w : workers) w.join();
}

TEST(Stress, ThreadsShareOneRootsFacetsAndLeaveNothingBehind)
{
    const facets f;
    tally t;
    run_all(f, t); // pools start
    EXPECT_EQ(t.wrong, 0);
    const int64_t before = live_allocations();
    run_all(f, t);
    EXPECT_EQ(t.wrong, 0);
    EXPECT_EQ(live_allocations(), before);
}

TEST(Stress, RootsComeAndGoInParallel)
{
    tally t;
    std::vector<std::thread> workers;
    for (int id = 0; id < threads; ++id)
        workers.emplace_back([&t] {
            for (int round = 0; round < 5; ++round) {
                const facets f;
                run_all(f, t);
            }
        });
    for (std::thread& w : workers) w.join();
    EXPECT_EQ(t.wrong, 0);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
