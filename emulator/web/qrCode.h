#pragma once

#include <string>

namespace emulator {

/// A QR code of the text for a terminal that knows UTF-8 and colours, in lines of at most 50
/// columns for an address of the page; empty if there can be none. A phone reads it off the screen,
/// because nobody types the digits of a token there.
std::string qrCode(const std::string &text);

} // namespace emulator
