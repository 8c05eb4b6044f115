// Offsets, comparison, frames and blending, beside what a user of OpenCV would write for the same pictures. OpenCV
// rounds where zelt truncates and blends 8 bits in several rounded steps, so peers do the nearest work.
#include "support/bench.h"
#include "support/views.h"

#include "arithmetic/kernels/blend.h"
#include "arithmetic/kernels/equals.h"
#include "arithmetic/kernels/modulate.h"
#include "arithmetic/kernels/offset.h"
#include "arithmetic/kernels/padding.h"

#include <opencv2/imgproc.hpp>

#include <algorithm>
#include <cmath>
#include <map>

namespace {

using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;
using Arithmetic::image;
using Arithmetic::outcome;
using zelt_bench::case_name;
using zelt_bench::register_case;
using zelt_bench::register_copy;
using zelt_bench::register_peer;

template <class T>
constexpr PixmatEncoding encoding_of =
    std::is_floating_point_v<T> ? PixmatEncoding_Float : PixmatEncoding_Unsigned;

image image_of(const cv::Mat& m)
{
    const auto encoding = m.channels() == 3     ? PixmatEncoding_RGB
                          : m.depth() >= CV_32F ? PixmatEncoding_Float
                                                : PixmatEncoding_Unsigned;
    return {{m.cols, m.rows, static_cast<int32_t>(8 * m.elemSize()), encoding, 0,
             static_cast<int32_t>(m.elemSize()), static_cast<int32_t>(m.step)},
            m.data};
}

/// Smooth pictures with a little noise; those of one seed are alike.
template <class T>
cv::Mat picture(int size, uint32_t seed, int channels = 1)
{
    cv::Mat m(size, size, CV_MAKETYPE(cv::DataType<T>::depth, channels));
    const double scale = std::is_floating_point_v<T> ? 1.0 : std::pow(2.0, 8 * sizeof(T)) - 1;
    for (int y = 0; y < size; ++y)
        for (int x = 0; x < size * channels; ++x) {
            seed = seed * 1664525u + 1013904223u;
            const double wave = 0.45 + 0.4 * std::sin(0.02 * x + 0.1 * (seed & 1)) * std::cos(0.015 * y);
            m.ptr<T>(y)[x] = static_cast<T>(scale * (wave + 0.1 * (seed >> 8) / 16777216.0));
        }
    return m;
}

struct pictures {
    cv::Mat a, b, twin, mask, dst, wide, scratch, scratch2;
};

/// Made at first use.
template <class T>
pictures& pictures_of(int size)
{
    static std::map<int, pictures> sets;
    pictures& p = sets[size];
    if (p.a.empty()) {
        p = {picture<T>(size, 1), picture<T>(size, 2), {}, picture<T>(size, 3), {}, {}, {}, {}};
        p.dst = cv::Mat(size, size, p.a.type());
        p.wide = cv::Mat(size + 64, size + 64, p.a.type());
    }
    return p;
}

size_t bytes_of(int size, size_t pixel_bytes)
{
    return static_cast<size_t>(size) * static_cast<size_t>(size) * pixel_bytes;
}

/// The value of one pixel by the definition: enough to know that the work was done.
template <class T>
bool is_at(const cv::Mat& m, int x, int y, double value)
{
    return m.at<T>(y, x) == static_cast<T>(value);
}

template <class T>
void register_equals(const char* type, int size)
{
    const std::string name = case_name("Equals", type, size);
    const auto get = [=]() -> pictures& {
        pictures& p = pictures_of<T>(size);
        if (p.twin.empty()) p.twin = p.a.clone();
        return p;
    };
    const auto work = [=] {
        bool same = false;
        Arithmetic::equals(image_of(get().a), image_of(get().twin), &same);
        benchmark::DoNotOptimize(same);
        return same;
    };
    register_case(name, work, [=] { work(); });
    register_copy(name, bytes_of(size, sizeof(T)));
    register_peer(name, "norm-inf", [=] { cv::norm(get().a, get().twin, cv::NORM_INF); });
}

/// A disc with a rim of a few pixels: what masks of regions look like.
template <class T>
cv::Mat disc(int size)
{
    cv::Mat m = picture<T>(size, 3);
    const double full = std::is_floating_point_v<T> ? 1.0 : std::pow(2.0, 8 * sizeof(T)) - 1;
    for (int y = 0; y < size; ++y)
        for (int x = 0; x < size; ++x) {
            const double beyond = std::hypot(x - size / 2, y - size / 2) - size / 3;
            m.at<T>(y, x) = static_cast<T>(full * std::clamp(beyond / 4, 0.0, 1.0));
        }
    return m;
}

template <class T>
void register_combine(const char* type, int size, bool by_disc)
{
    const std::string name = case_name(by_disc ? "Combine-by-disc" : "Combine", type, size);
    const double full = std::is_floating_point_v<T> ? 1.0 : std::pow(2.0, 8 * sizeof(T)) - 1;
    const auto mask = [=]() -> cv::Mat& {
        static std::map<int, cv::Mat> discs;
        if (!by_disc) return pictures_of<T>(size).mask;
        if (discs[size].empty()) discs[size] = disc<T>(size);
        return discs[size];
    };
    const auto work = [=] {
        pictures& p = pictures_of<T>(size);
        Arithmetic::blend(image_of(p.a), image_of(p.b), image_of(mask()), image_of(p.dst));
    };
    register_case(
        name,
        [=] {
            work();
            const pictures& p = pictures_of<T>(size);
            const double w = mask().template at<T>(5, 3) * (1 / full);
            return is_at<T>(p.dst, 3, 5, p.a.at<T>(5, 3) * (1.0 - w) + p.b.at<T>(5, 3) * w);
        },
        work);
    register_copy(name, bytes_of(size, 2 * sizeof(T)));
    register_peer(name, "multiply-add", [=] {
        pictures& p = pictures_of<T>(size);
        cv::subtract(cv::Scalar(full), mask(), p.scratch);
        cv::multiply(p.a, p.scratch, p.scratch, 1 / full);
        cv::multiply(p.b, mask(), p.scratch2, 1 / full);
        cv::add(p.scratch, p.scratch2, p.dst);
    });
}

template <class T>
void register_padding(const char* type, int size)
{
    const std::string margins = case_name("Margins", type, size), extend = case_name("Extend", type, size);
    const auto frame = [=] {
        pictures& p = pictures_of<T>(size);
        Arithmetic::set_margins(image_of(p.a), 10, image_of(p.dst));
    };
    const auto pad = [=] {
        pictures& p = pictures_of<T>(size);
        Arithmetic::extend(image_of(p.a), {-32, -32}, 7, image_of(p.wide));
    };
    register_case(
        margins,
        [=] {
            frame();
            const pictures& p = pictures_of<T>(size);
            return is_at<T>(p.dst, 11, 11, p.a.at<T>(11, 11)) && !is_at<T>(p.dst, 10, 11, p.a.at<T>(11, 10));
        },
        frame);
    register_copy(margins, bytes_of(size, sizeof(T)));
    register_peer(margins, "setTo-copyTo", [=] {
        pictures& p = pictures_of<T>(size);
        const cv::Rect inner(11, 11, size - 21, size - 21);
        p.dst.setTo(0);
        p.a(inner).copyTo(p.dst(inner));
    });
    register_case(
        extend,
        [=] {
            pad();
            const pictures& p = pictures_of<T>(size);
            return is_at<T>(p.wide, 31, 40, 7) && is_at<T>(p.wide, 32, 40, p.a.at<T>(8, 0));
        },
        pad);
    register_copy(extend, bytes_of(size + 64, sizeof(T)));
    register_peer(extend, "copyMakeBorder", [=] {
        pictures& p = pictures_of<T>(size);
        cv::copyMakeBorder(p.a, p.wide, 32, 32, 32, 32, cv::BORDER_CONSTANT, cv::Scalar(7));
    });
    const std::string fill = case_name("SetTo", type, size);
    const auto set = [=] {
        const image dst = image_of(pictures_of<T>(size).dst);
        Arithmetic::combine(Arithmetic::method::assign, 1, dst, {Arithmetic::storage::f64, 7, 0}, dst);
    };
    register_case(
        fill,
        [=] {
            set();
            return is_at<T>(pictures_of<T>(size).dst, 3, 5, 7);
        },
        set);
    register_copy(fill, bytes_of(size, sizeof(T)) / 2);
    register_peer(fill, "setTo", [=] { pictures_of<T>(size).dst.setTo(7); });
}

template <class T>
void register_whole_offset(const char* type, int size, double fa, double fb, const char* what)
{
    const std::string name = case_name(what, type, size);
    const auto work = [=] {
        pictures& p = pictures_of<T>(size);
        Arithmetic::add_integer_offset(image_of(p.a), image_of(p.b), {20, -30}, fa, fb, image_of(p.dst));
    };
    register_case(
        name,
        [=] {
            work();
            const pictures& p = pictures_of<T>(size);
            return is_at<T>(p.dst, 30, 5, fa * p.a.at<T>(5, 30) + fb * p.b.at<T>(35, 10)) &&
                   is_at<T>(p.dst, 19, 5, fa * p.a.at<T>(5, 19));
        },
        work);
    register_copy(name, bytes_of(size, sizeof(T)) * 3 / 2);
    register_peer(name, "addWeighted", [=] {
        pictures& p = pictures_of<T>(size);
        p.a.convertTo(p.dst, -1, fa);
        const cv::Rect of_a(20, 0, size - 20, size - 30), of_b(0, 30, size - 20, size - 30);
        cv::addWeighted(p.a(of_a), fa, p.b(of_b), fb, 0, p.dst(of_a));
    });
}

template <class T>
void register_offset(const char* type, int size)
{
    const std::string name = case_name("AddOffset", type, size);
    const auto work = [=] {
        pictures& p = pictures_of<T>(size);
        Arithmetic::add_offset(image_of(p.dst), image_of(p.b), {20.25, -30.5}, 0.5, 0.5);
    };
    register_case(
        name,
        [=] {
            pictures& p = pictures_of<T>(size);
            p.a.copyTo(p.dst);
            work();
            const auto b = [&](int x, int y) { return static_cast<double>(p.b.at<T>(y, x)); };
            const double sum = 0.75 * 0.5 * b(10, 36) + 0.25 * 0.5 * b(9, 36) + 0.75 * 0.5 * b(10, 35) +
                               0.25 * 0.5 * b(9, 35);
            return is_at<T>(p.dst, 30, 5, 0.5 * p.a.at<T>(5, 30) + 0.5 * sum);
        },
        work);
    register_copy(name, bytes_of(size, sizeof(T)) * 3 / 2);
    register_peer(name, "warpAffine-addWeighted", [=] {
        pictures& p = pictures_of<T>(size);
        const cv::Matx23d shift(1, 0, 20.25, 0, 1, -30.5);
        cv::warpAffine(p.b, p.scratch2, shift, p.b.size());
        cv::addWeighted(p.dst, 0.5, p.scratch2, 0.5, 0, p.dst);
    });
}

template <class T>
void register_modulate(const char* mask_type, int size)
{
    const std::string name = case_name("Modulate", std::string("rgb-by-") + mask_type, size);
    const auto colours = [=]() -> cv::Mat& {
        static std::map<int, cv::Mat> made;
        cv::Mat& m = made[size];
        if (m.empty()) m = picture<uint8_t>(size, 4, 3);
        return m;
    };
    const auto shaded = [=]() -> cv::Mat& {
        static cv::Mat m;
        m.create(size, size, CV_8UC3);
        return m;
    };
    const auto work = [=] {
        Arithmetic::modulate(image_of(colours()), image_of(pictures_of<T>(size).mask), 0.3,
                             image_of(shaded()));
    };
    const double full = std::is_floating_point_v<T> ? 1.0 : std::pow(2.0, 8 * sizeof(T)) - 1;
    register_case(
        name,
        [=] {
            work();
            const double m = pictures_of<T>(size).mask.template at<T>(5, 3) / full;
            const double value =
                std::pow(colours().ptr(5)[3 * 3 + 1] / 255.0, 0.7) * 255.0 * std::pow(m, 0.3);
            return std::fabs(shaded().ptr(5)[3 * 3 + 1] + 0.5 - value) <= 0.5;
        },
        work);
    register_copy(name, bytes_of(size, 6 + sizeof(T)) / 2);
    if constexpr (sizeof(T) == 1)
        register_peer(name, "LUT-multiply", [=] {
            static cv::Mat table = picture<uint8_t>(16, 7).reshape(1, 1), factors, spread, bright;
            cv::LUT(colours(), table, bright);
            cv::LUT(pictures_of<T>(size).mask, table, factors);
            cv::cvtColor(factors, spread, cv::COLOR_GRAY2BGR);
            cv::multiply(bright, spread, shaded(), 1 / 255.0);
        });
}

const bool registered = [] {
    for (const int size : {256, 4096}) {
        register_equals<uint8_t>("u8", size);
        register_equals<uint16_t>("u16", size);
        register_equals<float>("f32", size);
        register_equals<double>("f64", size);
        register_combine<uint8_t>("u8", size, false);
        register_combine<uint16_t>("u16", size, false);
        register_combine<float>("f32", size, false);
        register_combine<uint8_t>("u8", size, true);
        register_padding<uint8_t>("u8", size);
        register_padding<uint16_t>("u16", size);
        register_padding<float>("f32", size);
        register_whole_offset<uint8_t>("u8", size, 0.5, 0.5, "AddIntegerOffset");
        register_whole_offset<uint16_t>("u16", size, 0.5, 0.5, "AddIntegerOffset");
        register_whole_offset<float>("f32", size, 0.5, 0.5, "AddIntegerOffset");
        register_whole_offset<uint16_t>("u16", size, 1, 1, "AddIntegerOffset-plain");
        register_offset<uint8_t>("u8", size);
        register_offset<uint16_t>("u16", size);
        register_offset<float>("f32", size);
        register_modulate<uint8_t>("u8", size);
        register_modulate<uint16_t>("u16", size);
        register_modulate<float>("f32", size);
    }
    return true;
}();

} // namespace
