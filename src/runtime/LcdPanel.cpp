#include "runtime/LcdPanel.h"

#include "runtime/PanelProtocol.h"
#include "runtime/splitString.h"

#include <algorithm>

namespace {

const std::string linePad(LcdPanel::visibleColumns, ' ');

constexpr std::chrono::milliseconds keyTimeout{500};
constexpr std::size_t keyByteOfAnswer = 1;

KeyCode keyOfAnswer(std::uint8_t byte) {
    switch (byte) {
    case PanelKey::up:
        return keyUp;
    case PanelKey::down:
        return keyDown;
    case PanelKey::enter:
        return keyEnter;
    case PanelKey::escape:
        return keyEscape;
    default:
        return keyNone;
    }
}

} // namespace

// A panel that was left in the middle of a command takes the first initialisation for the rest of
// that command. The initialisation is therefore sent twice.
LcdPanel::LcdPanel() : commandPrefix(PanelCommand::prefix) {
    sendCommand(PanelCommand::initialise);
    sendCommand(PanelCommand::initialise);
    clear();
}

int LcdPanel::sendCommand(std::uint8_t command) {
    const auto prefix = static_cast<std::uint8_t>(commandPrefix);
    if (line.send(&prefix, 1) == -1)
        return -1;
    return static_cast<int>(line.send(&command, 1));
}

void LcdPanel::clear() {
    sendCommand(PanelCommand::clear);
    home();
}

void LcdPanel::home() {
    sendCommand(PanelCommand::home);
}

void LcdPanel::setCursor(int row, int column) {
    const int limited = std::min(column, columns - 1);
    if (row == 0) {
        sendCommand(static_cast<std::uint8_t>(PanelCommand::row0Column0 + limited));
    } else if (row == 1) {
        sendCommand(static_cast<std::uint8_t>(PanelCommand::row1AfterColumn0 + limited));
        cursorLeft();
    }
}

void LcdPanel::cursorLeft() {
    sendCommand(PanelCommand::cursorLeft);
}

void LcdPanel::cursorRight() {
    sendCommand(PanelCommand::cursorRight);
}

void LcdPanel::cursorBlinkOn() {
    sendCommand(PanelCommand::cursorBlink);
}

void LcdPanel::cursorOff() {
    sendCommand(PanelCommand::cursorOff);
}

int LcdPanel::showText(QLX::String<char> text) {
    clear();
    text += "\n "; // so that there always is a second line
    const auto lines = splitString(text, "\n");
    writeRow(lines[0]);
    setCursor(1, 0);
    writeRow(lines[1]);
    marquee.start(lines[1]);
    return std::max(0, static_cast<int>(lines[1].length()) - visibleColumns);
}

// Writes the whole row at once, which leaves the cursor behind the row and makes all rows equally
// long.
void LcdPanel::writeRow(const std::string &text) {
    line.send((text + linePad).data(), visibleColumns);
}

void LcdPanel::writeAtCursor(const char *bytes, int length) {
    line.send(bytes, static_cast<std::size_t>(length));
    cursorLeft();
}

void LcdPanel::setMarqueeText(const std::string &text) {
    marquee.setText(text);
}

void LcdPanel::resetMarquee() {
    marquee.start("");
}

void LcdPanel::scrollMarqueeForward() {
    marquee.stepForward();
    drawMarquee();
}

void LcdPanel::scrollMarqueeBackward() {
    marquee.stepBackward();
    drawMarquee();
}

void LcdPanel::drawMarquee() {
    const std::string view = marquee.view(visibleColumns);
    setCursor(1, 0);
    writeAtCursor(view.data(), static_cast<int>(view.length()));
}

KeyCode LcdPanel::pollKey() {
    sendCommand(PanelCommand::beforeKeyRequest);
    sendCommand(PanelCommand::readKey);
    const KeyCode key = keyOfAnswer(line.receive(keyTimeout)[keyByteOfAnswer]);
    countKey(key);
    return key;
}
