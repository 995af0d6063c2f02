#include "emulator/line/LineLoad.h"

#include <array>
#include <cstdio>

namespace emulator {

namespace {

constexpr std::chrono::seconds rateTime{1};
constexpr double lineBytesPerSecond = 2400.0 / 11;

} // namespace

void LineLoad::carried(unsigned char byte) {
    recent.push_back(byte);
    if (recent.size() > mostRecent)
        recent.pop_front();
    counted++;
}

void LineLoad::look(TimePoint now) {
    const std::chrono::duration<double> time = now - countedSince;
    if (time < rateTime)
        return;
    rate = static_cast<double>(counted) / time.count();
    counted = 0;
    countedSince = now;
}

std::string LineLoad::recentBytes() const {
    std::string text;
    for (const unsigned char byte : recent) {
        std::array<char, 4> digits{};
        std::snprintf(digits.data(), digits.size(), "%02X ", static_cast<unsigned>(byte));
        text += digits.data();
    }
    return text;
}

double LineLoad::percent() const {
    return 100 * rate / lineBytesPerSecond;
}

} // namespace emulator
