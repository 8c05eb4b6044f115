// A line that tells how far a long job is, for a person at a terminal and for nobody else.
#pragma once

#include <string>

namespace cli {

class progress_line {
public:
    /// Shows nothing when the standard error is no terminal.
    explicit progress_line(size_t steps);
    ~progress_line();
    progress_line(const progress_line&) = delete;
    progress_line& operator=(const progress_line&) = delete;

    /// One more step begins.
    void step(const std::string& what);
    /// Makes room for other output.
    void clear();

private:
    size_t steps_;
    size_t done_ = 0;
    bool terminal_;
};

} // namespace cli
