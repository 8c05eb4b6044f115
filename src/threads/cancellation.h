// The process-wide request to stop. It is not aimed at any call: whichever cancellable operation looks next
// takes it, and it stays until one does.
#pragma once

#include <stdexcept>

namespace Qor::Luxar::ZELT {

class Cancelled : public std::runtime_error {
public:
    Cancelled() : std::runtime_error("ZELT call was cancelled") {}
};

void RequestCancel() noexcept;

/// Leaves the request standing.
bool IsCancelled() noexcept;

/// Takes the request, if there is one, and throws Cancelled.
void ThrowIfCancelled();

} // namespace Qor::Luxar::ZELT
