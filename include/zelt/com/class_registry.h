// Classes that can be created by identifier or by name.
#pragma once

#include "zelt/com/dispatch.h"

namespace Qor {

inline constexpr uint32_t CLSCTX_ALL =
    23; ///< in-process, local and remote alike; every class here is in-process

/// An instance of a class known to this process: REGDB_E_CLASSNOTREG for an unknown one.
ZELT_API HRESULT CoCreateInstance(const GUID& class_id, IUnknown* outer, uint32_t context, const GUID& id,
                                  void** out) noexcept;
/// The factory of a class, usually asked for IClassFactory.
ZELT_API HRESULT CoGetClassObject(const GUID& class_id, uint32_t context, const GUID& id,
                                  void** out) noexcept;
/// "ZELT.Main2" or "ZELT.Main2.1" (case does not matter). CO_E_CLASSSTRING for an unknown name.
ZELT_API HRESULT CLSIDFromProgID(const OLECHAR* name, GUID* class_id) noexcept;

/// The version-independent name of a class, or null.
ZELT_API const char* prog_id_of(const GUID& class_id) noexcept;

/// One class, as its room describes it.
struct class_entry {
    GUID class_id;
    const char* prog_id;         ///< numbered, such as "ZELT.Main2.1"; null when created by identifier only
    const char* version_free_id; ///< "ZELT.Main2"
    const char* description;
    HRESULT (*create)(IUnknown* outer, const GUID& id, void** out) noexcept;
};

/// Adds a class for the life of the object; meant for static objects, one per class.
class class_registration {
public:
    ZELT_API explicit class_registration(const class_entry& entry) noexcept;
    ZELT_API ~class_registration();
    class_registration(const class_registration&) = delete;
    class_registration& operator=(const class_registration&) = delete;

    const class_entry& entry() const noexcept { return entry_; }
    class_registration* next() const noexcept { return next_; }

private:
    const class_entry& entry_;
    class_registration* next_ = nullptr;
};

} // namespace Qor
