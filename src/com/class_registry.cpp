#include "zelt/com/class_registry.h"

#include "com/held_over_fork.h"
#include "com/implements.h"
#include "com/known_classes.h"
#include "com/module_use.h"

#include <atomic>
#include <new>

namespace Qor {

constinit std::atomic<LONG> live_objects{0};

namespace {

// Ready before any constructor of a static object runs, in whatever order those come.
constinit std::mutex registry_mutex;
const held_over_fork<registry_mutex> registry_is_fork_safe;
constinit class_registration* first = nullptr;
constinit std::atomic<LONG> server_locks{0};

constexpr uint32_t in_process = 3; // servers and handlers

template <class Test>
const class_entry* find(Test test) noexcept
{
    const std::lock_guard lock(registry_mutex);
    for (const class_registration* r = first; r; r = r->next())
        if (test(r->entry())) return &r->entry();
    return nullptr;
}

constexpr wchar_t lower(wchar_t c) noexcept
{
    return c >= L'A' && c <= L'Z' ? static_cast<wchar_t>(c + 32) : c;
}

bool same_name(const OLECHAR* name, const char* known) noexcept
{
    if (!known) return false;
    for (; *name && *known; ++name, ++known)
        if (lower(*name) != lower(static_cast<unsigned char>(*known))) return false;
    return !*name && !*known;
}

HRESULT create(const class_entry& entry, IUnknown* outer, const GUID& id, void** out) noexcept
{
    if (outer && id != IUnknown::iid) return CLASS_E_NOAGGREGATION;
    const HRESULT hr = entry.create(outer, id, out);
    if (failed(hr)) *out = nullptr;
    return hr;
}

class class_factory final : public implements<IClassFactory> {
public:
    explicit class_factory(const class_entry& entry) noexcept : entry_(entry) {}

    HRESULT CreateInstance(IUnknown* outer, const GUID& id, void** out) noexcept override
    {
        if (!out) return E_POINTER;
        *out = nullptr;
        return create(entry_, outer, id, out);
    }
    HRESULT LockServer(LONG lock) noexcept override
    {
        if (lock) {
            ++server_locks;
            return S_OK;
        }
        LONG locks = server_locks.load();
        do
            if (locks == 0) return E_UNEXPECTED;
        while (!server_locks.compare_exchange_weak(locks, locks - 1));
        return S_OK;
    }

private:
    const class_entry& entry_;
};

} // namespace

const class_entry* find_class(const GUID& class_id) noexcept
{
    return find([&](const class_entry& entry) { return entry.class_id == class_id; });
}

class_registration::class_registration(const class_entry& entry) noexcept : entry_(entry)
{
    const std::lock_guard lock(registry_mutex);
    next_ = std::exchange(first, this);
}

class_registration::~class_registration()
{
    const std::lock_guard lock(registry_mutex);
    class_registration** at = &first;
    while (*at != this) at = &(*at)->next_;
    *at = next_;
}

HRESULT CoCreateInstance(const GUID& class_id, IUnknown* outer, uint32_t context, const GUID& id,
                         void** out) noexcept
{
    if (!out) return E_POINTER;
    *out = nullptr;
    const class_entry* const entry = context & in_process ? find_class(class_id) : nullptr;
    return entry ? create(*entry, outer, id, out) : REGDB_E_CLASSNOTREG;
}

HRESULT CoGetClassObject(const GUID& class_id, uint32_t context, const GUID& id, void** out) noexcept
{
    if (!out) return E_POINTER;
    *out = nullptr;
    const class_entry* const entry = context & in_process ? find_class(class_id) : nullptr;
    if (!entry) return REGDB_E_CLASSNOTREG;
    const auto factory = com_ptr<IClassFactory>::attach(new (std::nothrow) class_factory(*entry));
    return factory ? factory->QueryInterface(id, out) : E_OUTOFMEMORY;
}

HRESULT CLSIDFromProgID(const OLECHAR* name, GUID* class_id) noexcept
{
    if (!class_id) return E_POINTER;
    *class_id = GUID_NULL;
    if (!name) return E_POINTER;
    const class_entry* const entry = find([&](const class_entry& known) {
        return same_name(name, known.prog_id) || same_name(name, known.version_free_id);
    });
    if (!entry) return CO_E_CLASSSTRING;
    *class_id = entry->class_id;
    return S_OK;
}

const char* prog_id_of(const GUID& class_id) noexcept
{
    const class_entry* const entry = find_class(class_id);
    return entry ? entry->version_free_id : nullptr;
}

LONG server_lock_count() noexcept { return server_locks.load(); }

} // namespace Qor
