#include "hostname/HostnameEditMenu.h"

#include "hostname/HostnameApplyMenu.h"
#include "runtime/LcdPanel.h"
#include "runtime/leaveScreen.h"
#include "runtime/runCommand.h"
#include "status/MainMenu.h"

#include <algorithm>

namespace {

const std::string hostnameAlphabet =
    "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-";
constexpr std::int32_t hyphenIndex = 62; // the last

constexpr char blank = ' '; // a position without a character
constexpr std::size_t bufferLength = 40;
constexpr std::int32_t lastPosition = bufferLength - 1;
constexpr int nameRow = 1;
constexpr std::int32_t visibleColumns = 16;

} // namespace

HostnameEditMenu *HostnameEditMenu::theInstance = nullptr;

HostnameEditMenu *HostnameEditMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new HostnameEditMenu;
    return theInstance;
}

void HostnameEditMenu::display(MenuContext *) {
    if (drawn)
        return;
    drawn = true;
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
    if (panel->isHeldShort(keyUp))
        return;
    putLetter(charIndex > 0 ? charIndex - 1 : hyphenIndex);
}

void HostnameEditMenu::onDown(MenuContext *) {
    if (panel->isHeldShort(keyDown))
        return;
    putLetter(charIndex < hyphenIndex ? charIndex + 1 : 0);
}

void HostnameEditMenu::onEscape(MenuContext *context) {
    if (panel->isHeldShort(keyEscape))
        return;
    if (panel->isHeldLong(keyEscape)) {
        eraseAll();
    } else if (cursorPos == 0) {
        panel->cursorOff();
        leaveScreen(this, drawn, context, MainMenu::instance());
    } else {
        eraseAndStepBack();
    }
}

void HostnameEditMenu::onEnter(MenuContext *context) {
    if (panel->isHeldShort(keyEnter))
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
    if (cursorPos >= visibleColumns - 1) {
        panel->setMarqueeText(hostname);
        panel->scrollMarqueeBackward();
    }
}

// The first Down on the new position is to give "a", so it starts as if from the hyphen.
void HostnameEditMenu::stepOn() {
    panel->cursorRight();
    ++cursorPos;
    charIndex = hyphenIndex;
    if (cursorPos >= visibleColumns) {
        panel->setMarqueeText(hostname);
        panel->scrollMarqueeForward();
    }
}

void HostnameEditMenu::finish(MenuContext *context) {
    HostnameApplyMenu::instance()->setHostname(hostname);
    panel->cursorOff();
    leaveScreen(this, drawn, context, HostnameApplyMenu::instance());
}
