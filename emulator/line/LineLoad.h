#pragma once

#include "emulator/base/Clock.h"

#include <deque>
#include <string>

namespace emulator {

/// What the line carries to the panel: its last bytes, and how many there are in a second.
class LineLoad {
  public:
    static constexpr std::size_t mostRecent = 12;

    explicit LineLoad(TimePoint now) : countedSince(now) {}

    void carried(unsigned char byte);
    /// To be called now and then. The rate is that of the last full second.
    void look(TimePoint now);

    /// The last bytes in hexadecimal, the newest at the end, each followed by a blank.
    [[nodiscard]] std::string recentBytes() const;
    [[nodiscard]] double bytesPerSecond() const { return rate; }
    /// The rate, relative to what the line can carry.
    [[nodiscard]] double percent() const;

  private:
    std::deque<unsigned char> recent;
    unsigned long counted = 0; // bytes since `countedSince`
    TimePoint countedSince;
    double rate = 0;
};

} // namespace emulator
