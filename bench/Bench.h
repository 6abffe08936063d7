// What the benchmarks share: the frames they work on, and how they are listed.
//
// Every benchmark treats one frame of 1920x1080, on one thread unless its name says otherwise, and
// is named "operation/form"; the report sets each form against the first of its operation and
// against a memcpy of the frame.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

namespace kyvbench {

inline constexpr int32_t kWidth = 1920;
inline constexpr int32_t kHeight = 1080;
inline constexpr size_t kPixels = size_t{kWidth} * kHeight;
inline constexpr size_t kFrameBytes = kPixels * 4;

// The same memory serves all benchmarks, so that none has warmer caches than another.
struct Frames {
    std::vector<uint8_t> source[3];
    std::vector<uint8_t> target;     // may be made larger
    std::vector<uint8_t> large = {}; // for sources that are larger than a frame
};

Frames& SharedFrames();

// Times run, which treats one frame.
void Add(const std::string& operation, const std::string& form, std::function<void()> run);

// The same for what needs preparing: make is called once a repetition and gives run, or an empty
// function when it cannot. One that works on several threads is timed by the wall clock.
enum class Clock { Thread, Wall };
void AddPrepared(const std::string& operation, const std::string& form,
                 std::function<std::function<void()>()> make, Clock clock = Clock::Thread);

// Each lists the benchmarks of one file.
void AddKernels();
void AddImageOperations();
void AddEffects();

} // namespace kyvbench
