// Pixel-wise arithmetic of images with images and numbers, beside OpenCV's functions. OpenCV saturates always, rounds
// quotients and computes some sums in other widths; where pixels differ for that reason the peer does the nearest work.
#include "support/bench.h"

#include "arithmetic/arithmetic.h"
#include "arithmetic/kernels/binary.h"
#include "frame/image_access.h"

#include <opencv2/core.hpp>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <map>
#include <memory>

namespace {

using namespace Qor;
using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;
using Arithmetic::method;

constexpr int wrap = 2, saturate = 3;

template <class T>
constexpr int cv_depth = cv::DataType<T>::depth;

template <class T>
constexpr PixmatEncoding encoding_of = std::is_floating_point_v<T> ? PixmatEncoding_Float
                                       : std::is_signed_v<T>       ? PixmatEncoding_Signed
                                                                   : PixmatEncoding_Unsigned;

template <class T>
Arithmetic::image image_of(const cv::Mat& m)
{
    const auto encoding = m.channels() == 2 ? PixmatEncoding_Complex_Float : encoding_of<T>;
    return {packed_layout(m.cols, m.rows, static_cast<int32_t>(8 * m.elemSize()), encoding), m.data};
}

template <class T>
cv::Mat random_frame(int size, uint32_t seed, int channels)
{
    cv::Mat m(size, size, CV_MAKETYPE(cv_depth<T>, channels));
    auto* const p = m.ptr<T>();
    for (size_t i = 0; i < m.total() * static_cast<size_t>(channels); ++i) {
        seed = seed * 1664525u + 1013904223u;
        p[i] = static_cast<T>(1 + (seed >> 16) % 100); // no zero divisors
    }
    return m;
}

struct frames {
    cv::Mat a, b, dst;
};

/// One set of frames for each type and size, made at first use.
template <class T, int Channels = 1>
frames& frames_of(int size)
{
    static std::map<int, frames> sets;
    frames& f = sets[size];
    if (f.a.empty())
        f = {random_frame<T>(size, 1, Channels), random_frame<T>(size, 2, Channels),
             cv::Mat(size, size, CV_MAKETYPE(cv_depth<T>, Channels))};
    return f;
}

size_t pixels_of(int size) { return static_cast<size_t>(size) * static_cast<size_t>(size); }

/// Frames that are there once they are looked at.
struct lazy_frames {
    int size;
    frames& (*get)(int size);

