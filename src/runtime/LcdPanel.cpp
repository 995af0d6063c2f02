#include "runtime/LcdPanel.h"

#include "runtime/PanelProtocol.h"
#include "runtime/splitString.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <fcntl.h>
#include <poll.h>
#include <string_view>
#include <unistd.h>

namespace {

constexpr const char *device = "/dev/ttyS1";
constexpr int exitLineNotConfigured = 150;

// A raw line at 2400 baud: 8 data bits, no parity, two stop bits, no flow control, no translation.
constexpr std::array lineSettings = {
    "stty ispeed 2400 < /dev/ttyS1",
    "stty raw < /dev/ttyS1",
    "stty -F /dev/ttyS1 -ignbrk -brkint -parmrk -inpck -istrip -inlcr -igncr -icrnl -iuclc -ixon"
    " -ixany -ixoff -imaxbel ignpar",
    "stty -F /dev/ttyS1 -opost -olcuc -onlcr -ocrnl -onocr -onlret -ofill -ofdel nl0 cr0 tab0 bs0"
    " vt0 ff0",
    "stty -F /dev/ttyS1 -parenb -crtscts -parodd -hupcl cread cs8 cstopb clocal",
    "stty -F /dev/ttyS1 -isig -icanon -iexten -echo noflsh",
};

constexpr std::size_t visibleColumns = 16;
constexpr int lastColumn = 39;
const std::string linePad(visibleColumns, ' ');
constexpr std::string_view marqueeGap = "   ";

constexpr int keyTimeoutMs = 500;
constexpr std::size_t answerBufferSize = 256; // bytes
constexpr std::size_t keyByteOfAnswer = 1;

constexpr std::uint32_t firstRestingPoll = 2;
constexpr std::uint32_t restingPolls = 4;

std::string fittedToRow(const std::string &text) {
    return (text + linePad).substr(0, visibleColumns);
}

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

LcdPanel *LcdPanel::theInstance = nullptr;

LcdPanel *LcdPanel::instance() {
    if (theInstance == nullptr)
        theInstance = new LcdPanel;
    return theInstance;
}

LcdPanel::LcdPanel() : fd(open(device, O_RDWR | O_NONBLOCK)), commandPrefix(PanelCommand::prefix) {
    configureLine();
    sendCommand(PanelCommand::initialise);
    sendCommand(PanelCommand::initialise);
    clear();
}

LcdPanel::~LcdPanel() {
    close(fd);
}

void LcdPanel::configureLine() {
    for (const char *command : lineSettings) {
        if (system(command) != 0)
            exit(exitLineNotConfigured);
    }
}

void LcdPanel::send(const char *bytes, std::size_t length) {
    [[maybe_unused]] const ssize_t written = write(fd, bytes, length);
}

int LcdPanel::sendCommand(std::uint8_t command) {
    const auto prefix = static_cast<std::uint8_t>(commandPrefix);
    if (write(fd, &prefix, 1) == -1)
        return -1;
    return static_cast<int>(write(fd, &command, 1));
}

void LcdPanel::clear() {
    sendCommand(PanelCommand::clear);
    home();
}

void LcdPanel::home() {
    sendCommand(PanelCommand::home);
}

void LcdPanel::setCursor(int row, int column) {
    const int limited = std::min(column, lastColumn);
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
    text += "\n "; // there is always a second line, blank if need be
    const auto lines = splitString(text, "\n");
    send(fittedToRow(lines[0]).data(), visibleColumns);
    setCursor(1, 0);
    send(fittedToRow(lines[1]).data(), visibleColumns);
    marqueeText = lines[1];
    marqueeOffset = 0;
    return std::max(0, static_cast<int>(lines[1].length()) - static_cast<int>(visibleColumns));
}

void LcdPanel::writeAtCursor(const char *bytes, int length) {
    send(bytes, static_cast<std::size_t>(length));
    cursorLeft();
}

void LcdPanel::setMarqueeText(const std::string &text) {
    marqueeText = text;
}

void LcdPanel::resetMarquee() {
    marqueeOffset = 0;
    marqueeText.clear();
}

void LcdPanel::scrollMarqueeForward() {
    marqueeOffset = marqueeOffset < lastMarqueeOffset() ? marqueeOffset + 1 : 0;
    drawMarquee();
}

void LcdPanel::scrollMarqueeBackward() {
    marqueeOffset = marqueeOffset > 0 ? marqueeOffset - 1 : lastMarqueeOffset();
    drawMarquee();
}

std::int32_t LcdPanel::lastMarqueeOffset() const {
    return static_cast<std::int32_t>(marqueeText.length() + marqueeGap.length() - 1);
}

void LcdPanel::drawMarquee() {
    const std::string cycle = marqueeText + marqueeGap.data() + marqueeText;
    const std::string view = cycle.substr(static_cast<std::size_t>(marqueeOffset), visibleColumns);
    setCursor(1, 0);
    writeAtCursor(view.data(), static_cast<int>(view.length()));
}

KeyCode LcdPanel::pollKey() {
    sendCommand(PanelCommand::beforeKeyRequest);
    sendCommand(PanelCommand::readKey);

    std::array<std::uint8_t, answerBufferSize> answer{};
    pollfd line{fd, POLLIN, 0};
    if (poll(&line, 1, keyTimeoutMs) > 0) {
        [[maybe_unused]] const ssize_t count = read(fd, answer.data(), answer.size() - 1);
    }
    const KeyCode key = keyOfAnswer(answer[keyByteOfAnswer]);
    countKey(key);
    return key;
}

void LcdPanel::countKey(KeyCode key) {
    upHeld = key == keyUp ? upHeld + 1 : 0;
    downHeld = key == keyDown ? downHeld + 1 : 0;
    escapeHeld = key == keyEscape ? escapeHeld + 1 : 0;
    enterHeld = key == keyEnter ? enterHeld + 1 : 0;
}

std::uint32_t LcdPanel::pollsHeld(KeyCode key) const {
    switch (key) {
    case keyUp:
        return upHeld;
    case keyDown:
        return downHeld;
    case keyEnter:
        return enterHeld;
    case keyEscape:
        return escapeHeld;
    default:
        return 0;
    }
}

bool LcdPanel::isHeldShort(KeyCode key) const {
    return pollsHeld(key) - firstRestingPoll < restingPolls;
}

bool LcdPanel::isHeldLong(KeyCode key) const {
    return pollsHeld(key) >= firstRestingPoll + restingPolls;
}

bool isHeld(const LcdPanel *panel, KeyCode key) {
    return panel->isHeldShort(key) || panel->isHeldLong(key);
}
