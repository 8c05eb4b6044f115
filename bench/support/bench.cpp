#include "bench.h"

#include <opencv2/core/utility.hpp>

#include <cstdint>
#include <cstring>
#include <vector>

namespace zelt_bench {

void register_copy(const std::string& case_name, std::size_t bytes)
{
    benchmark::RegisterBenchmark((case_name + "/copy").c_str(), [=](benchmark::State& state) {
        const std::vector<unsigned char> src(bytes, 1);
        std::vector<unsigned char> dst(bytes, 2);
        for (auto _ : state) {
            std::memcpy(dst.data(), src.data(), bytes);
            benchmark::DoNotOptimize(dst.data());
            benchmark::ClobberMemory();
        }
        state.SetBytesProcessed(static_cast<std::int64_t>(bytes) * state.iterations());
    });
}

opencv_threads::opencv_threads(int count) { cv::setNumThreads(count); }
opencv_threads::~opencv_threads() { cv::setNumThreads(1); }

} // namespace zelt_bench

int main(int argc, char** argv)
{
    // The library's own operations run on one thread unless told otherwise, so the peer does too.
    cv::setNumThreads(1);
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 2;
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
