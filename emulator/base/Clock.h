#pragma once

#include <chrono>

namespace emulator {

/// A clock that is never set, because paces and limits must not depend on the date.
using Clock = std::chrono::steady_clock;
using TimePoint = Clock::time_point;

/// Converts a number of seconds that an operator has written into the clock's unit.
constexpr Clock::duration seconds(double count) {
    return std::chrono::duration_cast<Clock::duration>(std::chrono::duration<double>(count));
}

} // namespace emulator
