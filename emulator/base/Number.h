// Numbers as people write them in options and in journeys.
#pragma once

#include <charconv>
#include <sstream>
#include <stdexcept>
#include <string>

namespace emulator {

/// The number that `word` is. Throws std::invalid_argument, naming the range, when it is not
/// `what` from `least` to `most`.
template <typename Number>
Number parseNumber(const std::string &word, Number least, Number most, const std::string &what) {
    Number value{};
    const char *end = word.data() + word.size();
    const auto [stop, error] = std::from_chars(word.data(), end, value);
    // Written so that a "nan" is out of range.
    if (error != std::errc() || stop != end || !(value >= least && value <= most)) {
        std::ostringstream complaint;
        complaint << "'" << word << "' is not " << what << " from " << least << " to " << most;
        throw std::invalid_argument(complaint.str());
    }
    return value;
}

/// The byte that two hexadecimal digits name. Throws std::invalid_argument when they do not.
inline unsigned char parseByte(const std::string &word) {
    unsigned char value{};
    const char *end = word.data() + word.size();
    const auto [stop, error] = std::from_chars(word.data(), end, value, 16);
    if (error != std::errc() || stop != end || word.size() != 2)
        throw std::invalid_argument("'" + word + "' is not a byte of two hexadecimal digits");
    return value;
}

/// The byte as two hexadecimal digits.
inline std::string hexadecimal(unsigned char byte) {
    constexpr const char *digits = "0123456789ABCDEF";
    return {digits[byte >> 4U], digits[byte & 0xFU]};
}

} // namespace emulator
