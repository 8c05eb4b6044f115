#include "codecs.h"

#include "failure.h"

#include <dlfcn.h>

namespace cli {

#ifdef ZELT_CODECS_LINKED

const codec_table& codecs() { return *zelt_codec_table(); }

#else

const codec_table& codecs()
{
    static const codec_table* table = nullptr;
    if (table) return *table;
    // Found where the program finds libzelt. Never unloaded: the codecs leave threads and handlers behind.
    void* const module = dlopen(codec_module_name, RTLD_NOW);
    if (!module) throw failure(std::string("the image codecs cannot be loaded: ") + dlerror());
    const auto entry = reinterpret_cast<codec_entry*>(dlsym(module, codec_entry_name));
    if (!entry) throw failure(std::string("the image codecs cannot be loaded: ") + dlerror());
    table = entry();
    return *table;
}

#endif

} // namespace cli
