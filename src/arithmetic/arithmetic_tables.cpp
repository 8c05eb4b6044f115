#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/arithmetic.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {
constexpr std::tuple<> basic_rows;
constexpr std::tuple<> basic2_rows;
constexpr std::tuple<> math_rows;
} // namespace

template <>
const interface_info& table_of<IBasicOps>() noexcept
{
    return interface_table<IBasicOps, basic_rows>::info("first-generation arithmetic on images");
}

template <>
const interface_info& table_of<IBasicOps2>() noexcept
{
    return interface_table<IBasicOps2, basic2_rows>::info("arithmetic on images");
}

template <>
const interface_info& table_of<IMath>() noexcept
{
    return interface_table<IMath, math_rows>::info("mathematical functions of pixels");
}

} // namespace Qor
