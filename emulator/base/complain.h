#pragma once

#include <iostream>
#include <string>

namespace emulator {

/// The text with a question mark in place of each control character but line feed and tabulator,
/// because what somebody else has written must not control the terminal that it is printed on.
/// Takes the text for UTF-8, in which C2 80 to C2 9F are control characters, too.
inline std::string masked(const std::string &text) {
    std::string result;
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        const bool isSecondHalf =
            !result.empty() && result.back() == '\xC2' && byte >= 0x80 && byte < 0xA0;
        if (isSecondHalf)
            result.back() = '?';
        else if ((byte < ' ' && c != '\n' && c != '\t') || byte == 0x7F)
            result += '?';
        else
            result += c;
    }
    return result;
}

/// Says on standard error what is wrong, in a line of the emulator's own.
inline void complain(const std::string &message) {
    const bool hasLineFeed = !message.empty() && message.back() == '\n'; // as a picture's last line
    std::cerr << "panel-emulator: " << masked(message) << (hasLineFeed ? "" : "\n");
}

} // namespace emulator
