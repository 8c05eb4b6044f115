// Flat-field correction of camera frames: 16-bit source and dark reference, fixed-point or float gain, 16-bit
// result. The peers are OpenCV's passes with the same arithmetic; they differ from it only where a product
// lies between two whole numbers. Frames are at most 65535 apart, so that saturation plays no part.
#include "support/bench.h"

#include "flatfield/kernels/flatten.h"
#include "flatfield/kernels/flatten_double.h"
#include "threads/multi_threaded_pool.h"

#include <opencv2/core.hpp>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <memory>
#include <random>

namespace {

using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;

struct frames {
    explicit frames(int s) : size(s)
    {
        std::mt19937 random(7);
        for (int i = 0; i < s * s; ++i) {
            const auto x = static_cast<uint32_t>(random());
            dark.at<uint16_t>(i / s, i % s) = static_cast<uint16_t>(100 + x % 64);
            src.at<uint16_t>(i / s, i % s) = static_cast<uint16_t>(200 + (x >> 6) % 20000);
            brief.at<uint16_t>(i / s, i % s) = static_cast<uint16_t>(200 + (x >> 8) % 2000);
            const double g = 0.75 + (x >> 16) / 131072.0;
            fixed.at<uint16_t>(i / s, i % s) = static_cast<uint16_t>(32768 * g);
            real.at<float>(i / s, i % s) = static_cast<float>(g);
        }
    }
    cv::Mat u16() const { return cv::Mat(size, size, CV_16U, cv::Scalar(0)); }

    int size;
    cv::Mat dark = u16(), src = u16(), brief = u16(), fixed = u16(), dst = u16(), difference = u16();
    cv::Mat real{size, size, CV_32F, cv::Scalar(0)}, real_difference{size, size, CV_32F, cv::Scalar(0)};
};
using shared_frames = std::shared_ptr<frames>;

FlatField::image image_of(const cv::Mat& m, PixmatEncoding encoding)
{
    const auto bits = static_cast<int32_t>(m.elemSize() * 8);
    return {packed_layout(m.cols, m.rows, bits, encoding), m.data};
}
FlatField::image u16(const cv::Mat& m) { return image_of(m, PixmatEncoding_Unsigned); }
FlatField::image i16(const cv::Mat& m) { return image_of(m, PixmatEncoding_Signed); }

/// Runs the work and compares every pixel of dst with expected(S, D, index).
template <class Work, class Expected>
bool agrees(frames& f, Work work, Expected expected)
{
    f.dst.setTo(cv::Scalar(0));
    work();
    for (int i = 0; i < f.size * f.size; ++i) {
        const int y = i / f.size, x = i % f.size;
        if (f.dst.at<uint16_t>(y, x) != expected(f.src.at<uint16_t>(y, x), f.dark.at<uint16_t>(y, x), y, x))
            return false;
    }
    return true;
}

/// The same work on a pool of one worker, whose time counts although the caller sleeps.
template <class Work>
void register_on_pool(const std::string& name, Work work)
{
    const auto pool = std::make_shared<Thread::MultiThreadedPool>(1);
    benchmark::RegisterBenchmark((name + "/pool:1").c_str(), [=](benchmark::State& state) {
        for (auto _ : state) {
            work(pool.get());
            benchmark::ClobberMemory();
        }
    })->MeasureProcessCPUTime();
}

void register_fixed_gain(const shared_frames& f, const std::string& size)
{
    const std::string name = "Flatten/u16/" + size;
    const auto work = [f](Thread::ThreadPool* pool) {
        FlatField::flatten(u16(f->dst), u16(f->src), u16(f->dark), u16(f->fixed), 1, pool);
    };
    zelt_bench::register_case(
        name,
        [=] {
            return agrees(
                *f, [&] { work(nullptr); },
                [&](int s, int d, int y, int x) { return ((s - d) * f->fixed.at<uint16_t>(y, x)) >> 15; });
        },
        [=] { work(nullptr); });
    register_on_pool(name, work);
    zelt_bench::register_copy(name, f->dst.total() * 4);
    zelt_bench::register_peer(name, "subtract+multiply", [f] {
        cv::subtract(f->src, f->dark, f->difference);
        cv::multiply(f->difference, f->fixed, f->dst, 1.0 / 32768, CV_16U);
    });
}

void register_float_gain(const shared_frames& f, const std::string& size)
{
    const std::string name = "Flatten/u16-float-gain/" + size;
    const auto work = [f](Thread::ThreadPool* pool) {
        FlatField::flatten(u16(f->dst), u16(f->src), u16(f->dark), image_of(f->real, PixmatEncoding_Float), 1,
                           pool);
    };
    zelt_bench::register_case(
        name,
        [=] {
            return agrees(
                *f, [&] { work(nullptr); },
                [&](int s, int d, int y, int x) {
                    return static_cast<int>(
                        std::floor(static_cast<float>(s - d) * f->real.at<float>(y, x) + 0.5f));
                });
        },
        [=] { work(nullptr); });
    register_on_pool(name, work);
    zelt_bench::register_copy(name, f->dst.total() * 5);
    zelt_bench::register_peer(name, "subtract+multiply", [f] {
        cv::subtract(f->src, f->dark, f->difference);
        cv::multiply(f->difference, f->real, f->dst, 1.0, CV_16U);
    });
    zelt_bench::register_peer(name, "subtract+multiply+convertTo", [f] {
        cv::subtract(f->src, f->dark, f->real_difference, cv::noArray(), CV_32F);
        cv::multiply(f->real_difference, f->real, f->real_difference);
        f->real_difference.convertTo(f->dst, CV_16U);
    });
}

/// Two exposures. No peer has the operation; the copy shows what the memory costs.
void register_merge(const shared_frames& f, const std::string& size)
{
    for (const bool lanes : {true, false}) {
        const std::string name = std::string("FlattenDouble/") + (lanes ? "lanes/" : "u16/") + size;
        const auto dark = lanes ? i16(f->dark) : u16(f->dark);
        const auto work = [f, dark] {
            FlatField::flatten_double(i16(f->dst), u16(f->src), u16(f->brief), 4.0, dark, u16(f->fixed), 2,
                                      nullptr);
        };
        // No frame is saturated, except to the lanes: to their signed compare 65535 is -1.
        const auto expected = [f, lanes](int s, int d, int y, int x) {
            const int g = f->fixed.at<uint16_t>(y, x);
            if (!lanes) return std::min(((s - d) * g) >> 14, 32767);
            const auto v = static_cast<int16_t>((f->brief.at<uint16_t>(y, x) - d) * 4);
            return (((v * static_cast<int16_t>(g)) >> 16) * 4) & 0xFFFF;
        };
        zelt_bench::register_case(
            name, [=] { return agrees(*f, work, expected); }, work);
        zelt_bench::register_copy(name, f->dst.total() * 5);
    }
}

const bool registered = [] {
    for (const int size : {256, 4096}) {
        const auto f = std::make_shared<frames>(size);
        register_fixed_gain(f, std::to_string(size));
        register_float_gain(f, std::to_string(size));
        register_merge(f, std::to_string(size));
    }
    return true;
}();

} // namespace
