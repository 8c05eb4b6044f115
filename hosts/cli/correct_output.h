// What a correction tells on the standard output: lines for people or JSON for programs.
#pragma once

#include "correct_job.h"

#include <memory>

namespace cli {

/// Frames as they are done; messages about files that were left out go to the standard error.
std::unique_ptr<correction_watcher> tell_as_text(const correct_options& options);

/// One object at the end: dark, flat, gain, exposures in their order (with "error" for those left out), and the
/// report's name unless it is empty.
std::unique_ptr<correction_watcher> tell_as_json(const std::string& report);

} // namespace cli
