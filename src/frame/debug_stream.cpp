#include "frame/debug_stream.h"

#include <atomic>
#include <memory>
#include <mutex>

namespace Qor {
namespace {

/// Sink and context are published together through one pointer, and records are never freed: a writer needs
/// no lock, which a process forked at the wrong moment could find taken for ever. A pair set again gets its
/// old record.
struct target {
    debug_sink* sink;
    void* context;
    std::unique_ptr<const target> older;
};

std::atomic<const target*> current_target{nullptr};

const target* record_of(debug_sink* sink, void* context)
{
    static std::mutex mutex;
    static const target* newest = nullptr;
    const std::lock_guard lock(mutex);
    for (const target* t = newest; t; t = t->older.get())
        if (t->sink == sink && t->context == context) return t;
    auto fresh = std::make_unique<target>(target{sink, context, nullptr});
    fresh->older.reset(newest);
    newest = fresh.release();
    return newest;
}

} // namespace

void set_debug_sink(debug_sink* sink, void* context)
{
    current_target.store(sink ? record_of(sink, context) : nullptr, std::memory_order_release);
}

std::streambuf::int_type basic_debugbuf<char>::overflow(int_type c)
{
    if (traits_type::eq_int_type(c, traits_type::eof())) return traits_type::not_eof(c);
    store_[count_++] = traits_type::to_char_type(c);
    if (store_[count_ - 1] == '\n' || count_ == store_.size() - 1) {
        store_[count_] = '\0';
        count_ = 0;
        if (const target* t = current_target.load(std::memory_order_acquire))
            t->sink(store_.data(), t->context);
    }
    return c;
}

basic_dbgstream<char>& dbg()
{
    static thread_local basic_dbgstream<char> stream;
    return stream;
}

} // namespace Qor
