#include "filters/kernels/convolve.h"

#include "filters/kernels/convolve_levels.h"
#include "filters/kernels/output_row.h"
#include "filters/kernels/row_ring.h"
#include "threads/run_parallel.h"

namespace Qor::Luxar::ZELT::Filters {
namespace {

/// Output rows that are computed together.
constexpr int32_t rows_at_once = 4;

/// A convolution, and what its workers need for themselves.
class convolution {
public:
    convolution(const memory_2d& src, const kernel_view& kernel, coordinate<int32_t> anchor,
                const memory_2d& dst, int workers)
        : table_(convolve_level()), type_(table_index_of(element_of(src.type))), kernel_(kernel),
          anchor_(anchor), height_(dst.height), channels_(channels_of(src.type)),
          elements_(int64_t{dst.width} * channels_)
    {
        if (kernel.width == 0 || kernel.height == 0) kernel_ = {kernel.values, 0, 0};
        const int64_t columns = std::max<int64_t>(kernel_.width, 1); // a kernel without any still gets rows
        const padded_source rows = padded(src, columns - 1 - anchor.x, anchor.x);
        const int64_t at_once =
            std::clamp<int64_t>(int64_t{kernel_.height} + rows_at_once - 1, 1, src.height);
        workers_.reserve(static_cast<size_t>(workers));
        for (int i = 0; i < workers; ++i)
            workers_.push_back(
                {row_ring<double>(rows, table_.load[type_], at_once, convolve_slack),
                 std::vector<const double*>(static_cast<size_t>(kernel_.height + rows_at_once)),
                 std::vector<double>(static_cast<size_t>(rows_at_once * sum_length())), output_rows(dst)});
    }

    void compute(int32_t block, int worker)
    {
        const int32_t top = block * rows_at_once;
        const int32_t count = std::min(rows_at_once, height_ - top);
        if (count == rows_at_once) return compute_rows(top, count, workers_[static_cast<size_t>(worker)]);
        for (int32_t y = top; y < top + count; ++y) compute_rows(y, 1, workers_[static_cast<size_t>(worker)]);
    }

private:
    struct scratch {
        row_ring<double> source;
        std::vector<const double*> rows;
        std::vector<double> sums;
        output_rows out;
    };

    int64_t sum_length() const { return elements_ + convolve_slack; }

    void compute_rows(int32_t top, int32_t count, scratch& own)
    {
        const int64_t lowest = int64_t{top} + count - 1;
        for (int64_t i = 0; i < kernel_.height + count - 1; ++i)
            own.rows[static_cast<size_t>(i)] = own.source[lowest + anchor_.y - i];
        double* sums[rows_at_once];
        for (int32_t i = 0; i < count; ++i) sums[i] = own.sums.data() + i * sum_length();
        table_.sum(
            {own.rows.data(), count, kernel_.values, kernel_.width, kernel_.height, channels_, elements_},
            sums);
        for (int32_t i = 0; i < count; ++i) {
            table_.store[type_](sums[i], elements_, own.out.begin(lowest - i));
            own.out.end(lowest - i);
        }
    }

    const convolve_table& table_;
    int type_;
    kernel_view kernel_;
    coordinate<int32_t> anchor_;
    int32_t height_;
    int32_t channels_;
    int64_t elements_;
    std::vector<scratch> workers_;
};

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
    convolution job(src, kernel, anchor, dst, pool ? pool->GetThreadCount() : 1);
    const int32_t blocks = (dst.height - 1) / rows_at_once + 1;
    Thread::run_cancellable(pool, {0, blocks}, [&job](int32_t block, const Thread::ThreadInformation& where) {
        job.compute(block, where.worker);
    });
}

} // namespace Qor::Luxar::ZELT::Filters
