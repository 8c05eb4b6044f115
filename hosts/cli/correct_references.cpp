#include "correct_references.h"

#include "correct_frames.h"
#include "correct_measures.h"
#include "correct_pixels.h"
#include "failure.h"

#include <algorithm>
#include <cmath>

using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;

namespace cli {
namespace {

const com_ptr<IZELT2>& root()
{
    static const com_ptr<IZELT2> object = zelt::create<IZELT2>("ZELT.Main2");
    return object;
}

com_ptr<IPixmat2> like(const image_layout& l, int bits, PixmatEncoding encoding)
{
    return zelt::new_image(l.width, l.height, bits, encoding);
}

} // namespace

com_ptr<IPixmat2> recoded(IPixmat2* image, int bits, PixmatEncoding encoding)
{
    static const com_ptr<IConversions2> facet = zelt::get(root(), &IZELT2::get_Conversions);
    com_ptr<IPixmat2> out = like(layout_of(image), bits, encoding);
    zelt::call(facet, &IConversions2::Recode, out, image);
    return out;
}

references::references(IPixmat2* dark, IPixmat2* flat, const gain_options& options)
    : layout_(layout_of(dark)), options_(options), facet_(zelt::get(root(), &IZELT2::get_FlatFielding))
{
    const bool words = layout_.encoding == PixmatEncoding_Unsigned;
    if (options.kind == gain_kind::fixed && !words)
        throw failure("a fixed-point gain needs Unsigned frames of at most 16 bits");
    dark_ = zelt::call(facet_, &IFlatFielding::ToDarkRefEx, dark, layout_.encoding);
    if (!flat) return;

    // Less dark as a signed number, since a dead pixel may well be darker in the flat frames.
    light_ = subtracted(flat);
    if (options.kind == gain_kind::none) return;
    norm_ = norm_of(options);
    if (options.kind == gain_kind::real) {
        gain_ = new_float();
        zelt::call(facet_, &IFlatFielding::ToGainRef, gain_, light_, norm_);
    } else {
        gain_ = like(layout_, 16, PixmatEncoding_Unsigned);
        zelt::call(facet_, &IFlatFielding::ToGainRef, gain_, above_dark(flat), norm_, options.scale);
    }

    const double highest = options.kind == gain_kind::real ? highest_gain() : 0xFFFF;
    real_rows rows(gain_.get());
    for (int y = 0; y < rows.height(); ++y) {
        const double* row = rows.row(y);
        for (int x = 0; x < rows.width(); ++x) at_highest_ += row[x] >= highest;
    }
}

double references::norm_of(const gain_options& options) const
{
    if (options.norm == norm_kind::value) return options.norm_value;
    const double norm = options.norm == norm_kind::lit ? lit_area(light_.get()).mean(light_.get())
                                                       : finite_mean(light_.get());
    if (!(norm > 0) || std::isinf(norm)) throw failure("the flat frames are not brighter than the dark ones");
    return norm;
}

double references::gain_unit() const noexcept
{
    return options_.kind == gain_kind::fixed ? std::ldexp(1.0, 16 - options_.scale) : 1.0;
}

double references::highest_gain() const noexcept
{
    constexpr double highest_real = 50; // the library's, of pixels that saw no light
    return options_.kind == gain_kind::fixed ? 0xFFFF / gain_unit() : highest_real;
}

com_ptr<IPixmat2> references::new_float() const
{
    return like(layout_, layout_.encoding == PixmatEncoding_Float ? layout_.bits : 32, PixmatEncoding_Float);
}

com_ptr<IPixmat2> references::working(IPixmat2* frame) const
{
    const image_layout l = layout_of(frame);
    if (l.encoding == layout_.encoding && pixel_bytes(l) == pixel_bytes(layout_))
        return com_ptr<IPixmat2>(frame);
    return recoded(frame, layout_.bits, layout_.encoding);
}

com_ptr<IPixmat2> references::subtracted(IPixmat2* frame) const
{
    com_ptr<IPixmat2> out = new_float();
    zelt::call(facet_, &IFlatFielding::Flatten, out, working(frame), dark_);
    return out;
}

com_ptr<IPixmat2> references::above_dark(IPixmat2* frame) const
{
    com_ptr<IPixmat2> out = like(layout_, 16, PixmatEncoding_Unsigned);
    zelt::call(facet_, &IFlatFielding::Flatten, out, working(frame), dark_);
    return out;
}

com_ptr<IPixmat2> references::corrected(IPixmat2* frame, bool as_float) const
{
    com_ptr<IPixmat2> out;
    if (options_.kind == gain_kind::none || !gain_) {
        out = subtracted(frame);
    } else if (options_.kind == gain_kind::real) {
        // Into Float and then to integers: straight into integers, a pixel below the dark reference would wrap.
        out = new_float();
        zelt::call(facet_, &IFlatFielding::Flatten, out, working(frame), dark_, gain_);
    } else {
        // The dark first, where it is limited to 0, then the gain, where 32 bits hold every product.
        const com_ptr<IPixmat2> light = above_dark(frame);
        const com_ptr<IPixmat2> nothing = like(layout_, 16, PixmatEncoding_Unsigned);
        out = like(layout_, 32, PixmatEncoding_Signed);
        zelt::call(facet_, &IFlatFielding::Flatten, out, light, nothing, gain_, options_.scale);
    }
    const image_layout wanted = as_float ? layout_of(new_float().get()) : layout_of(frame);
    const image_layout got = layout_of(out.get());
    if (got.encoding == wanted.encoding && got.bits == wanted.bits) return out;
    return recoded(out.get(), wanted.bits, wanted.encoding);
}

com_ptr<IPixmat2> references::merged(IPixmat2* long_exposure, IPixmat2* short_exposure, double ratio,
                                     bool as_float) const
{
    com_ptr<IPixmat2> gain = gain_;
    if (!gain) {
        // Without a gain the library takes the exposures the other way round; a gain of 1 merges like any other.
        const new_image ones(layout_.width, layout_.height, 32, PixmatEncoding_Float);
        const size_t pixels = ones.row_bytes / sizeof(float) * static_cast<size_t>(layout_.height);
        std::fill_n(reinterpret_cast<float*>(ones.data), pixels, 1.0F);
        gain = ones.image;
    }
    com_ptr<IPixmat2> out = like(layout_, 32, PixmatEncoding_Signed);
    zelt::call(facet_, &IFlatFielding::FlattenDouble, out, long_exposure, short_exposure, ratio, dark_, gain,
               options_.scale);
    return as_float ? recoded(out.get(), 32, PixmatEncoding_Float) : out;
}

} // namespace cli
