// The facets of filters.
#pragma once

#include "frame/facet.h"
#include "threads/multi_threaded_pool.h"
#include "zelt/interfaces/filters.h"
#include "zelt/interfaces/zelt.h"

namespace Qor::Luxar::ZELT {

/// Some filters are made of other facets' operations and ask the root for them, as a client would. The root owns this
/// object and outlives every call on it that it made itself; nobody counts this pointer.
class CFilters2 : public rounding_facet<IFilters2> {
public:
    explicit CFilters2(IZELT2* root) noexcept : root_(root) {}

protected:
    IZELT2* root() const noexcept { return root_; }
    Thread::MultiThreadedPool& pool() noexcept { return pool_; }

private:
    IZELT2* root_;
    Thread::MultiThreadedPool pool_{0, nullptr};
};
using CFilters2Disp = scripting<CFilters2>;

class CFilters : public rounding_facet<IFilters> {
public:
    explicit CFilters(IZELT* root) noexcept : root_(root) {}

protected:
    IZELT* root() const noexcept { return root_; }

private:
    IZELT* root_;
};

} // namespace Qor::Luxar::ZELT
