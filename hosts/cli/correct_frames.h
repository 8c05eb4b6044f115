// Frames of one kind, added up exactly.
#pragma once

#include "image_pixels.h"

#include <string>
#include <variant>
#include <vector>

namespace cli {

/// The formats in which frames are corrected. Unsigned frames of at most 16 bits become Unsigned 16, where dark and
/// gain references may be of several types; all others Float, 32 bit where that holds every value exactly.
image_layout working_layout(const image_layout& frame);

/// The first frame of a run; all others must be like it.
class frame_format {
public:
    /// Takes the format of the first frame it sees. failure, naming both, for one of another size or pixel type;
    /// nominal depths within one storage size may differ.
    void require(IPixmat2* frame, const std::string& name);

    const image_layout& layout() const noexcept { return layout_; }

private:
    image_layout layout_{};
    std::string name_;
};

/// The sum of frames, exact for integers; for real pixels as exact as double is.
class frame_sum {
public:
    /// Frames of one format.
    void add(IPixmat2* frame);
    int count() const noexcept { return count_; }

    /// In the working format, integers rounded to the nearest, halves to the even one.
    com_ptr<IPixmat2> mean() const;
    /// The mean of the others, for one that was added. At least one other is needed.
    com_ptr<IPixmat2> mean_without(IPixmat2* frame) const;

private:
    com_ptr<IPixmat2> mean_of(const std::variant<std::vector<int64_t>, std::vector<double>>& sums,
                              int count) const;

    image_layout layout_{};
    int count_ = 0;
    std::variant<std::vector<int64_t>, std::vector<double>> sums_;
};

} // namespace cli
