#include "correct_frames.h"

#include "correct_pixels.h"

#include <cmath>
#include <type_traits>

using namespace Qor::Luxar;

namespace cli {
namespace {

std::string describe(const image_layout& l)
{
    return std::to_string(l.width) + " x " + std::to_string(l.height) + " " + format_name(l);
}

/// Adds a frame to the sums `sign` times.
template <class Sums>
void accumulate(Sums& sums, IPixmat2* frame, int sign)
{
    using S = typename Sums::value_type;
    pixel_rows rows(frame);
    const int width = rows.layout().width;
    with_pixel_type(rows.layout(), [&]<class T>(T) {
        S* sum = sums.data();
        for (int y = 0; y < rows.layout().height; ++y, sum += width)
            for_pixels<T>(rows.row(y), width,
                          [=](int x, T value) { sum[x] += static_cast<S>(value) * static_cast<S>(sign); });
    });
}

/// Halves go to the even neighbour: the mean of two frames would else be a quarter of a count too high everywhere.
template <class T, class S>
T rounded_mean(S sum, int count)
{
    if constexpr (std::is_same_v<T, uint16_t>) {
        const auto whole = static_cast<int64_t>(sum) / count;
        const int64_t twice_rest = 2 * (static_cast<int64_t>(sum) - whole * count);
        const bool up = twice_rest > count || (twice_rest == count && whole % 2 == 1);
        return static_cast<T>(whole + up);
    } else {
        return static_cast<T>(static_cast<double>(sum) / count);
    }
}

} // namespace

image_layout working_layout(const image_layout& frame)
{
    const int bytes = pixel_bytes(frame);
    if (frame.encoding == PixmatEncoding_Unsigned && bytes <= 2)
        return packed_layout(frame.width, frame.height, 16, PixmatEncoding_Unsigned);
    const bool exact_in_float = frame.encoding == PixmatEncoding_Float ? bytes == 4 : bytes <= 2;
    return packed_layout(frame.width, frame.height, exact_in_float ? 32 : 64, PixmatEncoding_Float);
}

void frame_format::require(IPixmat2* frame, const std::string& name)
{
    const image_layout l = layout_of(frame);
    if (name_.empty()) {
        try {
            with_pixel_type(l, [](auto) {});
        } catch (const failure& f) {
            throw failure(name + ": " + f.what());
        }
        if (l.width < 1 || l.height < 1) throw failure(name + ": has no pixels");
        layout_ = l;
        name_ = name;
    }
    if (l.width == layout_.width && l.height == layout_.height && l.encoding == layout_.encoding &&
        pixel_bytes(l) == pixel_bytes(layout_))
        return;
    throw failure(name + ": is " + describe(l) + ", but " + name_ + " is " + describe(layout_));
}

void frame_sum::add(IPixmat2* frame)
{
    const image_layout l = layout_of(frame);
    if (count_ == 0) {
        layout_ = l;
        const size_t pixels = static_cast<size_t>(l.width) * static_cast<size_t>(l.height);
        if (l.encoding == PixmatEncoding_Float)
            sums_ = std::vector<double>(pixels);
        else
            sums_ = std::vector<int64_t>(pixels);
    }
    std::visit([&](auto& sums) { accumulate(sums, frame, 1); }, sums_);
    ++count_;
}

com_ptr<IPixmat2> frame_sum::mean() const { return mean_of(sums_, count_); }

com_ptr<IPixmat2> frame_sum::mean_without(IPixmat2* frame) const
{
    auto others = sums_;
    std::visit([&](auto& sums) { accumulate(sums, frame, -1); }, others);
    return mean_of(others, count_ - 1);
}

com_ptr<IPixmat2> frame_sum::mean_of(const std::variant<std::vector<int64_t>, std::vector<double>>& sums,
                                     int count) const
{
    const image_layout w = working_layout(layout_);
    const new_image mean(w.width, w.height, w.bits, w.encoding);
    std::visit(
        [&](const auto& s) {
            with_pixel_type(mean.layout, [&]<class T>(T) {
                for (size_t i = 0; i < s.size(); ++i) {
                    const T value = rounded_mean<T>(s[i], count);
                    std::memcpy(mean.data + i * sizeof(T), &value, sizeof value);
                }
            });
        },
        sums);
    return mean.image;
}

} // namespace cli
