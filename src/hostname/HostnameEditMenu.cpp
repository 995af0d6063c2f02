#include "hostname/HostnameEditMenu.h"

#include "hostname/HostnameApplyMenu.h"
#include "runtime/KeyFilters.h"
#include "runtime/LcdPanel.h"
#include "runtime/runCommand.h"
#include "status/MainMenu.h"

#include <algorithm>

namespace {

const std::string hostnameAlphabet =
    "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-";
constexpr std::int32_t hyphenIndex = 62; // the last

constexpr char blank = ' ';                             // a position without a character
constexpr std::size_t bufferLength = LcdPanel::columns; // as far as the cursor can go
constexpr std::int32_t lastPosition = bufferLength - 1;
constexpr std::int32_t lastVisiblePosition = LcdPanel::visibleColumns - 1;
constexpr int nameRow = 1;

} // namespace

void HostnameEditMenu::display(MenuContext *) {
    if (!drawn.claimDrawing())
        return;
    hostname = runCommand("hostname", true);
    if (!hostname.empty())
        hostname.pop_back(); // the line feed
    hostname.resize(std::min(hostname.length(), bufferLength));
    cursorPos = std::max(0, static_cast<std::int32_t>(hostname.length()) - 1);

    const int shift = panel->showText("Enter Hostname:\n" + hostname);
    panel->setCursor(nameRow, cursorPos);
    for (int k = 0; k < shift; ++k)
        panel->scrollMarqueeForward();
    panel->cursorBlinkOn();

    hostname.resize(bufferLength, blank);
    findCharacterUnderCursor();
}

void HostnameEditMenu::onUp(MenuContext *) {
    if (actsRestsAndRepeats(panel, keyUp))
        putLetter(charIndex > 0 ? charIndex - 1 : hyphenIndex);
}

void HostnameEditMenu::onDown(MenuContext *) {
    if (actsRestsAndRepeats(panel, keyDown))
        putLetter(charIndex < hyphenIndex ? charIndex + 1 : 0);
}

void HostnameEditMenu::onEscape(MenuContext *context) {
    if (!actsRestsAndRepeats(panel, keyEscape))
        return;
    if (panel->isHeldLong(keyEscape)) {
        eraseAll();
    } else if (cursorPos == 0) {
        panel->cursorOff();
        drawn.leaveFor(context, MainMenu::instance());
    } else {
        eraseAndStepBack();
    }
}

void HostnameEditMenu::onEnter(MenuContext *context) {
    if (!actsRestsAndRepeats(panel, keyEnter))
        return;
    if (panel->isHeldLong(keyEnter) || characterUnderCursor() == blank) {
        finish(context);
    } else if (cursorPos < lastPosition) {
        stepOn();
    }
}

char &HostnameEditMenu::characterUnderCursor() {
    return hostname[static_cast<std::size_t>(cursorPos)];
}

void HostnameEditMenu::findCharacterUnderCursor() {
    const std::size_t index = hostnameAlphabet.find(characterUnderCursor());
    charIndex = index == std::string::npos ? -1 : static_cast<std::int32_t>(index);
}

void HostnameEditMenu::putLetter(std::int32_t index) {
    charIndex = index;
    characterUnderCursor() = hostnameAlphabet[static_cast<std::size_t>(index)];
    panel->writeAtCursor(&characterUnderCursor(), 1);
}

void HostnameEditMenu::eraseAll() {
    if (hostname.front() == blank)
        return;
    hostname.assign(bufferLength, blank);
    cursorPos = 0;
    charIndex = hyphenIndex;
    panel->resetMarquee();
    panel->cursorOff();
    panel->setCursor(nameRow, cursorPos);
    panel->writeAtCursor(hostname.data(), static_cast<int>(hostname.length()));
    panel->setCursor(nameRow, cursorPos);
    panel->cursorBlinkOn();
}

void HostnameEditMenu::eraseAndStepBack() {
    panel->writeAtCursor(&blank, 1);
    characterUnderCursor() = blank;
    panel->cursorLeft();
    --cursorPos;
    findCharacterUnderCursor();
    if (cursorPos >= lastVisiblePosition) {
        panel->setMarqueeText(hostname);
        panel->scrollMarqueeBackward();
    }
}

// A new position starts from the hyphen, the last character, so that the first Down gives "a".
void HostnameEditMenu::stepOn() {
    panel->cursorRight();
    ++cursorPos;
    charIndex = hyphenIndex;
    if (cursorPos > lastVisiblePosition) {
        panel->setMarqueeText(hostname);
        panel->scrollMarqueeForward();
    }
}

void HostnameEditMenu::finish(MenuContext *context) {
    HostnameApplyMenu::instance()->setHostname(hostname);
    panel->cursorOff();
    drawn.leaveFor(context, HostnameApplyMenu::instance());
}
