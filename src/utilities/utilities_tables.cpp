#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/utilities.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {
constexpr std::tuple<> noise_rows;
constexpr std::tuple<> noise2_rows;
constexpr std::tuple<> miscellaneous_rows;
} // namespace

template <>
const interface_info& table_of<INoise>() noexcept
{
    return interface_table<INoise, noise_rows>::info("first-generation noise");
}

template <>
const interface_info& table_of<INoise2>() noexcept
{
    return interface_table<INoise2, noise2_rows>::info("noise");
}

template <>
const interface_info& table_of<IMiscellaneous>() noexcept
{
    return interface_table<IMiscellaneous, miscellaneous_rows>::info("miscellaneous tools");
}

} // namespace Qor
