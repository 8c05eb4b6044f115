// Thresholds, normalisation and absolute values, beside OpenCV's nearest recipes on one thread. Its two-step
// threshold limits instead of replacing, its automatic limit is Otsu's, and its stretch ends in another rounding.
#include "support/bench.h"
#include "support/views.h"

#include "arithmetic/arithmetic.h"
#include "arithmetic/kernels/thresholds.h"
#include "frame/image_access.h"

#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>

#include <cmath>
#include <cstdint>
#include <map>

namespace {

using namespace Qor;
using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;
using zelt_bench::case_name;
using zelt_bench::view_of;

struct frames {
    cv::Mat src, dst;
};

/// One pair of frames for each type and size, made at first use: a bell of 12 bits in 16-bit types, signed ones
/// around 0, floats of 0 to 1, all with smooth noise.
template <class T>
frames& frames_of(int size)
{
    static std::map<int, frames> sets;
    frames& f = sets[size];
    if (!f.src.empty()) return f;
    f = {cv::Mat(size, size, cv::DataType<T>::depth), cv::Mat(size, size, cv::DataType<T>::depth)};
    uint32_t seed = 1;
    for (int y = 0; y < size; ++y)
        for (int x = 0; x < size; ++x) {
            double v = 0;
            for (int i = 0; i < 4; ++i) {
                seed = seed * 1664525u + 1013904223u;
                v += (seed >> 8) / 0x1p26;
            }
            v = 0.7 * v + 0.3 * std::sin(x * 0.01) * std::sin(x * 0.01);
            const double top = std::is_same_v<T, float> ? 1 : sizeof(T) == 1 ? 255 : 4095;
            f.src.at<T>(y, x) = static_cast<T>(v * top - (std::is_signed_v<T> ? top / 2 : 0));
        }
    return f;
}

template <class T>
void register_threshold(const char* type, int size)
{
    const std::string name = case_name("Threshold", type, size);
    const double top = std::is_same_v<T, float> ? 1 : sizeof(T) == 1 ? 255 : 4095;
    const double shift = std::is_signed_v<T> ? top / 2 : 0;
    const auto low = static_cast<T>(top * 0.4 - shift), high = static_cast<T>(top * 0.6 - shift);
    const Arithmetic::threshold_limits limits{double(low), double(low), double(high), double(high)};
    const auto work = [=] {
        frames& f = frames_of<T>(size);
        Arithmetic::threshold(view_of<T>(f.src), limits, view_of<T>(f.dst));
    };
    const auto peer = [=] {
        frames& f = frames_of<T>(size);
        cv::max(f.src, double(low), f.dst);
        cv::min(f.dst, double(high), f.dst);
    };
    zelt_bench::register_case(
        name,
        [=] {
            work();
            const cv::Mat ours = frames_of<T>(size).dst.clone();
            peer();
            return cv::norm(ours, frames_of<T>(size).dst, cv::NORM_INF) == 0;
        },
        work);
    zelt_bench::register_copy(name, size_t(size) * size_t(size) * sizeof(T));
    zelt_bench::register_peer(name, "max+min", peer);
}

template <class T>
void register_absolute(const char* type, int size)
{
    const std::string name = case_name("Abs", type, size);
    const auto work = [=] {
        frames& f = frames_of<T>(size);
        Arithmetic::absolute(view_of<T>(f.src), view_of<T>(f.dst));
    };
    const auto peer = [=] {
        frames& f = frames_of<T>(size);
        cv::absdiff(f.src, cv::Scalar(0), f.dst);
    };
    zelt_bench::register_case(
        name,
        [=] {
            work();
            const cv::Mat ours = frames_of<T>(size).dst.clone();
            peer();
            return cv::norm(ours, frames_of<T>(size).dst, cv::NORM_INF) == 0;
        },
        work);
    zelt_bench::register_copy(name, size_t(size) * size_t(size) * sizeof(T));
    zelt_bench::register_peer(name, "absdiff", peer);
}

/// The limit lies, within a bin, in the middle between the means of both sides, in bins from the least pixel on, and
/// the output has its two classes.
template <class T>
bool is_divided(const frames& f, double limit)
{
    double least = 0, greatest = 0;
    cv::minMaxLoc(f.src, &least, &greatest);
    const double range = greatest - least, scale = range >= 127 ? 1 : 128 / (std::trunc(range) + 1);
    double sum[2] = {}, pixels[2] = {};
    for (auto p = f.src.begin<T>(), q = f.dst.begin<T>(); p != f.src.end<T>(); ++p, ++q) {
        const double bin = std::trunc((*p - least) * scale);
        const int side = bin < std::trunc(limit) ? 0 : 1;
        sum[side] += bin;
        pixels[side] += 1;
        if (*q != (*p < limit ? T{0} : *p > limit ? T{1} : *p)) return false;
    }
    return std::fabs(limit - 0.5 * (sum[0] / pixels[0] + sum[1] / pixels[1])) <= 1;
}

template <class T>
void register_auto_threshold(const char* type, int size)
{
    const std::string name = case_name("AutoThreshold", type, size);
    const auto work = [=] {
        frames& f = frames_of<T>(size);
        const double limit = Arithmetic::find_threshold(view_of<T>(f.src));
        Arithmetic::threshold(view_of<T>(f.src), {limit, 0, limit, 1}, view_of<T>(f.dst));
        return limit;
    };
    zelt_bench::register_case(
        name, [=] { return is_divided<T>(frames_of<T>(size), work()); }, [=] { work(); });
    zelt_bench::register_copy(name, size_t(size) * size_t(size) * sizeof(T));
    if constexpr (std::is_unsigned_v<T>)
        zelt_bench::register_peer(name, "threshold-otsu", [=] {
            frames& f = frames_of<T>(size);
            cv::threshold(f.src, f.dst, 0, 1, cv::THRESH_BINARY | cv::THRESH_OTSU);
        });
}

/// The bounds from a histogram, then a table for bytes and a scaled conversion for the rest.
template <class T>
void stretch_by_opencv(frames& f, double low, double high)
{
    double least = 0, greatest = 0;
    cv::minMaxLoc(f.src, &least, &greatest);
    double from = least, to = greatest;
    if constexpr (!std::is_signed_v<T>)
        if (low > 0 || high < 1) {
            cv::Mat histogram;
            const int bins = sizeof(T) == 1 ? 256 : 65536;
            const float range[] = {0, static_cast<float>(bins)};
            const float* ranges[] = {range};
            const int channel = 0;
            cv::calcHist(&f.src, 1, &channel, cv::Mat(), histogram, 1, &bins, ranges);
            const double pixels = double(f.src.total());
            double sum = 0;
            int bin = 0;
            while (bin < bins && (sum += double(histogram.at<float>(bin))) <= pixels * low) ++bin;
            from = bin;
            while (bin + 1 < bins && sum < pixels * high) sum += double(histogram.at<float>(++bin));
            to = bin;
        }
    const double top = std::is_same_v<T, float> ? 1 : sizeof(T) == 1 ? 255 : 65535;
    const double factor = top / (to - from);
    if constexpr (sizeof(T) == 1) {
        cv::Mat table(1, 256, CV_8U);
        for (int i = 0; i < 256; ++i) table.at<uint8_t>(i) = cv::saturate_cast<uint8_t>((i - from) * factor);
        cv::LUT(f.src, table, f.dst);
    } else {
        f.src.convertTo(f.dst, -1, factor, -from * factor);
    }
}

template <class T>
void register_normalize(const char* type, int size, double low, double high)
{
    const std::string name = case_name(low > 0 ? "Normalize-1%" : "Normalize", type, size);
    const auto work = [=] {
        frames& f = frames_of<T>(size);
        Arithmetic::normalize(view_of<T>(f.src), low, high, view_of<T>(f.dst));
    };
    zelt_bench::register_case(
        name,
        [=] {
            work();
            const double top = std::is_same_v<T, float> ? 1 : sizeof(T) == 1 ? 255 : 65535;
            double least = 0, greatest = 0;
            cv::minMaxLoc(frames_of<T>(size).dst, &least, &greatest);
            return least < 0.1 * top && greatest > 0.9 * top;
        },
        work);
    zelt_bench::register_copy(name, size_t(size) * size_t(size) * sizeof(T));
    const bool has_histogram = low == 0 || !std::is_signed_v<T>;
    if (has_histogram)
        zelt_bench::register_peer(name, sizeof(T) == 1 ? "calcHist+LUT" : "minMaxLoc+calcHist+convertTo",
                                  [=] { stretch_by_opencv<T>(frames_of<T>(size), low, high); });
}

/// Through the interface, on 16 x 16 pixels, into a given output. Made at first use: before main() no class is
/// registered.
struct facet_call {
    static com_ptr<IPixmat2> image(pixel_type type)
    {
        com_ptr<IPixmat2> i;
        const auto layout = packed_layout(16, 16, GetPixmatBits(type), GetPixmatEncoding(type));
        CheckHResult(CreateImageFromLayout(layout, i.put()));
        ImageWriteAccess access(i.get());
        for (int k = 0; k < 16 * 16 * layout.x_stride; ++k)
            access.view().data[k] = static_cast<uint8_t>(k * 37 % 61);
        CheckHResult(access.Commit());
        return i;
    }
    static facet_call& get(pixel_type type)
    {
        static std::map<pixel_type, facet_call> calls;
        facet_call& c = calls[type];
        if (!c.src) c.src = image(type), c.dst = image(type);
        return c;
    }

