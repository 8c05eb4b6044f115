// The library's one log: a stream for the rare failure that needs a trace of its own. It writes to the sink
// that the host has set, and to nothing when there is none.
#pragma once

#include "zelt/debug_sink.h"

#include <array>
#include <cstddef>
#include <ostream>
#include <streambuf>

namespace Qor {

template <class Char>
class basic_debugbuf;
template <class Char>
class basic_dbgstream;

/// Collects characters and passes them on as zero-terminated pieces: at a newline, which belongs to the
/// piece, or when 255 are held. Flushing does nothing, and what the last piece leaves behind is dropped with
/// the buffer.
template <>
class basic_debugbuf<char> final : public std::streambuf {
protected:
    int_type overflow(int_type c) override;

private:
    std::array<char, 256> store_;
    std::size_t count_ = 0;
};

/// Writing allocates nothing, so that it is safe while std::bad_alloc is being handled.
template <>
class basic_dbgstream<char> final : public std::ostream {
public:
    basic_dbgstream() : std::ostream(nullptr) { rdbuf(&buffer_); }

private:
    basic_debugbuf<char> buffer_;
};

/// The stream of the library as the calling thread sees it: the characters held back and the format state are
/// the thread's own, so that lines of several threads do not mix and need no lock.
basic_dbgstream<char>& dbg();

} // namespace Qor
