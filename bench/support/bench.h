#pragma once

#include <benchmark/benchmark.h>

#include <cstddef>
#include <string>

/// What every benchmark shares. A case is named Operation/type/size; beside it stand, in the same run,
/// ".../copy", a plain copy of the same bytes, and ".../peer:<what>", what a user would call instead.
/// bench/compare pairs them by these names.
namespace zelt_bench {

/// Registers the plain copy that belongs to a case: reads and writes the given number of bytes.
void register_copy(const std::string& case_name, std::size_t bytes);

/// OpenCV has one thread, but more during the life of this.
struct opencv_threads {
    explicit opencv_threads(int count);
    ~opencv_threads();
    opencv_threads(const opencv_threads&) = delete;
    opencv_threads& operator=(const opencv_threads&) = delete;
};

/// The work of a case, if its result is right.
template <class Check, class Work>
void run_case(benchmark::State& state, Check check, Work work)
{
    if (!check()) {
        state.SkipWithError("wrong result");
        return;
    }
    for (auto _ : state) {
        work();
        benchmark::ClobberMemory();
    }
}

/// Registers a case. It runs `check` once before it is timed: a wrong result is reported and never timed.
template <class Check, class Work>
void register_case(const std::string& name, Check check, Work work)
{
    benchmark::RegisterBenchmark(name.c_str(),
                                 [=](benchmark::State& state) { run_case(state, check, work); });
}

/// Registers the peer of a case, named for instance "Median/u8/2048", "medianBlur".
template <class Work>
void register_peer(const std::string& case_name, const std::string& peer, Work work)
{
    register_case(
        case_name + "/peer:" + peer, [] { return true; }, work);
}

/// Registers work for several threads, which is measured by the clock: a case, or with a name like
/// "Convolve-7x7/u8/2000-on-2/peer:filter2D" what belongs to it. OpenCV may use as many threads meanwhile.
template <class Check, class Work>
void register_threaded(const std::string& name, int threads, Check check, Work work)
{
    benchmark::RegisterBenchmark(name.c_str(), [=](benchmark::State& state) {
        const opencv_threads allowed(threads);
        run_case(state, check, work);
    })->UseRealTime();
}

} // namespace zelt_bench
