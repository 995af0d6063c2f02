#include "runtime/Marquee.h"

#include <string_view>

namespace {

constexpr std::string_view gap = "   ";

} // namespace

void Marquee::start(const std::string &text) {
    marqueeText = text;
    marqueeOffset = 0;
}

void Marquee::stepForward() {
    marqueeOffset = marqueeOffset < lastOffset() ? marqueeOffset + 1 : 0;
}

void Marquee::stepBackward() {
    marqueeOffset = marqueeOffset > 0 ? marqueeOffset - 1 : lastOffset();
}

std::string Marquee::view(std::size_t width) const {
    const std::string cycle = marqueeText + gap.data() + marqueeText;
    return cycle.substr(static_cast<std::size_t>(marqueeOffset), width);
}

std::int32_t Marquee::lastOffset() const {
    return static_cast<std::int32_t>(marqueeText.length() + gap.length() - 1);
}