    frames* operator->() const { return &get(size); }
};

struct operation_case {
    const char* name;
    method m;
    void (*peer)(const cv::Mat&, const cv::Mat&, cv::Mat&);
    const char* peer_name;
};

const operation_case operations[] = {
    {"Add", method::add, [](const cv::Mat& a, const cv::Mat& b, cv::Mat& d) { cv::add(a, b, d); }, "add"},
    {"Subtract", method::subtract,
     [](const cv::Mat& a, const cv::Mat& b, cv::Mat& d) { cv::subtract(a, b, d); }, "subtract"},
    {"Multiply", method::multiply,
     [](const cv::Mat& a, const cv::Mat& b, cv::Mat& d) { cv::multiply(a, b, d); }, "multiply"},
    {"Divide", method::divide, [](const cv::Mat& a, const cv::Mat& b, cv::Mat& d) { cv::divide(a, b, d); },
     "divide"},
    {"Min", method::min, [](const cv::Mat& a, const cv::Mat& b, cv::Mat& d) { cv::min(a, b, d); }, "min"},
};

/// The operation on small positive values, where no mode matters but for narrow types and negative differences.
template <class T>
T expected(method m, T a, T b, int rounding)
{
    double v = 0;
    switch (m) {
    case method::add: v = double(a) + double(b); break;
    case method::subtract: v = double(a) - double(b); break;
    case method::multiply: v = double(a) * double(b); break;
    case method::divide: v = double(a) / double(b); break;
    default: v = std::min(double(a), double(b));
    }
    using limits = std::numeric_limits<T>;
    if constexpr (std::is_floating_point_v<T>)
        return static_cast<T>(rounding == saturate && m != method::min ? std::clamp(v, 0.0, 1.0) : v);
    else if (rounding == saturate && m != method::min)
        return v < 0 && !std::is_signed_v<T>
                   ? limits::max()
                   : static_cast<T>(std::clamp(std::trunc(v), double(limits::min()), double(limits::max())));
    else
        return static_cast<T>(static_cast<int64_t>(v));
}

template <class T>
void register_images(const operation_case& op, const std::string& type, int size)
{
    const lazy_frames f{size, frames_of<T>};
    const size_t pixels = pixels_of(size);
    for (const int rounding : {wrap, saturate}) {
        if (op.m == method::min && rounding == saturate) continue; // one loop for both
        const std::string name = std::string(op.name) + "/" + type +
                                 (rounding == wrap ? "-wrap/" : "-saturate/") + std::to_string(size);
        const auto work = [f, op, rounding] {
            Arithmetic::combine(op.m, rounding, image_of<T>(f->a), image_of<T>(f->b), image_of<T>(f->dst));
        };
        zelt_bench::register_case(
            name,
            [=] {
                work();
                for (int y = 0; y < f->a.rows; ++y)
                    for (int x = 0; x < f->a.cols; ++x)
                        if (f->dst.at<T>(y, x) !=
                            expected<T>(op.m, f->a.at<T>(y, x), f->b.at<T>(y, x), rounding))
                            return false;
                return true;
            },
            work);
        zelt_bench::register_copy(name, pixels * sizeof(T) * 3 / 2);
        zelt_bench::register_peer(name, op.peer_name, [f, op] { op.peer(f->a, f->b, f->dst); });
    }
}

template <class T>
void register_number(const std::string& type, int size, Arithmetic::number n, const char* kind)
{
    const lazy_frames f{size, frames_of<T>};
    const size_t pixels = pixels_of(size);
    for (const auto& [what, m] :
         {std::pair{"Add", method::add}, {"Multiply", method::multiply}, {"Divide", method::divide}}) {
        const std::string name = std::string(what) + "/" + type + "-" + kind + "/" + std::to_string(size);
        const auto work = [=, m = m] {
            Arithmetic::combine(m, wrap, image_of<T>(f->a), n, image_of<T>(f->dst));
        };
        const auto value = [n, m = m](double a) {
            return m == method::add ? a + n.real : m == method::multiply ? a * n.real : a / n.real;
        };
        zelt_bench::register_case(
            name,
            [=] {
                work();
                for (int x = 0; x < size; ++x)
                    if (f->dst.at<T>(1, x) != static_cast<T>(value(double(f->a.at<T>(1, x))))) return false;
                return true;
            },
            work);
        zelt_bench::register_copy(name, pixels * sizeof(T));
        if (m == method::add)
            zelt_bench::register_peer(name, "add", [=] { cv::add(f->a, cv::Scalar(n.real), f->dst); });
        else if (m == method::multiply)
            zelt_bench::register_peer(name, "multiply", [=] { cv::multiply(f->a, n.real, f->dst); });
        else
            zelt_bench::register_peer(name, "divide", [=] { cv::divide(f->a, n.real, f->dst); });
    }
}

void register_mixed(int size)
{
    const lazy_frames f{size, frames_of<uint8_t>}, real{size, frames_of<float>};
    const std::string name = "Add/u8-plus-f32/" + std::to_string(size);
    const auto work = [=] {
        Arithmetic::combine(method::add, saturate, image_of<uint8_t>(f->a), image_of<float>(real->b),
                            image_of<uint8_t>(f->dst));
    };
    zelt_bench::register_case(
        name,
        [=] {
            work();
            return f->dst.at<uint8_t>(3, 5) ==
                   f->a.at<uint8_t>(3, 5) + static_cast<int>(real->b.at<float>(3, 5));
        },
        work);
    zelt_bench::register_copy(name, pixels_of(size) * 3);
    zelt_bench::register_peer(name, "add", [=] { cv::add(f->a, real->b, f->dst, cv::noArray(), CV_8U); });
}

void register_complex(int size)
{
    const lazy_frames f{size, frames_of<float, 2>};
    const std::string name = "Multiply/complex/" + std::to_string(size);
    const auto work = [f] {
        Arithmetic::combine(method::multiply, wrap, image_of<float>(f->a), image_of<float>(f->b),
                            image_of<float>(f->dst));
    };
    zelt_bench::register_case(
        name,
        [=] {
            work();
            const auto p = f->a.at<cv::Vec2f>(3, 5), q = f->b.at<cv::Vec2f>(3, 5),
                       r = f->dst.at<cv::Vec2f>(3, 5);
            return r[0] == p[0] * q[0] - p[1] * q[1] && r[1] == p[1] * q[0] + p[0] * q[1];
        },
        work);
    zelt_bench::register_copy(name, pixels_of(size) * 12);
    zelt_bench::register_peer(name, "mulSpectrums", [f] { cv::mulSpectrums(f->a, f->b, f->dst, 0); });
}

/// Small images of the library, and the facet. Made at first use: before main() no class is registered.
struct facet_call {
    static com_ptr<IPixmat2> image()
    {
        com_ptr<IPixmat2> i;
        CheckHResult(CreateImageFromLayout(packed_layout(16, 16, 8, PixmatEncoding_Unsigned), i.put()));
        return i;
    }
    static facet_call& get()
    {
        static facet_call call;
        return call;
    }
    HRESULT add(const VARIANT& number, IPixmat2* output, IPixmat2** out)
    {
        return facet->Add(a.get(), number, output, out);
    }

