#include "editors/AddressEditor.h"

#include "editors/OctetKeys.h"
#include "runtime/KeyFilters.h"
#include "runtime/LcdPanel.h"

namespace {

constexpr int addressRow = 1;
constexpr int firstOctetLastDigit = 2; // column
constexpr std::int32_t lastOctet = 3;

} // namespace

AddressEditor::AddressEditor(const EditedAddress &edited)
    : drawn(this), ownAddress(edited), address(&edited) {}

void AddressEditor::editForOneVisit(const EditedAddress &edited, ServerIndex index) {
    address = &edited;
    serverIndex = index;
}

void AddressEditor::display(MenuContext *) {
    if (!drawn.claimDrawing() || config == nullptr)
        return;
    std::string text = address->shown(*config, serverIndex);
    parseDottedQuad(text, octets);
    panel->showText(address->prompt + formatDottedQuad(octets, true));
    panel->setCursor(addressRow, firstOctetLastDigit);
    panel->cursorBlinkOn();
    octetIndex = 0;
}

void AddressEditor::onUp(MenuContext *) {
    if (actsRestsAndRepeats(panel, keyUp))
        changeOctet(incrementOctet(octet()));
}

void AddressEditor::onDown(MenuContext *) {
    if (actsRestsAndRepeats(panel, keyDown))
        changeOctet(decrementOctet(octet()));
}

void AddressEditor::onEscape(MenuContext *context) {
    if (!actsOncePerPress(panel, keyEscape))
        return;
    if (octetIndex > 0) {
        --octetIndex;
        cursorToPrevOctet();
    } else {
        leaveFor(context, address->afterEscape());
    }
}

void AddressEditor::onEnter(MenuContext *context) {
    if (!actsOncePerPress(panel, keyEnter))
        return;
    if (octetIndex < lastOctet) {
        ++octetIndex;
        cursorToNextOctet();
        return;
    }
    if (config != nullptr)
        address->store(*config, serverIndex, formatDottedQuad(octets, false));
    leaveFor(context, address->afterStore());
}

std::int32_t &AddressEditor::octet() {
    return octets[static_cast<std::size_t>(octetIndex)];
}

void AddressEditor::changeOctet(std::int32_t value) {
    octet() = value;
    redrawOctet(formatOctet(value, true));
}

void AddressEditor::leaveFor(MenuContext *context, Menu *next) {
    editForOneVisit(ownAddress, noServer);
    panel->cursorOff();
    drawn.leaveFor(context, next);
}
