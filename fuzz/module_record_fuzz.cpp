// The reader of registration records: any bytes are a record with a path and identified classes, or a reason.
#include "zelt/module_record.h"

#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    zelt::module_record record;
    std::string why;
    const std::string_view text(reinterpret_cast<const char*>(data), size);
    if (!zelt::read_record(text, record, why)) return why.find("line ") == 0 ? 0 : (std::abort(), 0);
    if (record.path.empty() || record.path[0] != '/' || record.path.find('\0') != record.path.npos)
        std::abort();
    for (const zelt::recorded_class& c : record.classes)
        if (c.class_id == Qor::GUID_NULL && text.find("00000000") == text.npos) std::abort();
    return 0;
}
