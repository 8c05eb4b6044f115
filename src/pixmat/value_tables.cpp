// The value interfaces as data.
#include "com/describe.h"
#include "com/implements.h"
#include "zelt/pixmat/values.h"

namespace Qor {
namespace {

using namespace Luxar;

constexpr std::tuple coordinate_int_rows{
    get<&ICoordinateInt::get_X>("X", "column", result("value")),
    put<&ICoordinateInt::put_X>("X", "column", in("value")),
    get<&ICoordinateInt::get_Y>("Y", "row", result("value")),
    put<&ICoordinateInt::put_Y>("Y", "row", in("value")),
};
constexpr std::tuple coordinate_float_rows{
    get<&ICoordinateFloat::get_X>("X", "horizontal position in pixels", result("value")),
    put<&ICoordinateFloat::put_X>("X", "horizontal position in pixels", in("value")),
    get<&ICoordinateFloat::get_Y>("Y", "vertical position in pixels", result("value")),
    put<&ICoordinateFloat::put_Y>("Y", "vertical position in pixels", in("value")),
};
constexpr std::tuple rectangle_rows{
    get<&IRectangle::get_Left>("Left", "first column", result("value")),
    put<&IRectangle::put_Left>("Left", "first column", in("value")),
    get<&IRectangle::get_Top>("Top", "first row", result("value")),
    put<&IRectangle::put_Top>("Top", "first row", in("value")),
    get<&IRectangle::get_Right>("Right", "first column beyond", result("value")),
    put<&IRectangle::put_Right>("Right", "first column beyond", in("value")),
    get<&IRectangle::get_Bottom>("Bottom", "first row beyond", result("value")),
    put<&IRectangle::put_Bottom>("Bottom", "first row beyond", in("value")),
};
constexpr std::tuple vector_rows{
    get<&IFloatVector2D::get_X>("X", "horizontal part", result("value")),
    put<&IFloatVector2D::put_X>("X", "horizontal part", in("value")),
    get<&IFloatVector2D::get_Y>("Y", "vertical part", result("value")),
    put<&IFloatVector2D::put_Y>("Y", "vertical part", in("value")),
};
constexpr std::tuple size_rows{
    get<&ISizeInt::get_Width>("Width", "pixels in a row", result("value")),
    put<&ISizeInt::put_Width>("Width", "pixels in a row", in("value")),
    get<&ISizeInt::get_Height>("Height", "rows", result("value")),
    put<&ISizeInt::put_Height>("Height", "rows", in("value")),
};
constexpr std::tuple range_rows{
    get<&IRangeFloat::get_Low>("Low", "lower bound", result("value")),
    put<&IRangeFloat::put_Low>("Low", "lower bound", in("value")),
    get<&IRangeFloat::get_High>("High", "upper bound", result("value")),
    put<&IRangeFloat::put_High>("High", "upper bound", in("value")),
};
constexpr std::tuple lookup_table_rows{
    get<&ILookupTable::get_Count>("Count", "number of entries", result("value")),
    get<&ILookupTable::get_Entry>("Entry",
                                  "colour number of an entry: red in the lowest byte, then green, blue",
                                  in("index"), result("colour")),
    get<&ILookupTable::get_Low>("Low", "pixel value where the first entry begins", result("value")),
    get<&ILookupTable::get_High>("High", "pixel value where the last entry ends", result("value")),
};

} // namespace

template <>
const interface_info& table_of<ICoordinateInt>() noexcept
{
    return interface_table<ICoordinateInt, coordinate_int_rows>::info("a pixel's place");
}
template <>
const interface_info& table_of<ICoordinateFloat>() noexcept
{
    return interface_table<ICoordinateFloat, coordinate_float_rows>::info("a place between pixels");
}
template <>
const interface_info& table_of<IRectangle>() noexcept
{
    return interface_table<IRectangle, rectangle_rows>::info(
        "a part of an image; right and bottom are exclusive");
}
template <>
const interface_info& table_of<IFloatVector2D>() noexcept
{
    return interface_table<IFloatVector2D, vector_rows>::info("a direction with a length");
}
template <>
const interface_info& table_of<ISizeInt>() noexcept
{
    return interface_table<ISizeInt, size_rows>::info("width and height in pixels");
}
template <>
const interface_info& table_of<IRangeFloat>() noexcept
{
    return interface_table<IRangeFloat, range_rows>::info("two bounds");
}
template <>
const interface_info& table_of<ILookupTable>() noexcept
{
    return interface_table<ILookupTable, lookup_table_rows>::info("a colour for each step of a value range");
}

} // namespace Qor
