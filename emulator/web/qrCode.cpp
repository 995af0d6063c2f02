#include "emulator/web/qrCode.h"

#include <array>
#include <memory>
#include <qrencode.h>

namespace emulator {

std::string qrCode(const std::string &text) {
    constexpr int quietZone = 4; // modules around the code, as readers expect them
    constexpr const char *blackOnWhite = "\x1b[30;107m";
    constexpr const char *asBefore = "\x1b[0m\n";
    // A character is two modules high, which makes them square.
    constexpr std::array halves{" ", "\u2584", "\u2580", "\u2588"};
    const std::unique_ptr<QRcode, decltype(&QRcode_free)> code(
        QRcode_encodeString8bit(text.c_str(), 0, QR_ECLEVEL_L), QRcode_free);
    if (!code)
        return "";
    const auto isDark = [&](int row, int column) {
        const bool isInside = row >= 0 && row < code->width && column >= 0 && column < code->width;
        return isInside && (code->data[row * code->width + column] & 1U) != 0;
    };
    std::string lines;
    for (int row = -quietZone; row < code->width + quietZone; row += 2) {
        lines += blackOnWhite;
        for (int column = -quietZone; column < code->width + quietZone; column++) {
            const std::size_t upper = isDark(row, column) ? 2 : 0;
            lines += halves.at(upper + (isDark(row + 1, column) ? 1 : 0));
        }
        lines += asBefore;
    }
    return lines;
}

} // namespace emulator
