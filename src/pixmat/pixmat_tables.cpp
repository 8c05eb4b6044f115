// The image component's interfaces as data. What works on bare memory (locks, converter) is not for scripts.
#include "com/describe.h"
#include "com/implements.h"
#include "zelt/pixmat/pixmat.h"

namespace Qor {
namespace {

using namespace Luxar;

constexpr std::tuple descriptor_rows{
    get<&IPixmatDescriptor::get_Width>("Width", "pixels in a row", result("value")),
    put<&IPixmatDescriptor::put_Width>("Width", "pixels in a row", in("value")),
    get<&IPixmatDescriptor::get_Height>("Height", "rows", result("value")),
    put<&IPixmatDescriptor::put_Height>("Height", "rows", in("value")),
    get<&IPixmatDescriptor::get_Bits>("Bits", "nominal depth of a pixel: 12 for 12-bit data in 16-bit words",
                                      result("value")),
    put<&IPixmatDescriptor::put_Bits>("Bits", "nominal depth of a pixel: 12 for 12-bit data in 16-bit words",
                                      in("value")),
    get<&IPixmatDescriptor::get_Encoding>("Encoding", "what a pixel is", result("value")),
    put<&IPixmatDescriptor::put_Encoding>("Encoding", "what a pixel is", in("value")),
    get<&IPixmatDescriptor::get_Offset>("Offset", "bytes from the buffer's start to pixel (0, 0)",
                                        result("value")),
    put<&IPixmatDescriptor::put_Offset>("Offset", "bytes from the buffer's start to pixel (0, 0)",
                                        in("value")),
    get<&IPixmatDescriptor::get_XStride>("XStride", "bytes from a pixel to its right neighbour",
                                         result("value")),
    put<&IPixmatDescriptor::put_XStride>("XStride", "bytes from a pixel to its right neighbour", in("value")),
    get<&IPixmatDescriptor::get_YStride>("YStride", "bytes from a pixel to the one below", result("value")),
    put<&IPixmatDescriptor::put_YStride>("YStride", "bytes from a pixel to the one below", in("value")),
};

constexpr std::tuple image_rows{
    method<&IPixmat2::GetDescriptor>("GetDescriptor", "size, pixel format and memory layout, as a new object",
                                     result("descriptor")),
    method<&IPixmat2::Clone>("Clone", "a packed copy with its own memory", result("copy")),
    method<&IPixmat2::StartNotifications>("StartNotifications", "tells a sink of every change from now on",
                                          in("sink"), in("mode")),
    method<&IPixmat2::StopNotifications>("StopNotifications", "tells a sink no more", in("sink")),
};

constexpr std::tuple factory_rows{
    method<&IPixmatFactory::Create>("Create", "a new image, all zero", in("descriptor"), in("mode"),
                                    result("image")),
};

} // namespace

template <>
const interface_info& table_of<IPixmatDescriptor>() noexcept
{
    return interface_table<IPixmatDescriptor, descriptor_rows>::info(
        "size, pixel format and memory layout of an image");
}
template <>
const interface_info& table_of<IPixmat2>() noexcept
{
    return interface_table<IPixmat2, image_rows>::info("an image");
}
template <>
const interface_info& table_of<IPixmatFactory>() noexcept
{
    return interface_table<IPixmatFactory, factory_rows>::info("makes images");
}

} // namespace Qor
