#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/geometry.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {
constexpr std::tuple<> geometric_rows;
constexpr std::tuple<> geometric2_rows;
} // namespace

template <>
const interface_info& table_of<IGeometric>() noexcept
{
    return interface_table<IGeometric, geometric_rows>::info("first-generation geometry");
}

template <>
const interface_info& table_of<IGeometric2>() noexcept
{
    return interface_table<IGeometric2, geometric2_rows>::info("geometry");
}

} // namespace Qor
