// The page about a correction: pictures, histograms, profiles and numbers in one file that needs no other.
#pragma once

#include "correct_job.h"
#include "report_pictures.h"

#include <string>
#include <vector>

namespace cli {

class correction_report final : public correction_watcher {
public:
    /// Makes the folder, so that one that cannot be made is known before the work.
    correction_report(const std::string& folder, const correct_options& options);

    const std::string& file() const noexcept { return file_; }

    /// A picture of what a perfect camera had seen, shown beside the exposures.
    void set_truth(com_ptr<IPixmat2> truth) { truth_ = std::move(truth); }
    void set_introduction(const std::string& text) { introduction_ = text; }
    /// A number in large type, before those that every report has: what it is, before, after ("" if there is none), and a
    /// note.
    void add_tile(const std::string& name, const std::string& before, const std::string& after,
                  const std::string& note);

    void start(const correction_basis& basis) override;
    void frame(const corrected_frame& f, IPixmat2* raw, IPixmat2* corrected) override;
    void failed(const std::string& file, const std::string& message) override;
    void finish() override;

private:
    std::string figure_with(const std::string& title, IPixmat2* image, const std::string& note,
                            shades range) const;
    shades shades_of_lit(IPixmat2* image) const;
    std::string charts(IPixmat2* raw, IPixmat2* corrected) const;
    void add_row(const std::string& name, const std::string& kind, const frame_numbers& n,
                 const unevenness& u);
    std::string title() const;

    std::string file_;
    const correct_options& options_;
    const references* refs_ = nullptr;
    com_ptr<IPixmat2> truth_;
    int middle_ = 0; ///< the row of the profile
    const lit_area* lit_ = nullptr;
    size_t shown_ = 0, corrected_ = 0;
    std::string introduction_, tiles_, own_tiles_, reference_figures_, exposures_, rows_, failures_;
};

} // namespace cli
