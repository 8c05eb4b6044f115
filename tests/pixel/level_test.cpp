#include "pixel/level.h"

#include "support/cases.h"

#include <fstream>
#include <set>

using namespace Qor::Luxar::ZELT;
using namespace Qor::Luxar::ZELT::Test;

namespace {

// What the operating system says about the processor: a second opinion. It may leave out lzcnt (abm) though
// the processor has it.
bool processor_lists(std::initializer_list<const char*> features)
{
    std::ifstream info("/proc/cpuinfo");
    for (std::string line; std::getline(info, line);) {
        if (!line.starts_with("flags")) continue;
        std::istringstream words(line);
        std::set<std::string> flags;
        for (std::string word; words >> word;) flags.insert(word);
        return std::all_of(features.begin(), features.end(),
                           [&](const char* f) { return flags.contains(f); });
    }
    return false;
}

level best() { return machine_has(level::v4) ? level::v4 : machine_has(level::v3) ? level::v3 : level::v1; }

} // namespace

// Also fails when a build for this processor lacks its levels: every kernel test would then silently skip
// them.
TEST(Level, MachineHasWhatItsProcessorLists)
{
    EXPECT_TRUE(machine_has(level::v1));
    const bool v3 = processor_lists({"avx2", "bmi1", "bmi2", "f16c", "fma", "movbe"});
    EXPECT_EQ(machine_has(level::v3), v3);
    EXPECT_EQ(machine_has(level::v4),
              v3 && processor_lists({"avx512f", "avx512bw", "avx512cd", "avx512dq", "avx512vl"}));
}

TEST(Level, BestIsInUseUnlessAnotherIsForced)
{
    EXPECT_EQ(current_level(), best());
    {
        const forced_level guard(level::v1);
        EXPECT_EQ(current_level(), level::v1);
    }
    EXPECT_EQ(current_level(), best());
}

TEST(Level, PicksTheTableOfTheLevelInUse)
{
    const int v1 = 1, v3 = 3, v4 = 4;
    for_each_level([&](level l) {
        const int* const expected = l == level::v4 ? &v4 : l == level::v3 ? &v3 : &v1;
        EXPECT_EQ(&at_level(v1, v3, v4), expected);
    });
}

TEST(Level, WalkVisitsEveryLevelOfTheMachineOnce)
{
    std::vector<level> visited, expected{level::v1};
    for (const level l : {level::v3, level::v4})
        if (machine_has(l)) expected.push_back(l);
    for_each_level([&](level) { visited.push_back(current_level()); });
    EXPECT_EQ(visited, expected);
}
