// The scalar pass beside a plain read of the same bytes and beside the three OpenCV calls that a user would need
// for the same numbers; and what a call costs around its pass: the store of results, the frame, late binding.
#include "statistics/kernels/pixel_counters.h"
#include "statistics/kernels/scalar_statistics.h"
#include "statistics/statistics.h"
#include "support/bench.h"
#include "zelt/zelt.h"

#include "frame/image_access.h"
#include "frame/value_objects.h"
#include "zelt/com/class_registry.h"
#include "zelt/interfaces/statistics.h"
#include "zelt/interfaces/zelt.h"

#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>

#include <algorithm>
#include <cmath>
#include <memory>
#include <random>
#include <vector>

namespace {

using namespace Qor;
using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;

template <class T>
struct format;
template <>
struct format<uint8_t> {
    static constexpr const char* name = "u8";
    static constexpr PixmatEncoding encoding = PixmatEncoding_Unsigned;
    static constexpr int bits = 8, opencv = CV_8UC1;
};
template <>
struct format<uint16_t> {
    static constexpr const char* name = "u16";
    static constexpr PixmatEncoding encoding = PixmatEncoding_Unsigned;
    static constexpr int bits = 16, opencv = CV_16UC1;
};
template <>
struct format<float> {
    static constexpr const char* name = "f32";
    static constexpr PixmatEncoding encoding = PixmatEncoding_Float;
    static constexpr int bits = 32, opencv = CV_32FC1;
};

/// A camera frame: a bright spot on a dark ground, with noise; 12 bits where there is room for them.
template <class T>
std::vector<T> camera_frame(int size)
{
    std::mt19937 random(1);
    std::normal_distribution<double> noise(0.0, 0.01);
    const double full = sizeof(T) == 1 ? 255.0 : 4095.0;
    std::vector<double> row_noise(4096);
    for (double& n : row_noise) n = noise(random);
    std::vector<T> pixels;
    pixels.reserve(static_cast<size_t>(size) * static_cast<size_t>(size));
    for (int y = 0; y < size; ++y)
        for (int x = 0; x < size; ++x) {
            const double dx = (x - size / 2.0) / size, dy = (y - size / 3.0) / size;
            const double n = row_noise[static_cast<size_t>(x + y * 37 + x * y) % row_noise.size()];
            const double v = 0.1 + 0.8 * std::exp(-8 * (dx * dx + dy * dy)) + n;
            pixels.push_back(static_cast<T>(std::clamp(v, 0.0, 1.0) * full));
        }
    return pixels;
}

template <class T>
struct subject {
    image_layout layout;
    std::vector<T> pixels;

    explicit subject(int size)
        : layout(packed_layout(size, size, format<T>::bits, format<T>::encoding)),
          pixels(camera_frame<T>(size))
    {
    }
    Statistics::image_statistics measure() const
    {
        Statistics::image_statistics record;
        const auto found = Statistics::find_value_format(layout.encoding, layout.bits);
        Statistics::measure(layout, pixels.data(), {0, 0, layout.width, layout.height}, 1, *found, record);
        return record;
    }
    bool is_right() const
    {
        const auto got = measure();
        double sum = 0, squares = 0, moment = 0;
        for (size_t i = 0; i < pixels.size(); ++i) {
            const double v = pixels[i];
            sum += v;
            squares += v * v;
            moment += v * static_cast<double>(i % static_cast<size_t>(layout.width));
        }
        const auto close = [](double a, double b) { return std::abs(a - b) <= 1e-9 * std::abs(b); };
        return got.minimum == *std::min_element(pixels.begin(), pixels.end()) &&
               got.maximum == *std::max_element(pixels.begin(), pixels.end()) &&
               close(got.mean, sum / static_cast<double>(pixels.size())) && close(got.sum_squares, squares) &&
               close(got.gravity_x, moment / sum);
    }
};

/// Reads every byte once and does as little with it as possible.
uint64_t read_all(const void* data, size_t bytes)
{
    typedef uint64_t words __attribute__((vector_size(64)));
    words sum[2] = {};
    const auto* p = static_cast<const unsigned char*>(data);
    for (size_t i = 0; i + 2 * sizeof(words) <= bytes; i += 2 * sizeof(words)) {
        words v[2];
        __builtin_memcpy(v, p + i, sizeof v);
        sum[0] += v[0];
        sum[1] += v[1];
    }
    sum[0] += sum[1];
    return sum[0][0] + sum[0][1] + sum[0][2] + sum[0][3] + sum[0][4] + sum[0][5] + sum[0][6] + sum[0][7];
}

template <class T>
void scalars(int size)
{
    const auto image = std::make_shared<const subject<T>>(size);
    const std::string name = std::string("Scalars/") + format<T>::name + "/" + std::to_string(size);
    zelt_bench::register_case(
        name, [=] { return image->is_right(); }, [=] { benchmark::DoNotOptimize(image->measure().mean); });
    zelt_bench::register_peer(name, "read", [=] {
        benchmark::DoNotOptimize(read_all(image->pixels.data(), image->pixels.size() * sizeof(T)));
    });
    zelt_bench::register_peer(name, "minMaxLoc+meanStdDev+moments", [=] {
        const cv::Mat m(size, size, format<T>::opencv, const_cast<T*>(image->pixels.data()));
        double low, high;
        cv::Point at_low, at_high;
        cv::minMaxLoc(m, &low, &high, &at_low, &at_high);
        cv::Scalar mean, deviation;
        cv::meanStdDev(m, mean, deviation);
        benchmark::DoNotOptimize(cv::moments(m).m10 + low + high + mean[0]);
    });
}

/// An image of 16-bit pixels and the root's facet, as a client has them.
class client {
public:
    explicit client(int size) : pixels_(camera_frame<uint16_t>(size))
    {
        CheckHResult(
            CreateImageFromLayout(packed_layout(size, size, 16, PixmatEncoding_Unsigned), image.put()));
        {
            ImageWriteAccess access(image.get());
            std::copy(pixels_.begin(), pixels_.end(), reinterpret_cast<uint16_t*>(access.view().data));
            CheckHResult(access.Commit());
        }
        image_argument = variant(image.get());
        // Not all of the image, so that an answer is neither kept nor found.
        CheckHResult(Common::MakeRectangle(0, 0, size, size - 1, part.put()));
        com_ptr<IZELT2> root;
        CheckHResult(CoCreateInstance(CLSID_ZELT2, nullptr, CLSCTX_ALL, IZELT2::iid, root.put_void()));
        CheckHResult(root->get_Statistics(facet.put()));
        const OLECHAR* name = L"Minimum";
        CheckHResult(facet->GetIDsOfNames(GUID_NULL, const_cast<OLECHAR**>(&name), 1, LOCALE_USER_DEFAULT,
                                          &minimum_id));
    }

