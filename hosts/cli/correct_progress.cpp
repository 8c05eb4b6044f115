#include "correct_progress.h"

#include <algorithm>
#include <cstdio>
#include <unistd.h>

namespace cli {

progress_line::progress_line(size_t steps)
    : steps_(std::max<size_t>(steps, 1)), terminal_(isatty(STDERR_FILENO) != 0)
{
}

progress_line::~progress_line() { clear(); }

void progress_line::step(const std::string& what)
{
    constexpr size_t bar_width = 24;
    constexpr size_t name_width = 40; // the line must not wrap, or it could not be taken back
    if (!terminal_) return;
    const size_t filled = std::min(done_ * bar_width / steps_, bar_width);
    const std::string bar = std::string(filled, '=') + std::string(bar_width - filled, ' ');
    std::string name = what.size() <= name_width ? what : "..." + what.substr(what.size() - name_width + 3);
    std::replace_if(
        name.begin(), name.end(), [](unsigned char c) { return c < 32 || c == 127; }, '?');
    std::fprintf(stderr, "\r\033[K[%s] %zu/%zu %s", bar.c_str(), done_ + 1, steps_, name.c_str());
    std::fflush(stderr);
    ++done_;
}

void progress_line::clear()
{
    if (!terminal_ || done_ == 0) return;
    std::fputs("\r\033[K", stderr);
    std::fflush(stderr);
}

} // namespace cli