    com_ptr<IBasicOps2> facet{make<CBasic2>()};
    com_ptr<IPixmat2> src, dst;
    VARIANT one = variant(1).detach(), nine = variant(9).detach();
};

void register_facet(const char* type_name, pixel_type type)
{
    const auto add = [&](const char* operation, HRESULT (*call)(facet_call&)) {
        const auto work = [=] { return call(facet_call::get(type)); };
        zelt_bench::register_case(
            std::string("Facet-") + operation + "/" + type_name + "/16", [=] { return work() == S_OK; },
            work);
    };
    add("Threshold", [](facet_call& c) {
        return c.facet->Threshold(c.src.get(), c.one, c.one, c.nine, c.nine, c.dst.get(), nullptr);
    });
    add("AutoThreshold", [](facet_call& c) {
        return c.facet->AutoThreshold(c.src.get(), c.one, c.nine, ZELT_AutoThreshold_Basic_Global,
                                      c.dst.get(), nullptr);
    });
    add("Normalize",
        [](facet_call& c) { return c.facet->Normalize(c.src.get(), 0, 1, c.dst.get(), nullptr); });
    add("Normalize-1%",
        [](facet_call& c) { return c.facet->Normalize(c.src.get(), 0.01, 0.99, c.dst.get(), nullptr); });
    add("Abs", [](facet_call& c) { return c.facet->Abs(c.src.get(), c.dst.get(), nullptr); });
}

const bool registered = [] {
    for (const int size : {256, 4096}) {
        register_threshold<uint8_t>("u8", size);
        register_threshold<uint16_t>("u16", size);
        register_threshold<int16_t>("i16", size);
        register_threshold<float>("f32", size);
        register_absolute<int8_t>("i8", size);
        register_absolute<int16_t>("i16", size);
        register_absolute<float>("f32", size);
        register_auto_threshold<uint8_t>("u8", size);
        register_auto_threshold<uint16_t>("u16", size);
        register_auto_threshold<float>("f32", size);
        for (const double fraction : {0.0, 0.01}) {
            register_normalize<uint8_t>("u8", size, fraction, 1 - fraction);
            register_normalize<uint16_t>("u16", size, fraction, 1 - fraction);
            register_normalize<float>("f32", size, fraction, 1 - fraction);
        }
    }
    register_facet("u8", pixel_type::unsigned_8);
    register_facet("u16", pixel_type::unsigned_16);
    register_facet("i16", pixel_type::signed_16);
    register_facet("f32", pixel_type::float_32);
    return true;
}();

} // namespace
