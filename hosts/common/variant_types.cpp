#include "common/variant_types.h"

#include <strings.h>
#include <utility>

using namespace Qor;

namespace host {
namespace {

constexpr std::pair<const char*, VARTYPE> types[] = {
    {"VT_I1", VT_I1},   {"VT_UI1", VT_UI1}, {"VT_I2", VT_I2},   {"VT_UI2", VT_UI2}, {"VT_I4", VT_I4},
    {"VT_UI4", VT_UI4}, {"VT_I8", VT_I8},   {"VT_UI8", VT_UI8}, {"VT_R4", VT_R4},   {"VT_R8", VT_R8},
};

} // namespace

std::optional<VARTYPE> find_type(const std::string& wanted)
{
    for (const auto& [name, type] : types)
        if (strcasecmp(wanted.c_str(), name) == 0) return type;
    return {};
}

const char* type_name(VARTYPE wanted)
{
    for (const auto& [name, type] : types)
        if (type == wanted) return name;
    return nullptr;
}

} // namespace host
