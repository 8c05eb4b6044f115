// The module as a component host sees it: four exported functions, and how a host that is not linked to the library
// finds them by the name of a class.
//
//     zelt::module module;
//     std::string why;
//     if (zelt::failed(module.open("ZELT.Main2", &why))) return complain(why);
//     Qor::com_ptr<zelt::IZELT2> root;
//     module.create(root);
//
// This header needs nothing of the library when it is linked. What such a host cannot use are the functions of the
// library's headers that are not inline: it talks through interfaces only, and failures are codes.
#pragma once

#include "zelt/com/dispatch.h"
#include "zelt/com/unknown.h"
#include "zelt/module_record.h"

#include <dlfcn.h>
#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <utility>

extern "C" {

/// The class object of a class, usually asked for IClassFactory: the roots ZELT, ZELT2 and ZELT2NoDispatch, Complex,
/// and what makes images: PixmatDescriptor, PixmatFactory, PixmatConverter.
/// Fails   CLASS_E_CLASSNOTAVAILABLE for another class, E_NOINTERFACE, E_POINTER.
ZELT_API Qor::HRESULT DllGetClassObject(const Qor::GUID& class_id, const Qor::GUID& id, void** out) noexcept;

/// S_OK when no object of the library is alive and IClassFactory::LockServer locks nothing, else S_FALSE. Drops the
/// calling thread's error information first; that of another thread counts as an object until it is taken.
ZELT_API Qor::HRESULT DllCanUnloadNow() noexcept;

/// Writes the registration record (module_record.h) for the file that this library was loaded from: for the machine
/// when root calls and XDG_DATA_HOME is not set, else for the user. The record appears whole or not at all and replaces
/// an older one.
/// Fails   REGDB_E_WRITEREGDB with a text that names the file and the reason. Only this and DllUnregisterServer read the
///         environment; nothing else in the library does.
ZELT_API Qor::HRESULT DllRegisterServer() noexcept;

/// Removes the record that DllRegisterServer would write. That there is none is no failure.
ZELT_API Qor::HRESULT DllUnregisterServer() noexcept;
}

namespace zelt {

/// A module found through its record and loaded. It is unloaded by unload() only: objects of it may be alive, and only
/// the host knows when it is done with it.
class module {
public:
    module() noexcept = default;
    module(module&& other) noexcept { *this = std::move(other); }
    module& operator=(module&& other) noexcept
    {
        std::swap(handle_, other.handle_);
        std::swap(class_id_, other.class_id_);
        std::swap(path_, other.path_);
        return *this;
    }

    /// Finds the first record that names a class and loads the module it tells.
    /// Fails   CO_E_CLASSSTRING         no record names the class
    ///         REGDB_E_READREGDB        a record before that cannot be read
    ///         REGDB_E_INVALIDVALUE     a record before that is damaged: it is not passed over, since it may have been
    ///                                  meant to come first
    ///         CO_E_DLLNOTFOUND         the library cannot be loaded
    ///         CO_E_ERRORINDLL          it has not the exports of a module
    /// `why`, if given, says so in words. Throws only std::bad_alloc.
    Qor::HRESULT open(std::string_view name, std::string* why = nullptr)
    {
        std::string ignored;
        std::string& text = why ? *why : ignored;
        for (const std::string& folder : data_folders()) {
            const std::string file = folder + '/' + std::string(record_name);
            std::string bytes, reason;
            const int error = read_file(file, bytes);
            if (error == ENOENT || error == ENOTDIR) continue;
            if (error != 0) {
                text = file + ": " + std::strerror(error);
                return Qor::REGDB_E_READREGDB;
            }
            module_record record;
            if (!read_record(bytes, record, reason)) {
                text = file + " is damaged, " + reason;
                return Qor::REGDB_E_INVALIDVALUE;
            }
            for (const recorded_class& c : record.classes)
                if (c.answers_to(name)) return load(record.path, c.class_id, text);
        }
        text = "no record names the class " + std::string(name);
        return Qor::CO_E_CLASSSTRING;
    }

    /// A class object of the module: of any of its classes, with a name or without.
    Qor::HRESULT class_object(const Qor::GUID& class_id, const Qor::GUID& id, void** out) const noexcept
    {
        const auto get = function<decltype(&DllGetClassObject)>("DllGetClassObject");
        return get ? get(class_id, id, out) : Qor::E_UNEXPECTED;
    }

    /// A new object of a class.
    template <class Interface>
    Qor::HRESULT create(const Qor::GUID& class_id, Qor::com_ptr<Interface>& object) const noexcept
    {
        Qor::com_ptr<Qor::IClassFactory> factory;
        const Qor::HRESULT hr = class_object(class_id, Qor::IClassFactory::iid, factory.put_void());
        if (Qor::failed(hr)) return hr;
        return factory->CreateInstance(nullptr, Interface::iid, object.put_void());
    }
    /// A new object of the class that was asked for by name.
    template <class Interface>
    Qor::HRESULT create(Qor::com_ptr<Interface>& object) const noexcept
    {
        return create(class_id_, object);
    }

    /// Unloads the module unless it is in use: S_FALSE then, and it stays.
    Qor::HRESULT unload() noexcept
    {
        if (!handle_) return Qor::S_OK;
        const Qor::HRESULT hr = function<decltype(&DllCanUnloadNow)>("DllCanUnloadNow")();
        if (hr != Qor::S_OK) return hr;
        dlclose(std::exchange(handle_, nullptr));
        return Qor::S_OK;
    }

    explicit operator bool() const noexcept { return handle_ != nullptr; }
    const std::string& path() const noexcept { return path_; }

private:
    /// An error of the system, or 0.
    static int read_file(const std::string& name, std::string& bytes)
    {
        const int file =
            ::open(name.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK); // a pipe must not stop the host
        if (file < 0) return errno;
        bytes.resize(most_record_bytes + 1);
        size_t filled = 0;
        int error = 0;
        while (filled < bytes.size()) {
            const ssize_t n = ::read(file, bytes.data() + filled, bytes.size() - filled);
            if (n == 0) break;
            if (n < 0 && errno == EINTR) continue;
            if (n < 0) {
                error = errno;
                break;
            }
            filled += static_cast<size_t>(n);
        }
        ::close(file);
        if (filled > most_record_bytes) error = EFBIG;
        bytes.resize(filled);
        return error;
    }

    template <class Function>
    Function function(const char* name) const noexcept
    {
        return handle_ ? reinterpret_cast<Function>(dlsym(handle_, name)) : nullptr;
    }

    Qor::HRESULT load(const std::string& path, const Qor::GUID& class_id, std::string& why)
    {
        module loaded;
        loaded.handle_ = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
        if (!loaded.handle_) {
            const char* const reason = dlerror();
            why = reason ? reason : path;
            return Qor::CO_E_DLLNOTFOUND;
        }
        for (const char* name : {"DllGetClassObject", "DllCanUnloadNow"}) {
            if (loaded.function<void*>(name)) continue;
            dlclose(loaded.handle_);
            why = path + " has no " + name;
            return Qor::CO_E_ERRORINDLL;
        }
        loaded.path_ = path;
        loaded.class_id_ = class_id;
        *this = std::move(loaded);
        return Qor::S_OK;
    }

    void* handle_ = nullptr;
    Qor::GUID class_id_{};
    std::string path_;
};

} // namespace zelt
