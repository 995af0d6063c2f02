#include "editors/AddressEditor.h"

#include "editors/OctetKeys.h"
#include "runtime/LcdPanel.h"
#include "runtime/leaveScreen.h"

namespace {

constexpr int addressRow = 1;
constexpr int firstOctetLastDigit = 2; // column
constexpr std::int32_t lastOctet = 3;

} // namespace

AddressEditor::AddressEditor() : panel(LcdPanel::instance()) {}

void AddressEditor::display(const EditedAddress &edited, ServerIndex server) {
    if (drawn)
        return;
    drawn = true;
    if (config == nullptr)
        return;
    std::string text = edited.shown(*config, server);
    parseDottedQuad(text, octets);
    panel->showText(edited.prompt + formatDottedQuad(octets, true));
    panel->setCursor(addressRow, firstOctetLastDigit);
    panel->cursorBlinkOn();
    octetIndex = 0;
}

void AddressEditor::stepUp() {
    if (panel->isHeldShort(keyUp))
        return;
    octet() = incrementOctet(octet());
    redrawOctet(formatOctet(octet(), true));
}

void AddressEditor::stepDown() {
    if (panel->isHeldShort(keyDown))
        return;
    octet() = decrementOctet(octet());
    redrawOctet(formatOctet(octet(), true));
}

bool AddressEditor::stepBack(const EditedAddress &edited, Menu *screen, MenuContext *context) {
    if (isHeld(panel, keyEscape))
        return false;
    if (octetIndex > 0) {
        --octetIndex;
        cursorToPrevOctet();
        return false;
    }
    leave(screen, context, edited.afterEscape());
    return true;
}

bool AddressEditor::stepOn(const EditedAddress &edited, Menu *screen, MenuContext *context,
                           ServerIndex server) {
    if (isHeld(panel, keyEnter))
        return false;
    if (octetIndex < lastOctet) {
        ++octetIndex;
        cursorToNextOctet();
        return false;
    }
    if (config != nullptr)
        edited.store(*config, server, formatDottedQuad(octets, false));
    leave(screen, context, edited.afterStore());
    return true;
}

std::int32_t &AddressEditor::octet() {
    return octets[static_cast<std::size_t>(octetIndex)];
}

void AddressEditor::leave(Menu *screen, MenuContext *context, Menu *next) {
    panel->cursorOff();
    leaveScreen(screen, drawn, context, next);
}
