// Convolution and magnitudes of gradients beside OpenCV. Its filter2D computes sums of floats in float, and changes to
// Fourier transforms from 11 x 11 on; ours are sums of products in double in a fixed order. For a magnitude OpenCV's user
// makes two gradients and calls magnitude; his result stays float.
#include "support/bench.h"
#include "support/frames.h"

#include "filters/kernels/convolve.h"
#include "filters/kernels/gradients.h"
#include "threads/multi_threaded_pool.h"

#include <opencv2/imgproc.hpp>

#include <memory>
#include <type_traits>
#include <vector>

namespace {

using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;
using namespace zelt_bench;

/// Positive weights with a sum of 1, none like the other: of doubles, or of floats, whose products with pixels of up to
/// 24 bits are exact.
template <class W>
std::vector<double> weights(int length)
{
    std::vector<double> w;
    double sum = 0;
    for (int i = 0; i < length * length; ++i) sum += w.emplace_back(1 + (i * 7919 % 1009) / 1009.0);
    for (double& v : w) v = static_cast<W>(v / sum);
    return w;
}

template <class T, class W = double>
void register_convolve(int length)
{
    const std::string operation = "Convolve-" + std::to_string(length) + "x" + std::to_string(length) +
                                  (std::is_same_v<W, float> ? "-of-floats" : "");
    const std::string name = frame_case<T>(operation);
    const auto kernel = std::make_shared<std::vector<double>>(weights<W>(length));
    const auto work_on = [=](Thread::ThreadPool* pool) {
        auto& f = frames_of<T>();
        Filters::convolve(view_of<T>(f.src), {kernel->data(), length, length}, {length / 2, length / 2},
                          view_of<T>(f.dst), pool);
    };
    const auto work = [=] { work_on(nullptr); };
    cv::Mat flipped;
    cv::flip(cv::Mat(length, length, CV_64F, kernel->data()), flipped, -1);
    const auto peer = [=] {
        auto& f = frames_of<T>();
        cv::filter2D(f.src, f.dst, -1, flipped, cv::Point(-1, -1), 0, cv::BORDER_REPLICATE);
    };
    // Cut toward zero here, rounded there.
    const auto check = [=] { return difference_from<T>(work, peer).largest <= 1; };
    register_case(name, check, work);
    register_copy(name, pixels_of_frames * sizeof(T));
    register_peer(name, "filter2D", peer);

    if (length != 7 || std::is_same_v<W, float>) return;
    constexpr int workers = 2;
    const auto pool = std::make_shared<Thread::MultiThreadedPool>(workers);
    const std::string threaded = name + "-on-" + std::to_string(workers);
    register_threaded(threaded, workers, check, [=] { work_on(pool.get()); });
    register_threaded(
        threaded + "/peer:filter2D", workers, [] { return true; }, peer);
}

struct gradient_case {
    const char* name;
    void (*ours)(const memory_2d&, const memory_2d&);
    /// The gradients in x and y.
    void (*gradients)(const cv::Mat& src, cv::Mat& x, cv::Mat& y);
    const char* peer_name;
};

void separable(const cv::Mat& src, cv::Mat& x, cv::Mat& y, const cv::Mat& across)
{
    const cv::Mat along = (cv::Mat_<float>(1, 3) << -1, 0, 1);
    cv::sepFilter2D(src, x, CV_32F, along, across, cv::Point(-1, -1), 0, cv::BORDER_REPLICATE);
    cv::sepFilter2D(src, y, CV_32F, across, along, cv::Point(-1, -1), 0, cv::BORDER_REPLICATE);
}

const gradient_case gradient_cases[] = {
    {"Sobel", Filters::sobel,
     [](const cv::Mat& src, cv::Mat& x, cv::Mat& y) {
         cv::Sobel(src, x, CV_32F, 1, 0, 3, 1, 0, cv::BORDER_REPLICATE);
         cv::Sobel(src, y, CV_32F, 0, 1, 3, 1, 0, cv::BORDER_REPLICATE);
     },
     "Sobel+magnitude"},
    {"Prewitt", Filters::prewitt,
     [](const cv::Mat& src, cv::Mat& x, cv::Mat& y) {
         separable(src, x, y, (cv::Mat_<float>(1, 3) << 1, 1, 1));
     },
     "sepFilter2D+magnitude"},
    {"Derivative", Filters::derivative,
     [](const cv::Mat& src, cv::Mat& x, cv::Mat& y) {
         cv::Sobel(src, x, CV_32F, 1, 0, 1, 1, 0, cv::BORDER_REPLICATE);
         cv::Sobel(src, y, CV_32F, 0, 1, 1, 1, 0, cv::BORDER_REPLICATE);
     },
     "Sobel-1+magnitude"},
};

template <class T>
void register_gradient(const gradient_case& g)
{
    const std::string name = frame_case<T>(g.name);
    const auto work = [g] {
        auto& f = frames_of<T>();
        g.ours(view_of<T>(f.src), view_of<T>(f.dst));
    };
    struct floats {
        cv::Mat x, y, magnitude;
    };
    const auto own = std::make_shared<floats>();
    const auto peer = [=] {
        g.gradients(frames_of<T>().src, own->x, own->y);
        cv::magnitude(own->x, own->y, own->magnitude);
    };
    const auto converted = [=] {
        peer();
        own->magnitude.convertTo(frames_of<T>().dst, cv::DataType<T>::depth);
    };
    register_case(
        name, [=] { return difference_from<T>(work, converted).largest <= 1; }, work);
    register_copy(name, pixels_of_frames * sizeof(T));
    register_peer(name, g.peer_name, peer);
}

template <class T>
void register_all()
{
    for (const int length : {3, 7, 15, 31}) register_convolve<T>(length);
    for (const int length : {3, 7}) register_convolve<T, float>(length);
    for (const auto& g : gradient_cases) register_gradient<T>(g);
}

const bool registered = [] {
    register_all<uint8_t>();
    register_all<uint16_t>();
    register_all<float>();
    return true;
}();

} // namespace
