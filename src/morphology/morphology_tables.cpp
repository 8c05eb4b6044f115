#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/morphology.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {
constexpr std::tuple<> morphology_rows;
} // namespace

template <>
const interface_info& table_of<IMorphology>() noexcept
{
    return interface_table<IMorphology, morphology_rows>::info("morphology");
}

} // namespace Qor
