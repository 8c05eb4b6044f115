// The Gaussian family beside OpenCV, whose GaussianBlur takes a kernel of 3 sigma (bytes) or 4 sigma to either side and
// so costs more with every sigma.
#include "support/bench.h"
#include "support/frames.h"

#include "filters/kernels/gauss.h"

#include <opencv2/imgproc.hpp>

#include <memory>

namespace {

using namespace Qor::Luxar::ZELT;
using namespace zelt_bench;

/// A Gaussian by recursion, and cut: 0.4 % of the range. It has a border of its own, which reaches 4 sigma far.
template <class T, class Work, class Peer>
bool is_near(Work work, Peer peer, int sigma)
{
    constexpr double mean = sizeof(T) == 2 ? 16 : 1;
    return difference_from<T>(work, peer, 4 * sigma).mean <= mean;
}

template <class T>
void register_gauss(int sigma)
{
    const std::string name = frame_case<T>("Gauss-" + std::to_string(sigma));
    const auto work = [sigma] {
        auto& f = frames_of<T>();
        Filters::gauss(view_of<T>(f.src), sigma, view_of<T>(f.dst), nullptr);
    };
    const auto peer = [sigma] {
        auto& f = frames_of<T>();
        cv::GaussianBlur(f.src, f.dst, cv::Size(), sigma, sigma, cv::BORDER_REPLICATE);
    };
    register_case(
        name, [=] { return is_near<T>(work, peer, sigma); }, work);
    register_copy(name, pixels_of_frames * sizeof(T));
    register_peer(name, "GaussianBlur", peer);
}

using difference_filter = void (*)(const memory_2d&, double sigma, const memory_2d&);

/// The magnitude of the gradient of a smoothed image, whose differences span two pixels.
template <class T>
void register_gradient(int sigma)
{
    const std::string name = frame_case<T>("GaussDerivative-" + std::to_string(sigma));
    const auto work = [sigma] {
        auto& f = frames_of<T>();
        Filters::gauss_derivative(view_of<T>(f.src), sigma, view_of<T>(f.dst));
    };
    struct floats {
        cv::Mat smooth, x, y, magnitude;
    };
    const auto own = std::make_shared<floats>();
    const auto peer = [=] {
        auto& f = frames_of<T>();
        cv::GaussianBlur(f.src, own->smooth, cv::Size(), sigma, sigma, cv::BORDER_REPLICATE);
        cv::Sobel(own->smooth, own->x, CV_32F, 1, 0, 1, 1, 0, cv::BORDER_REPLICATE);
        cv::Sobel(own->smooth, own->y, CV_32F, 0, 1, 1, 1, 0, cv::BORDER_REPLICATE);
        cv::magnitude(own->x, own->y, own->magnitude);
    };
    const auto check = [=] {
        const auto converted = [=] {
            peer();
            own->magnitude.convertTo(frames_of<T>().dst, cv::DataType<T>::depth);
        };
        return is_near<T>(work, converted, sigma);
    };
    register_case(name, check, work);
    register_copy(name, pixels_of_frames * sizeof(T));
    register_peer(name, "GaussianBlur+Sobel-1+magnitude", peer);
}

/// What is made of second differences. OpenCV has nothing near.
void register_second(const char* operation, difference_filter filter)
{
    const std::string name = frame_case<float>(operation);
    const auto work = [filter] {
        auto& f = frames_of<float>();
        filter(view_of<float>(f.src), 2, view_of<float>(f.dst));
    };
    const auto check = [=] {
        work();
        const cv::Mat& out = frames_of<float>().dst;
        return cv::checkRange(out, true, nullptr, 0, 255) && cv::mean(out)[0] > 0;
    };
    register_case(name, check, work);
    register_copy(name, pixels_of_frames * sizeof(float));
}

template <class T>
void register_all()
{
    for (const int sigma : {1, 2, 5, 20, 100}) register_gauss<T>(sigma);
    for (const int sigma : {2, 5}) register_gradient<T>(sigma);
}

const bool registered = [] {
    register_all<uint8_t>();
    register_all<uint16_t>();
    register_all<float>();
    register_second("LaplacianGaussian-2", Filters::laplacian_gaussian);
    register_second("SDGDGaussian-2", Filters::sdgd_gaussian);
    return true;
}();

} // namespace
