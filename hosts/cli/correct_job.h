// The correction of a batch of exposures, apart from how it is told about.
#pragma once

#include "correct_measures.h"
#include "correct_references.h"
#include "image_file.h"

#include <optional>
#include <string>
#include <vector>

namespace cli {

struct correct_options {
    std::vector<std::string> exposures, darks, flats, shorts;
    double ratio = 0; ///< of the times of long and short exposures
    gain_options gain;
    std::optional<Qor::Luxar::rectangle> area; ///< where evenness is looked at
    bool as_float = false;
    read_options reading;
    std::string output;
};

/// What the dark and flat frames gave.
struct correction_basis {
    const references* refs;
    const lit_area* lit; ///< null without flat frames
    image_layout format;
    int darks = 0, flats = 0;
    frame_numbers dark;
    double light_mean = 0;
    /// Of the first flat frame, before and after it was corrected with the gain of the other ones, so that the gain
    /// is judged by a frame that it does not know. NaN when there are no two flat frames, or no gain.
    unevenness flat_before, flat_after;
};

struct corrected_frame {
    std::string name; ///< of the exposure, with its page where there are several
    std::string output;
    image_layout format;
    frame_numbers raw, corrected;
    unevenness before, after; ///< of raw less dark, and corrected; NaN without flat frames
    size_t saturated = 0;     ///< pixels of a long exposure that the short one stands in for
    size_t limited = 0;       ///< pixels that got too bright for the format
};

/// Hears what happens, in this order: the basis, then each frame or failed file.
class correction_watcher {
public:
    virtual ~correction_watcher() = default;
    virtual void start(const correction_basis&) {}
    virtual void frame(const corrected_frame&, IPixmat2* raw, IPixmat2* corrected) = 0;
    /// A file was left out; the message names it.
    virtual void failed(const std::string& file, const std::string& message) = 0;
    virtual void finish() {}
};

/// Files that were left out do not stop the others; how many there were comes back. Throws failure, usage_error or
/// zelt::error for what spoils the whole batch. Holds one frame at a time, beside references and sums.
size_t correct(const correct_options& options, const std::vector<correction_watcher*>& watchers);

} // namespace cli
