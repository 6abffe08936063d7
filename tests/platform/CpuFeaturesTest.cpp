// Which instruction set a level gets on which processor. Where the kernels' tests compare every
// form with the scalar one, nothing there tells which form a level takes.
#include <climits>
#include <fstream>
#include <sstream>
#include <string>

#include <gtest/gtest.h>

#include "platform/CpuFeatures.h"

namespace {

using namespace kyv;

constexpr ProcessorFeatures kBare = {};
constexpr ProcessorFeatures kOld = {.ssse3 = true};
constexpr ProcessorFeatures kUsual = {.ssse3 = true, .avx2 = true};
constexpr ProcessorFeatures kNew = {.ssse3 = true,
                                    .avx2 = true,
                                    .avx512f = true,
                                    .avx512bw = true,
                                    .avx512dq = true,
                                    .avx512vl = true};
constexpr ProcessorFeatures kArm = {.neon = true};

TEST(CpuFeatures, LevelIsACeilingAndTheProcessorDecidesWithinIt) {
    for (const ProcessorFeatures& processor : {kBare, kOld, kUsual, kNew}) {
        for (const int32_t level : {INT_MIN, -1, 0, 1, 2}) {
            EXPECT_EQ(Resolve(level, processor), InstructionSet::Scalar) << level;
        }
        EXPECT_EQ(Resolve(3, processor), InstructionSet::Sse2);
    }
    for (const int32_t level : {4, 5, 6, INT_MAX}) {
        EXPECT_EQ(Resolve(level, kBare), InstructionSet::Sse2) << level;
        EXPECT_EQ(Resolve(level, kOld), InstructionSet::Ssse3) << level;
        EXPECT_EQ(Resolve(level, kUsual), InstructionSet::Avx2) << level;
        EXPECT_EQ(Resolve(level, kNew), InstructionSet::Avx512) << level;
    }
}

TEST(CpuFeatures, ArmHasOneSetForEveryLevelThatAsksForVectors) {
    for (const int32_t level : {INT_MIN, 0, 2}) {
        EXPECT_EQ(Resolve(level, kArm), InstructionSet::Scalar) << level;
    }
    for (const int32_t level : {3, 4, 5, INT_MAX}) {
        EXPECT_EQ(Resolve(level, kArm), InstructionSet::Neon) << level;
    }
#ifdef __aarch64__
    EXPECT_EQ(Resolve(3), InstructionSet::Neon); // this processor's
#endif
}

TEST(CpuFeatures, SetIsUsedOnlyWhenAllOfItIsThere) {
    EXPECT_EQ(ProcessorInstructionSet({.avx2 = true}), InstructionSet::Sse2);
    for (bool ProcessorFeatures::*missing :
         {&ProcessorFeatures::avx512f, &ProcessorFeatures::avx512bw, &ProcessorFeatures::avx512dq,
          &ProcessorFeatures::avx512vl}) {
        ProcessorFeatures partial = kNew;
        partial.*missing = false;
        EXPECT_EQ(ProcessorInstructionSet(partial), InstructionSet::Avx2);
    }
}

// Wine shows the same file to Windows programs. An emulator may show that of another processor.
#ifdef __x86_64__
TEST(CpuFeatures, AreThoseThatTheSystemLists) {
    std::ifstream file("/proc/cpuinfo");
    std::string line;
    while (std::getline(file, line) && line.rfind("flags", 0) != 0) {
    }
    if (line.rfind("flags", 0) != 0) {
        GTEST_SKIP() << "this system lists none";
    }
    const auto lists = [flags = line + ' '](const std::string& name) {
        return flags.find(' ' + name + ' ') != std::string::npos;
    };
    const ProcessorFeatures& found = GetProcessorFeatures();
    EXPECT_EQ(found.ssse3, lists("ssse3"));
    EXPECT_EQ(found.avx2, lists("avx2"));
    EXPECT_EQ(found.avx512f, lists("avx512f"));
    EXPECT_EQ(found.avx512bw, lists("avx512bw"));
    EXPECT_EQ(found.avx512dq, lists("avx512dq"));
    EXPECT_EQ(found.avx512vl, lists("avx512vl"));
    EXPECT_EQ(Resolve(5), ProcessorInstructionSet(found));
}
#endif

} // namespace
