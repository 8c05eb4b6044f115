#include "threads/single_threaded_pool.h"

namespace Qor::Luxar::Thread {

void SingleThreadedPool::parallel(range indices, const parallel_body& body)
{
    const ThreadInformation here{0};
    const double start = indices.start;
    const double step = 1.0 / (indices.end - start);
    for (int32_t i = indices.start; i < indices.end; ++i) {
        body(i, here);
        if (!observer_) continue;
        observer_->Progress((i - start + 1) * step);
        if (observer_->IsStopped()) break;
    }
}

} // namespace Qor::Luxar::Thread
