// From averaged dark and flat frames to the references, and from exposures to corrected images. All arithmetic on
// pixels is the library's; here stands which of its methods are put together so that nothing wraps.
#pragma once

#include "image_pixels.h"

#include <string>

namespace cli {

enum class gain_kind { none, real, fixed };

/// What a pixel of even light is corrected to.
enum class norm_kind { mean, lit, value };

struct gain_options {
    gain_kind kind = gain_kind::real;
    int scale = 1; ///< of a fixed-point gain: 2^scale is the highest
    norm_kind norm = norm_kind::mean;
    double norm_value = 0;
};

/// The image in another format, values rounded and limited to its range.
com_ptr<IPixmat2> recoded(IPixmat2* image, int bits, Qor::Luxar::PixmatEncoding encoding);

class references {
public:
    /// Averaged frames in the working format; `flat` may be null. failure when the flat frames hold no light.
    references(IPixmat2* dark, IPixmat2* flat, const gain_options& options);

    IPixmat2* dark() const noexcept { return dark_.get(); }
    /// Flat less dark as Float; null without flat frames.
    IPixmat2* light() const noexcept { return light_.get(); }
    /// Null without a gain.
    IPixmat2* gain() const noexcept { return gain_.get(); }
    double norm() const noexcept { return norm_; }
    /// What a stored gain of 1 is, and the highest one: pixels that have it are dead or unlit.
    double gain_unit() const noexcept;
    double highest_gain() const noexcept;
    size_t pixels_at_highest() const noexcept { return at_highest_; }

    /// The frame less the dark reference, as Float: negative values stay.
    com_ptr<IPixmat2> subtracted(IPixmat2* frame) const;
    /// In the frame's own format, limited to its range, or as Float.
    com_ptr<IPixmat2> corrected(IPixmat2* frame, bool as_float) const;
    /// Two exposures, the long one `ratio` times as long, as Signed 32 or Float.
    com_ptr<IPixmat2> merged(IPixmat2* long_exposure, IPixmat2* short_exposure, double ratio,
                             bool as_float) const;

private:
    double norm_of(const gain_options& options) const;
    com_ptr<IPixmat2> working(IPixmat2* frame) const;
    com_ptr<IPixmat2> above_dark(IPixmat2* frame) const;
    com_ptr<IPixmat2> new_float() const;

    image_layout layout_; ///< the working format
    gain_options options_;
    double norm_ = 0;
    size_t at_highest_ = 0;
    com_ptr<Qor::Luxar::ZELT::IFlatFielding> facet_;
    com_ptr<IPixmat2> dark_;
    com_ptr<IPixmat2> light_;
    com_ptr<IPixmat2> gain_;
};

} // namespace cli
