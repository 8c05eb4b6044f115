#include "com/describe.h"
#include "com/implements.h"
#include "zelt/interfaces/fourier.h"

namespace Qor {
using namespace Luxar::ZELT;
namespace {
constexpr std::tuple<> transforms_rows;
constexpr std::tuple<> transforms2_rows;
constexpr std::tuple<> fourier_rows;
} // namespace

template <>
const interface_info& table_of<ITransforms>() noexcept
{
    return interface_table<ITransforms, transforms_rows>::info("first-generation Fourier transforms");
}

template <>
const interface_info& table_of<ITransforms2>() noexcept
{
    return interface_table<ITransforms2, transforms2_rows>::info("Fourier transforms");
}

template <>
const interface_info& table_of<IFourier>() noexcept
{
    return interface_table<IFourier, fourier_rows>::info("operators on spectra");
}

} // namespace Qor
