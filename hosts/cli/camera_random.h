// Random numbers that are the same for a seed on every machine.
#pragma once

#include <cmath>
#include <cstdint>

namespace cli {

/// A 64-bit generator (splitmix64) with the distributions that a camera needs.
class random_source {
public:
    explicit random_source(uint64_t seed) noexcept : state_(seed) {}

    uint64_t bits() noexcept
    {
        uint64_t z = state_ += 0x9E3779B97F4A7C15u;
        z = (z ^ z >> 30) * 0xBF58476D1CE4E5B9u;
        z = (z ^ z >> 27) * 0x94D049BB133111EBu;
        return z ^ z >> 31;
    }
    /// Below 1.
    double uniform() noexcept { return static_cast<double>(bits() >> 11) * 0x1p-53; }
    double between(double low, double high) noexcept { return low + (high - low) * uniform(); }

    /// Mean 0, standard deviation 1: twelve 16-bit uniform numbers added, which needs nothing of the maths library and
    /// ends at six deviations.
    double normal() noexcept
    {
        uint64_t sum = 0;
        for (int i = 0; i < 3; ++i)
            for (uint64_t b = bits(), part = 0; part < 4; ++part, b >>= 16) sum += b & 0xFFFF;
        return (static_cast<double>(sum) + 6) * 0x1p-16 - 6;
    }

    /// How many arrive when so many are expected.
    double poisson(double expected) noexcept
    {
        constexpr double nearly_normal = 50;
        if (!(expected > 0)) return 0;
        if (expected > nearly_normal) {
            const double count = std::floor(expected + std::sqrt(expected) * normal() + 0.5);
            return count > 0 ? count : 0;
        }
        double left = std::exp(-expected);
        double count = -1;
        for (double product = 1; product > left; ++count) product *= uniform();
        return count;
    }

private:
    uint64_t state_;
};

} // namespace cli
