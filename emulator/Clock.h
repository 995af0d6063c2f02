#pragma once

#include <chrono>

namespace emulator {

/// Never set back or forth: paces and limits must not depend on the date.
using Clock = std::chrono::steady_clock;
using TimePoint = Clock::time_point;

/// A number of seconds as written by an operator, in the clock's own unit.
constexpr Clock::duration seconds(double count) {
    return std::chrono::duration_cast<Clock::duration>(std::chrono::duration<double>(count));
}

} // namespace emulator