    com_ptr<IBasicOps2> facet{make<CBasic2>()};
    com_ptr<IPixmat2> a = image(), b = image(), dst = image(), result;
    variant second{b.get()}, three{3};
};

/// What a call costs beside its pixels: through the interface, on 16 x 16, into a given output and a new one.
void register_facet()
{
    const auto add = [](const std::string& name, auto call) {
        zelt_bench::register_case(
            name, [=] { return call(facet_call::get()) == S_OK; }, [=] { call(facet_call::get()); });
    };
    add("Facet/given-output/16", [](facet_call& f) { return f.add(*f.second.get(), f.dst.get(), nullptr); });
    add("Facet/number/16", [](facet_call& f) { return f.add(*f.three.get(), f.dst.get(), nullptr); });
    add("Facet/new-output/16", [](facet_call& f) { return f.add(*f.second.get(), nullptr, f.result.put()); });
    const cv::Mat x(16, 16, CV_8U, cv::Scalar(1)), y(16, 16, CV_8U, cv::Scalar(2));
    const auto d = std::make_shared<cv::Mat>(16, 16, CV_8U);
    zelt_bench::register_peer("Facet/given-output/16", "add", [=] { cv::add(x, y, *d); });
}

const bool registered = [] {
    for (const int size : {256, 4096}) {
        for (const auto& op : operations) {
            register_images<uint8_t>(op, "u8", size);
            register_images<uint16_t>(op, "u16", size);
            register_images<int16_t>(op, "i16", size);
            register_images<float>(op, "f32", size);
        }
        register_number<uint8_t>("u8", size, {Arithmetic::storage::i32, 3, 0}, "I4");
        register_number<uint16_t>("u16", size, {Arithmetic::storage::i32, 3, 0}, "I4");
        register_number<uint16_t>("u16", size, {Arithmetic::storage::f64, 0.5, 0}, "R8");
        register_number<float>("f32", size, {Arithmetic::storage::f64, 0.5, 0}, "R8");
        register_number<float>("f32", size, {Arithmetic::storage::f64, 0.1, 0}, "R8-inexact");
        register_mixed(size);
        register_complex(size);
    }
    register_facet();
    return true;
}();

} // namespace