    double minimum(IRectangle* area = nullptr) const
    {
        double value = -1;
        CheckHResult(facet->Minimum(image.get(), area, &value));
        return value;
    }
    double minimum_of_changed_image() const
    {
        com_ptr<IPixmatLock> lock;
        CheckHResult(image->OpenWrite(lock.put()));
        lock = nullptr; // drops the results that are kept
        return minimum();
    }
    double late_minimum() const
    {
        VARIANT argument = *image_argument.get(); // borrowed
        DISPPARAMS arguments{&argument, nullptr, 1, 0};
        variant value;
        CheckHResult(facet->Invoke(minimum_id, GUID_NULL, LOCALE_USER_DEFAULT, DISPATCH_METHOD, &arguments,
                                   value.put(), nullptr, nullptr));
        return value->dblVal;
    }
    LONG count() const
    {
        LONG n = -1;
        CheckHResult(facet->Count(image.get(), 500.0, ZELT_Less, nullptr, &n));
        return n;
    }
    double kernel_minimum() const
    {
        const auto size = static_cast<int32_t>(std::lround(std::sqrt(pixels_.size())));
        const image_layout layout = packed_layout(size, size, 16, PixmatEncoding_Unsigned);
        Statistics::image_statistics record;
        Statistics::measure(layout, pixels_.data(), {0, 0, size, size - 1}, 1,
                            *Statistics::find_value_format(layout.encoding, layout.bits), record);
        return record.minimum;
    }
    int64_t kernel_count() const
    {
        const auto size = static_cast<int32_t>(std::lround(std::sqrt(pixels_.size())));
        return Statistics::compare_pixels(view_of(packed_layout(size, size, 16, PixmatEncoding_Unsigned),
                                                  const_cast<uint16_t*>(pixels_.data())),
                                          500.0)
            .less;
    }

    com_ptr<IPixmat2> image;
    com_ptr<IRectangle> part;
    com_ptr<IStatistics> facet;
    variant image_argument;
    DISPID minimum_id = DISPID_UNKNOWN;

private:
    std::vector<uint16_t> pixels_;
};

/// A call beside the same answer gained another way.
template <class Call, class Other>
void calls(const std::string& name, const std::string& peer, Call call, Other other)
{
    zelt_bench::register_case(
        name, [=] { return call() == other(); }, [=] { benchmark::DoNotOptimize(call()); });
    zelt_bench::register_peer(name, peer, [=] { benchmark::DoNotOptimize(other()); });
}

/// Made at the first use: the library's classes are not registered before main.
template <int Size>
const client& the_client()
{
    static const client c(Size);
    return c;
}

template <int Size>
void calls_on_size()
{
    const std::string end = "/u16/" + std::to_string(Size);
    const auto c = the_client<Size>;
    const auto again = [=] { return c().minimum(); };
    calls("Calls/Minimum:again" + end, "first", again, [=] { return c().minimum_of_changed_image(); });
    calls(
        "Calls/Minimum:late" + end, "direct", [=] { return c().late_minimum(); }, again);
    calls(
        "Calls/Minimum:part" + end, "kernel", [=] { return c().minimum(c().part.get()); },
        [=] { return c().kernel_minimum(); });
    calls(
        "Calls/Count" + end, "kernel", [=] { return c().count(); }, [=] { return c().kernel_count(); });
}

const bool registered = [] {
    for (const int size : {4096, 256, 16}) {
        scalars<uint8_t>(size);
        scalars<uint16_t>(size);
        scalars<float>(size);
    }
    calls_on_size<16>();
    calls_on_size<2048>();
    return true;
}();

} // namespace
