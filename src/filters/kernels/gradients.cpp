#include "filters/kernels/gradients.h"

#include "filters/kernels/gradients_levels.h"
#include "filters/kernels/output_row.h"
#include "filters/kernels/row_ring.h"

namespace Qor::Luxar::ZELT::Filters {
namespace {

/// How a filter is found in a table.
struct chosen {
    template <class E>
    using row_function = void (*)(const gradient_rows<E>&, uint8_t* to);

    template <class E>
    row_function<E> in(const gradient_loops<E>& loops) const
    {
        return which == 0 ? loops.sobel : which == 1 ? loops.prewitt : loops.derivative;
    }
    int which;
};

template <class E>
void run(const memory_2d& src, const memory_2d& dst, const gradient_loops<E>& loops, chosen filter)
{
    const padded_source padded_rows = padded(src, 1, 1);
    row_ring<E> rows(padded_rows, loops.load, std::min(src.height, 3), 0);
    output_rows out(dst);
    const auto row = filter.in(loops);
    const int64_t step = padded_rows.channels, elements = step * dst.width;
    const bool contiguous = src.x_stride == GetPixmatBits(src.type) / 8;
    for (int64_t y = 0; y < dst.height; ++y) {
        const bool known = contiguous && y + 2 < src.height;
        row({.row = {rows[y - 1], rows[y], rows[y + 1]},
             .step = step,
             .elements = elements,
             .next_row = known ? first_pixel(src) + (y + 2) * src.y_stride : nullptr},
            out.begin(y));
        out.end(y);
    }
}

void run(const memory_2d& src, const memory_2d& dst, chosen filter)
{
    if (src.width <= 0 || src.height <= 0) return;
    const gradients_table& table = gradients_level();
    switch (element_of(src.type)) {
    case pixel_type::unsigned_8: return run(src, dst, table.u8, filter);
    case pixel_type::unsigned_16: return run(src, dst, table.u16, filter);
    case pixel_type::unsigned_32: return run(src, dst, table.u32, filter);
    case pixel_type::signed_8: return run(src, dst, table.i8, filter);
    case pixel_type::signed_16: return run(src, dst, table.i16, filter);
    case pixel_type::signed_32: return run(src, dst, table.i32, filter);
    case pixel_type::float_32: return run(src, dst, table.f32, filter);
    default: return run(src, dst, table.f64, filter);
    }
}

} // namespace

void sobel(const memory_2d& src, const memory_2d& dst)
{
    // The same text for types and sizes: it is the one that users know.
    constexpr auto differ = "Sobel: src and dst pixel types must be identical";
    check_operands(
        src, dst,
        {differ, "Sobel: unsupported pixel type", differ, "Sobel: filter can not be used in place"});
    run(src, dst, chosen{0});
}

void prewitt(const memory_2d& src, const memory_2d& dst)
{
    constexpr auto differ = "Prewitt: src and dst pixel types must be identical";
    check_operands(
        src, dst,
        {differ, "Prewitt: unsupported pixel type", differ, "Prewitt: filter can not be used in place"});
    run(src, dst, chosen{1});
}

void derivative(const memory_2d& src, const memory_2d& dst)
{
    check_operands(src, dst,
                   {"Derivative: src and dst pixel types must be identical",
                    "Derivative: unsupported pixel type",
                    "ZELT Derivative input and output images must have the same size",
                    "ZELT Derivative can not be used in place"});
    run(src, dst, chosen{2});
}

} // namespace Qor::Luxar::ZELT::Filters
