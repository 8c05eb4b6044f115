#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/arithmetic.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {
constexpr std::tuple<> math_rows;
} // namespace

template <>
const interface_info& table_of<IMath>() noexcept
{
    return interface_table<IMath, math_rows>::info("mathematical functions of pixels");
}

} // namespace Qor
