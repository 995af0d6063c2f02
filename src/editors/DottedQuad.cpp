#include "editors/DottedQuad.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>

namespace {

constexpr std::int32_t largestOctet = 255;
constexpr int decimal = 10;

} // namespace

void parseDottedQuad(std::string &text, Octets &octets) {
    if (text.empty())
        text = "0.0.0.0";
    for (auto &octet : octets) {
        const std::string part = text.substr(0, text.find('.'));
        octet = static_cast<std::int32_t>(strtol(part.c_str(), nullptr, decimal));
        // Without a dot this erases nothing, and the same part is read again.
        text.erase(0, text.find('.') + 1);
    }
}

std::string formatDottedQuad(const Octets &octets, bool padded) {
    std::string text;
    for (const std::int32_t octet : octets) {
        if (!text.empty())
            text += ".";
        text += formatOctet(octet, padded);
    }
    return text;
}

std::string formatOctet(std::int32_t value, bool padded) {
    std::array<char, sizeof "255"> text{};
    const int limited = std::clamp(value, 0, largestOctet);
    snprintf(text.data(), text.size(), padded ? "%3d" : "%d", limited);
    return text.data();
}
