// Where the library's debug stream goes. The library itself never prints.
#pragma once

#include "zelt/api.h"

namespace Qor {

/// Takes one piece of text: at most 255 characters and a terminating zero; a piece that ends a line has its
/// newline. Called on the thread that wrote the text, from several threads at once.
using debug_sink = void(const char* text, void* context) noexcept;

/// Sends the debug stream to a sink of the host from now on; null, the initial state, drops the text.
/// A piece that another thread is delivering during the call may still reach the previous sink, so a context
/// must outlive the work that can write. Throws std::bad_alloc.
ZELT_API void set_debug_sink(debug_sink* sink, void* context);

} // namespace Qor
