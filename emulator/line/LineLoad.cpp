#include "emulator/line/LineLoad.h"

#include "emulator/base/Number.h"
#include "emulator/line/lineByteTime.h"

namespace emulator {

namespace {

constexpr std::chrono::seconds rateTime{1};

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
    for (const unsigned char byte : recent)
        text += hexadecimal(byte) + " ";
    return text;
}

double LineLoad::percent() const {
    return 100 * rate * std::chrono::duration<double>(lineByteTime).count();
}

} // namespace emulator
