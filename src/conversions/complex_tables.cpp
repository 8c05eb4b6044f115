#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/complex.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {
constexpr std::tuple<> complexops_rows;
constexpr std::tuple<> complexops2_rows;
} // namespace

template <>
const interface_info& table_of<IComplexOps>() noexcept
{
    return interface_table<IComplexOps, complexops_rows>::info(
        "first-generation operations on complex images");
}

template <>
const interface_info& table_of<IComplexOps2>() noexcept
{
    return interface_table<IComplexOps2, complexops2_rows>::info("operations on complex images");
}

} // namespace Qor
