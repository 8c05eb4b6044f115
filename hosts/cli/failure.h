// How commands fail: with a message for the person at the terminal.
#pragma once

#include <stdexcept>

namespace cli {

/// The work could not be done: exit status 1.
struct failure : std::runtime_error {
    using runtime_error::runtime_error;
};

/// The command was not understood: exit status 2.
struct usage_error : std::runtime_error {
    using runtime_error::runtime_error;
};

} // namespace cli
