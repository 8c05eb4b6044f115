#include "codecs.h"

#include "failure.h"

#include <zelt/com/bstr.h>

#include <dlfcn.h>
#include <unistd.h>

namespace cli {

#ifdef ZELT_CODECS_LINKED

const codec_table& codecs() { return *zelt_codec_table(); }

#else

namespace {

/// In the folder zelt beside the library, where it is installed, or beside it. The bare name when the library's own
/// place cannot be told.
std::string path_near_library(const std::string& name)
{
    Dl_info info = {};
    if (!dladdr(reinterpret_cast<const void*>(&Qor::SysFreeString), &info) || !info.dli_fname) return name;
    const std::string library = info.dli_fname;
    const size_t slash = library.rfind('/');
    if (slash == std::string::npos) return name;
    const std::string folder = library.substr(0, slash + 1), installed = folder + "zelt/" + name;
    return access(installed.c_str(), F_OK) == 0 ? installed : folder + name;
}

} // namespace

const codec_table& codecs()
{
    static const codec_table* table = nullptr;
    if (table) return *table;
    // Never unloaded: the codecs leave threads and handlers behind.
    void* const module = dlopen(path_near_library(codec_module_name).c_str(), RTLD_NOW);
    if (!module) throw failure(std::string("the image codecs cannot be loaded: ") + dlerror());
    const auto entry = reinterpret_cast<codec_entry*>(dlsym(module, codec_entry_name));
    if (!entry) throw failure(std::string("the image codecs cannot be loaded: ") + dlerror());
    table = entry();
    return *table;
}

#endif

} // namespace cli
