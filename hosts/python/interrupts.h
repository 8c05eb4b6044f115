// Ctrl-C while the library works.
#pragma once

#include "python.h"

namespace python {

/// True for the methods that look for a request to cancel.
bool can_be_cancelled(const interface_info& table);

/// For the length of a scope, an interrupt from the keyboard asks the library to cancel; then it goes to Python as ever.
/// Does something on the main thread only, where Python takes its signals, and not inside another watch.
class interrupt_watch {
public:
    explicit interrupt_watch(bool wanted) noexcept;
    ~interrupt_watch();
    interrupt_watch(const interrupt_watch&) = delete;
    interrupt_watch& operator=(const interrupt_watch&) = delete;

    /// Call it without the interpreter lock when the call is over: ends the watch, and takes back a request that nobody
    /// took. True when there was an interrupt.
    bool end() noexcept;

private:
    bool watching_;
};

} // namespace python
