// The Gaussian family beside OpenCV, whose GaussianBlur takes a kernel of 3 sigma (bytes) or 4 sigma to either side and
// so costs more with every sigma.
#include "support/bench.h"
#include "support/frames.h"

#include "filters/kernels/gauss.h"

#include <opencv2/imgproc.hpp>

#include <memory>

namespace {

using namespace Qor::Luxar::ZELT;
using zelt_bench::difference_from;
using zelt_bench::frames_of;
using zelt_bench::view_of;

constexpr int size_of_frames = 2000;
constexpr auto pixels = static_cast<size_t>(size_of_frames) * size_of_frames;

template <class T>
std::string case_name(const std::string& operation)
{
    return operation + "/" + zelt_bench::name_of_type<T>() + "/" + std::to_string(size_of_frames);
}

template <class T>
void register_gauss(int sigma)
{
    const std::string name = case_name<T>("Gauss-" + std::to_string(sigma));
    const auto work = [sigma] {
        auto& f = frames_of<T>(size_of_frames);
        Filters::gauss(view_of<T>(f.src), sigma, view_of<T>(f.dst), nullptr);
    };
    const auto peer = [sigma] {
        auto& f = frames_of<T>(size_of_frames);
        cv::GaussianBlur(f.src, f.dst, cv::Size(), sigma, sigma, cv::BORDER_REPLICATE);
    };
    constexpr double mean = sizeof(T) == 2 ? 16 : 1; // a Gaussian by recursion, and cut: 0.4 % of the range
    zelt_bench::register_case(
        name, [=] { return difference_from(frames_of<T>(size_of_frames), 0, work, peer).mean <= mean; },
        work);
    zelt_bench::register_copy(name, pixels * sizeof(T));
    zelt_bench::register_peer(name, "GaussianBlur", peer);
}

using difference_filter = void (*)(const memory_2d&, double sigma, const memory_2d&);

/// The magnitude of the gradient of a smoothed image, whose differences span two pixels.
template <class T>
void register_gradient(int sigma)
{
    const std::string name = case_name<T>("GaussDerivative-" + std::to_string(sigma));
    const auto work = [sigma] {
        auto& f = frames_of<T>(size_of_frames);
        Filters::gauss_derivative(view_of<T>(f.src), sigma, view_of<T>(f.dst));
    };
    struct floats {
        cv::Mat smooth, x, y, magnitude;
    };
    const auto own = std::make_shared<floats>();
    const auto peer = [=] {
        auto& f = frames_of<T>(size_of_frames);
        cv::GaussianBlur(f.src, own->smooth, cv::Size(), sigma, sigma, cv::BORDER_REPLICATE);
        cv::Sobel(own->smooth, own->x, CV_32F, 1, 0, 1, 1, 0, cv::BORDER_REPLICATE);
        cv::Sobel(own->smooth, own->y, CV_32F, 0, 1, 1, 1, 0, cv::BORDER_REPLICATE);
        cv::magnitude(own->x, own->y, own->magnitude);
    };
    constexpr double mean = sizeof(T) == 2 ? 16 : 1;
    const auto check = [=] {
        const auto converted = [=] {
            peer();
            own->magnitude.convertTo(frames_of<T>(size_of_frames).dst, cv::DataType<T>::depth);
        };
        return difference_from(frames_of<T>(size_of_frames), 0, work, converted).mean <= mean;
    };
    zelt_bench::register_case(name, check, work);
    zelt_bench::register_copy(name, pixels * sizeof(T));
    zelt_bench::register_peer(name, "GaussianBlur+Sobel-1+magnitude", peer);
}

/// What is made of second differences. OpenCV has nothing near.
void register_second(const char* operation, difference_filter filter)
{
    const std::string name = case_name<float>(operation);
    const auto work = [filter] {
        auto& f = frames_of<float>(size_of_frames);
        filter(view_of<float>(f.src), 2, view_of<float>(f.dst));
    };
    const auto check = [=] {
        work();
        const cv::Mat& out = frames_of<float>(size_of_frames).dst;
        return cv::checkRange(out, true, nullptr, 0, 255) && cv::mean(out)[0] > 0;
    };
    zelt_bench::register_case(name, check, work);
    zelt_bench::register_copy(name, pixels * sizeof(float));
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
