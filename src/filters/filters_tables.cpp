#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/filters.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {
constexpr std::tuple<> filters_rows;
constexpr std::tuple<> filters2_rows;
} // namespace

template <>
const interface_info& table_of<IFilters>() noexcept
{
    return interface_table<IFilters, filters_rows>::info("first-generation filters");
}

template <>
const interface_info& table_of<IFilters2>() noexcept
{
    return interface_table<IFilters2, filters2_rows>::info("filters");
}

} // namespace Qor
