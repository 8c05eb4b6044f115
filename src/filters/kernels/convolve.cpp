#include "filters/kernels/convolve.h"

#include "filters/kernels/convolve_levels.h"
#include "filters/kernels/output_row.h"
#include "filters/kernels/row_ring.h"
#include "threads/run_parallel.h"

#include <algorithm>
#include <cmath>

namespace Qor::Luxar::ZELT::Filters {
namespace {

/// Output rows that are computed together.
constexpr int32_t rows_at_once = 4;

struct convolve_operands {
    memory_2d src;
    kernel_view kernel;
    coordinate<int32_t> anchor;
    memory_2d dst;
};

bool is_3x3(const kernel_view& k) { return k.width == 3 && k.height == 3; }

/// Bits that hold a pixel's number but for its exponent and sign.
int significant_bits(pixel_type type)
{
    return type == pixel_type::float_32   ? 24
           : type == pixel_type::float_64 ? 53
                                          : static_cast<int>(GetPixmatBits(type));
}

/// True when products of the kernel's values with any pixel fit into doubles: they have few enough bits, and
/// even a float's exponent cannot take them out of range.
bool has_exact_products(const kernel_view& k, pixel_type type)
{
    constexpr int far_exponent = 800;
    const int bits = 53 - significant_bits(type);
    return std::all_of(k.values, k.values + int64_t{k.width} * k.height, [bits](double v) {
        int exponent = 0;
        const double whole = std::ldexp(std::frexp(v, &exponent), bits);
        return std::isfinite(v) && whole == std::trunc(whole) && std::abs(exponent) < far_exponent;
    });
}

/// A convolution over source rows of E, and what its workers need for themselves.
template <class E>
class convolution {
public:
    convolution(const convolve_operands& o, const convolve_loops<E>& loops, int workers)
        : o_(o), sum_(chosen(o, loops)), channels_(channels_of(o.src.type)),
          contiguous_(o.src.x_stride == channels_ * GetPixmatBits(element_of(o.src.type)) / 8),
          block_rows_(o.dst.height < rows_at_once * workers ? 1 : rows_at_once)
    {
        if (o_.kernel.width == 0 || o_.kernel.height == 0) o_.kernel = {o.kernel.values, 0, 0};
        const int64_t columns = std::max<int64_t>(o_.kernel.width, 1); // a kernel without any still gets rows
        const padded_source rows = padded(o_.src, columns - 1 - o_.anchor.x, o_.anchor.x);
        const int64_t at_once =
            std::clamp<int64_t>(int64_t{o_.kernel.height} + rows_at_once - 1, 1, o_.src.height);
        workers_.reserve(static_cast<size_t>(workers));
        for (int i = 0; i < workers; ++i)
            workers_.push_back({row_ring<E>(rows, loops.load, at_once, convolve_slack),
                                std::vector<const E*>(static_cast<size_t>(o_.kernel.height) + rows_at_once),
                                std::vector<output_rows>(rows_at_once, output_rows(o_.dst))});
    }

    int32_t blocks() const { return (o_.dst.height - 1) / block_rows_ + 1; }

    void compute(int32_t block, int worker)
    {
        scratch& own = workers_[static_cast<size_t>(worker)];
        const int32_t top = block * block_rows_;
        const int32_t count = std::min(block_rows_, o_.dst.height - top);
        if (count == rows_at_once) return compute_rows(top, count, own);
        for (int32_t y = top; y < top + count; ++y) compute_rows(y, 1, own);
    }

private:
    using sum_function = void (*)(const convolve_rows<E>&, uint8_t* const* to);

    static sum_function chosen(const convolve_operands& o, const convolve_loops<E>& loops)
    {
        const auto& sums = has_exact_products(o.kernel, element_of(o.src.type)) ? loops.sum_exact : loops.sum;
        return is_3x3(o.kernel) ? sums.size_3x3 : sums.any_size;
    }

    struct scratch {
        row_ring<E> source;
        std::vector<const E*> rows;
        std::vector<output_rows> out;
    };

    void compute_rows(int32_t top, int32_t count, scratch& own)
    {
        const int64_t lowest = int64_t{top} + count - 1;
        for (int64_t i = 0; i < o_.kernel.height + count - 1; ++i)
            own.rows[static_cast<size_t>(i)] = own.source[lowest + o_.anchor.y - i];
        uint8_t* to[rows_at_once];
        for (int32_t i = 0; i < count; ++i) to[i] = own.out[static_cast<size_t>(i)].begin(lowest - i);

        const int64_t next = lowest + o_.anchor.y + 1;
        const bool known = contiguous_ && next >= 0 && next + rows_at_once <= o_.src.height;
        sum_({.rows = own.rows.data(),
              .output_rows = count,
              .kernel = o_.kernel.values,
              .kernel_width = o_.kernel.width,
              .kernel_height = o_.kernel.height,
              .step = channels_,
              .elements = int64_t{o_.dst.width} * channels_,
              .next_row = known ? first_pixel(o_.src) + next * o_.src.y_stride : nullptr,
              .next_stride = o_.src.y_stride},
             to);
        for (int32_t i = 0; i < count; ++i) own.out[static_cast<size_t>(i)].end(lowest - i);
    }

    convolve_operands o_;
    sum_function sum_;
    int32_t channels_;
    bool contiguous_;
    int32_t block_rows_; ///< of a low image only one, so that each worker has some
    std::vector<scratch> workers_;
};

template <class E>
void run(const convolve_operands& o, const convolve_loops<E>& loops, Thread::ThreadPool* pool)
{
    convolution<E> job(o, loops, pool ? pool->GetThreadCount() : 1);
    Thread::run_cancellable(
        pool, {0, job.blocks()},
        [&job](int32_t block, const Thread::ThreadInformation& where) { job.compute(block, where.worker); });
}

void run(const convolve_operands& o, Thread::ThreadPool* pool)
{
    const convolve_table& table = convolve_level();
    const bool small = is_3x3(o.kernel);
    switch (element_of(o.src.type)) {
    case pixel_type::unsigned_8: return small ? run(o, table.small_u8, pool) : run(o, table.u8, pool);
    case pixel_type::unsigned_16: return small ? run(o, table.small_u16, pool) : run(o, table.u16, pool);
    case pixel_type::unsigned_32: return run(o, table.u32, pool);
    case pixel_type::signed_8: return small ? run(o, table.small_i8, pool) : run(o, table.i8, pool);
    case pixel_type::signed_16: return small ? run(o, table.small_i16, pool) : run(o, table.i16, pool);
    case pixel_type::signed_32: return run(o, table.i32, pool);
    case pixel_type::float_32: return small ? run(o, table.small_f32, pool) : run(o, table.f32, pool);
    default: return run(o, table.f64, pool);
    }
}

} // namespace

void convolve(const memory_2d& src, const kernel_view& kernel, coordinate<int32_t> anchor,
              const memory_2d& dst, Thread::ThreadPool* pool)
{
    check_operands(src, dst,
                   {.types_differ = "Convolve: src and dst pixel types must be identical",
                    .unsupported = "Convolve: unsupported pixel type",
                    .sizes_differ = "ZELT Convolve input and output images must have the same size",
                    .in_place = "ZELT Convolve can not be used in place"});
    if (src.width <= 0 || src.height <= 0) return ThrowIfCancelled();
    run({src, kernel, anchor, dst}, pool);
}

} // namespace Qor::Luxar::ZELT::Filters
