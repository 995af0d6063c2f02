#pragma once

#include <chrono>

namespace emulator {

/// How long the serial line takes for a byte at 2400 baud: a start bit, eight data bits and two
/// stop bits.
constexpr std::chrono::nanoseconds lineByteTime{11 * std::nano::den / 2400};

} // namespace emulator
