#include "editors/OctetKeys.h"

#include "runtime/LcdPanel.h"

namespace {

// Opens the panel before `main`, so that a line that cannot be configured ends the process before
// anything is drawn and before any signal is handled.
LcdPanel *const panel = LcdPanel::instance();

constexpr std::int64_t octetValues = 256;
constexpr int octetColumns = 3;
constexpr int octetPitch = 4; // columns from one octet to the next

// Wide enough for any value that a file may have put there.
std::int64_t stepFor(KeyCode key) {
    return panel->isHeldLong(key) ? 3 : 1;
}

} // namespace

std::int32_t incrementOctet(std::int32_t value) {
    const std::int64_t next = value + stepFor(keyUp);
    return static_cast<std::int32_t>(next >= octetValues ? next - octetValues : next);
}

std::int32_t decrementOctet(std::int32_t value) {
    const std::int64_t next = value - stepFor(keyDown);
    return static_cast<std::int32_t>(next < 0 ? next + octetValues : next);
}

void redrawOctet(const std::string &text) {
    for (int k = 0; k < octetColumns - 1; ++k)
        panel->cursorLeft();
    panel->writeAtCursor(text.data(), octetColumns);
}

void cursorToNextOctet() {
    for (int k = 0; k < octetPitch; ++k)
        panel->cursorRight();
}

void cursorToPrevOctet() {
    for (int k = 0; k < octetPitch; ++k)
        panel->cursorLeft();
}
