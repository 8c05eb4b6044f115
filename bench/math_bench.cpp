// Functions of single pixels, beside OpenCV where it has the function (its phase is an angle within a third of a degree,
// its polarToCart gives sine and cosine at once), and beside a loop over the standard library's function.
#include "support/bench.h"
#include "support/views.h"

#include "arithmetic/kernels/functions.h"

#include <opencv2/core.hpp>

#include <cmath>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>

namespace {

using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;
using Arithmetic::angle_function;
using zelt_bench::register_case;
using zelt_bench::register_copy;
using zelt_bench::register_peer;
using zelt_bench::view_of;

struct interval {
    double low, high;
};

/// Evenly spread numbers of an interval. Frames are made at first use and shared by their cases.
template <class T>
cv::Mat& frame_of(int size, interval in, uint32_t seed)
{
    static std::map<std::tuple<int, double, double, uint32_t>, cv::Mat> made;
    cv::Mat& m = made[{size, in.low, in.high, seed}];
    if (!m.empty()) return m;
    m.create(size, size, cv::DataType<T>::depth);
    for (int y = 0; y < size; ++y)
        for (int x = 0; x < size; ++x) {
            seed = seed * 1664525u + 1013904223u;
            m.at<T>(y, x) = static_cast<T>(in.low + (in.high - in.low) * ((seed >> 8) / 0x1p24));
        }
    return m;
}

template <class T>
cv::Mat& output_of(int size, int number = 0)
{
    static std::map<std::pair<int, int>, cv::Mat> made;
    cv::Mat& m = made[{size, number}];
    m.create(size, size, cv::DataType<T>::depth);
    return m;
}

/// Results differ from the exact ones by at most about one unit in the last place.
template <class T>
bool is_near(T result, double exact)
{
    const double unit = std::is_same_v<T, float> ? 0x1p-23 : 0x1p-52;
    return std::fabs(static_cast<double>(result) - exact) <= unit * std::fabs(exact) + 0x1p-140;
}

using one = std::function<double(double)>;

/// A function of one image, T to R. `exact` is the function in double precision; `nearest` what the standard library
/// offers for R.
template <class T, class R, class Work, class Nearest>
void register_function(const std::string& name, int size, interval in, Work run, const one& exact,
                       Nearest nearest)
{
    const auto work = [=] { run(view_of<T>(frame_of<T>(size, in, 1)), view_of<R>(output_of<R>(size))); };
    register_case(
        name,
        [=] {
            work();
            for (int i = 0; i < size * size; i += 7)
                if (!is_near(output_of<R>(size).template at<R>(i / size, i % size),
                             exact(static_cast<double>(
                                 frame_of<T>(size, in, 1).template at<T>(i / size, i % size)))))
                    return false;
            return true;
        },
        work);
    const auto pixels = static_cast<size_t>(size) * static_cast<size_t>(size);
    register_copy(name, pixels * (sizeof(T) + sizeof(R)) / 2);
    register_peer(name, "std", [=] {
        const auto* const from = frame_of<T>(size, in, 1).template ptr<T>();
        auto* const to = output_of<R>(size, 1).template ptr<R>();
        for (size_t i = 0; i < pixels; ++i) to[i] = nearest(static_cast<R>(from[i]));
    });
}

template <class T>
std::string name_of(const char* function, int size)
{
    return zelt_bench::case_name(function, zelt_bench::name_of_type<T>(), size);
}

/// Exp, Log and Power keep the type.
template <class T>
void register_own_type(int size)
{
    const interval exponents{-10, 10}, positive{0.001, 1000};
    const std::string exp = name_of<T>("Exp", size), log = name_of<T>("Log", size);
    register_function<T, T>(
        exp, size, exponents, Arithmetic::exponential, [](double v) { return std::exp(v); },
        [](T v) { return std::exp(v); });
    register_peer(exp, "exp", [=] { cv::exp(frame_of<T>(size, exponents, 1), output_of<T>(size)); });
    register_function<T, T>(
        log, size, positive, Arithmetic::logarithm, [](double v) { return std::log(v); },
        [](T v) { return std::log(v); });
    register_peer(log, "log", [=] { cv::log(frame_of<T>(size, positive, 1), output_of<T>(size)); });

    for (const double exponent : {2.0, 0.5, 0.45}) {
        const std::string name =
            name_of<T>(exponent == 2 ? "Power-2" : (exponent == 0.5 ? "Power-half" : "Power-0.45"), size);
        const double used = static_cast<double>(static_cast<T>(exponent));
        register_function<T, T>(
            name, size, positive,
            [=](const memory_2d& src, const memory_2d& dst) { Arithmetic::power(src, exponent, dst); },
            [=](double v) { return std::pow(v, used); },
            [=](T v) { return std::pow(v, static_cast<T>(exponent)); });
        register_peer(name, "pow",
                      [=] { cv::pow(frame_of<T>(size, positive, 1), exponent, output_of<T>(size)); });
    }
}

struct angle_case {
    const char* name;
    angle_function function;
    interval in;
    double (*exact)(double);
    float (*nearest)(float);
};

const angle_case angles[] = {
    {"Sin", angle_function::sine, {-100, 100}, std::sin, std::sin},
    {"Cos", angle_function::cosine, {-100, 100}, std::cos, std::cos},
    {"Tan", angle_function::tangent, {-100, 100}, std::tan, std::tan},
    {"Asin", angle_function::arc_sine, {-1, 1}, std::asin, std::asin},
    {"Acos", angle_function::arc_cosine, {-1, 1}, std::acos, std::acos},
    {"Atan", angle_function::arc_tangent, {-10, 10}, std::atan, std::atan},
};

/// The functions of IMath: Float 32 whatever goes in, and the function of the pixel as Float 32.
template <class T>
void register_angles(int size)
{
    for (const angle_case& c : angles) {
        const interval in = std::is_integral_v<T> ? interval{0, c.in.high} : c.in;
        const std::string name = name_of<T>(c.name, size);
        register_function<T, float>(
            name, size, in,
            [f = c.function](const memory_2d& src, const memory_2d& dst) { Arithmetic::map(f, src, dst); },
            [f = c.exact](double v) { return f(static_cast<double>(static_cast<float>(v))); }, c.nearest);
        if (!std::is_same_v<T, float>) continue;
        if (c.function == angle_function::sine || c.function == angle_function::cosine)
            register_peer(name, "polarToCart", [=] {
                cv::polarToCart(cv::noArray(), frame_of<float>(size, in, 1), output_of<float>(size),
                                output_of<float>(size, 1));
            });
    }
}

template <class T>
void register_arc_tangent_2(int size)
{
    const std::string name = name_of<T>("Atan2", size);
    const interval in = std::is_integral_v<T> ? interval{0, 4096} : interval{-10, 10};
    const auto work = [=] {
        Arithmetic::arc_tangent_2(view_of<T>(frame_of<T>(size, in, 1)), view_of<T>(frame_of<T>(size, in, 2)),
                                  view_of<float>(output_of<float>(size)));
    };
    const auto pixels = static_cast<size_t>(size) * static_cast<size_t>(size);
    const auto exact = [=](size_t i) {
        return std::atan2(
            static_cast<double>(static_cast<float>(frame_of<T>(size, in, 1).template ptr<T>()[i])),
            static_cast<double>(static_cast<float>(frame_of<T>(size, in, 2).template ptr<T>()[i])));
    };
    register_case(
        name,
        [=] {
            work();
            for (size_t i = 0; i < pixels; i += 7)
                if (!is_near(output_of<float>(size).template ptr<float>()[i], exact(i))) return false;
            return true;
        },
        work);
    register_copy(name, pixels * (2 * sizeof(T) + sizeof(float)) / 2);
    register_peer(name, "std", [=] {
        const auto* const y = frame_of<T>(size, in, 1).template ptr<T>();
        const auto* const x = frame_of<T>(size, in, 2).template ptr<T>();
        auto* const to = output_of<float>(size, 1).template ptr<float>();
        for (size_t i = 0; i < pixels; ++i)
            to[i] = std::atan2(static_cast<float>(y[i]), static_cast<float>(x[i]));
    });
    if constexpr (std::is_same_v<T, float>)
        register_peer(name, "phase", [=] {
            cv::phase(frame_of<float>(size, in, 2), frame_of<float>(size, in, 1), output_of<float>(size));
        });
}

const bool registered = [] {
    for (const int size : {256, 4096}) {
        register_own_type<float>(size);
        register_own_type<double>(size);
        register_angles<float>(size);
        register_angles<double>(size);
        register_angles<uint16_t>(size);
        register_arc_tangent_2<float>(size);
        register_arc_tangent_2<double>(size);
        register_arc_tangent_2<uint16_t>(size);
    }
    return true;
}();

} // namespace
