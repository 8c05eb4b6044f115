#include "zelt/module.h"

#include "com/known_classes.h"
#include "com/module_use.h"
#include "frame/operation.h"
#include "host/module_record.h"
#include "zelt/com/error_info.h"
#include "zelt/interfaces/zelt.h"

#include <cerrno>
#include <cstdlib>
#include <memory>

namespace Qor::Luxar::ZELT {
namespace {

/// What the module hands out, in the order of registration.
constexpr GUID object_map[] = {
    CLSID_ZELT,          CLSID_ZELT2,          CLSID_ZELT2NoDispatch, CLSID_Complex, CLSID_PixmatDescriptor,
    CLSID_PixmatFactory, CLSID_PixmatConverter};

constexpr GUID application_id = guid("5a1e0001-0301-4000-8000-00000000c0de");
constexpr GUID type_library_id = guid("5a1e0001-0302-4000-8000-00000000c0de");

[[noreturn]] void cannot_tell_path(const std::string& reason)
{
    throw HResultException(REGDB_E_WRITEREGDB, "cannot tell where the library lies: " + reason);
}

/// The file that this code was loaded from, by the name that it was loaded with: the link that a package keeps for all
/// versions with the same interfaces, not the file of one version behind it.
std::string own_path()
{
    Dl_info info{};
    if (!dladdr(&application_id, &info) || !info.dli_fname) cannot_tell_path("the loader does not say");
    const std::string name = info.dli_fname;
    const size_t slash = name.rfind('/');
    const std::string folder = slash == name.npos ? "." : name.substr(0, slash + 1);
    const std::unique_ptr<char, decltype(&std::free)> absolute(realpath(folder.c_str(), nullptr), &std::free);
    if (!absolute) cannot_tell_path(folder + ": " + std::strerror(errno));
    const std::string path = std::string(absolute.get()) + '/' + name.substr(slash + 1);
    if (access(path.c_str(), R_OK) != 0) cannot_tell_path(path + ": " + std::strerror(errno));
    for (const char c : path)
        if (static_cast<unsigned char>(c) < ' ' || c == 127)
            cannot_tell_path("a control character in its path");
    return path;
}

std::string text_of(const GUID& id)
{
    char text[39];
    guid_to_text(id, text);
    return text;
}

std::string own_record()
{
    std::string record = "# Where a host finds these classes. Written by DllRegisterServer, removed by "
                         "DllUnregisterServer.\n[Module]\nFormat=1\nName=ZELT\nPath=" +
                         own_path() + "\nAppID=" + text_of(application_id) +
                         "\n[TypeLib]\nTypeLibID=" + text_of(type_library_id) +
                         "\nName=ZELTLib\nVersion=1.0\nDescription=ZELT 1.0 Type Library\n";
    for (const GUID& id : object_map) {
        const class_entry* const entry = find_class(id);
        if (!entry || !entry->prog_id) continue; // without a name: created by its identifier only
        record += "[Class]\nClassID=" + text_of(id) + "\nProgID=" + entry->prog_id +
                  "\nVersionIndependentProgID=" + entry->version_free_id +
                  "\nDescription=" + entry->description +
                  "\nThreadingModel=Both\nProgrammable=true\nAppID=" + text_of(application_id) +
                  "\nTypeLib=" + text_of(type_library_id) + '\n';
    }
    return record;
}

} // namespace
} // namespace Qor::Luxar::ZELT

using namespace Qor;
using namespace Qor::Luxar::ZELT;

HRESULT DllGetClassObject(const GUID& class_id, const GUID& id, void** out) noexcept
{
    if (!out) return E_POINTER;
    *out = nullptr;
    for (const GUID& known : object_map)
        if (known == class_id) return CoGetClassObject(class_id, CLSCTX_ALL, id, out);
    return CLASS_E_CLASSNOTAVAILABLE;
}

HRESULT DllCanUnloadNow() noexcept
{
    // A host that is not linked to the library cannot take the texts of a failure, and they must not hold it.
    SetErrorInfo(0, nullptr);
    return live_objects.load() == 0 && server_lock_count() == 0 ? S_OK : S_FALSE;
}

HRESULT DllRegisterServer() noexcept
{
    return run_frame(GUID_NULL, [] {
        replace_file(record_to_write(), own_record());
        return S_OK;
    });
}

HRESULT DllUnregisterServer() noexcept
{
    return run_frame(GUID_NULL, [] {
        remove_file(record_to_write());
        return S_OK;
    });
}
