// Instruction-set levels: v1 is plain x86-64 (or any other processor), v3 has AVX2, v4 has AVX-512.
// Loops that gain from a level are compiled once for each, in the namespace of that level.
#pragma once

#ifndef ZELT_LEVEL
#define ZELT_LEVEL v1
#endif

namespace Qor::Luxar::ZELT {

enum class level { v1, v3, v4 };

/// The level in use: the best that the machine has, chosen once, unless a test or benchmark forces another.
level current_level() noexcept;

/// True when this build has the level and the processor can run it. v1 is always there.
bool machine_has(level l) noexcept;

/// For tests and benchmarks: use this level from now on, in all threads. The machine must have it.
void force_level(level l) noexcept;

/// Ends force_level.
void use_best_level() noexcept;

/// The member of a family's three tables that belongs to the level in use.
template <class Table>
const Table& at_level(const Table& v1, const Table& v3, const Table& v4) noexcept
{
    switch (current_level()) {
    case level::v4: return v4;
    case level::v3: return v3;
    default: return v1;
    }
}

} // namespace Qor::Luxar::ZELT
