#include "editors/IfaceStaticListDNSMenu.h"

#include "editors/DottedQuad.h"
#include "editors/IfaceStaticDNSActionMenu.h"
#include "netconfig/IfaceStaticMenu.h"
#include "netconfig/NetworkConfig.h"
#include "runtime/LcdPanel.h"
#include "runtime/drawMarkers.h"
#include "runtime/leaveScreen.h"

#include <algorithm>

IfaceStaticListDNSMenu *IfaceStaticListDNSMenu::theInstance = nullptr;

IfaceStaticListDNSMenu *IfaceStaticListDNSMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new IfaceStaticListDNSMenu;
    return theInstance;
}

void IfaceStaticListDNSMenu::readServers() {
    serverCount = config->getDnsCount();
    for (std::int32_t k = 0; k < storedCount(); ++k)
        servers[static_cast<std::size_t>(k)] = config->getDns(static_cast<std::uint32_t>(k));
}

std::int32_t IfaceStaticListDNSMenu::storedCount() const {
    return std::min(serverCount, static_cast<std::int32_t>(servers.size()));
}

std::string IfaceStaticListDNSMenu::renderList() const {
    if (serverCount == 0)
        return "No DNS Svr found";

    const auto padded = [this](std::int32_t index) {
        std::string server = servers.at(static_cast<std::size_t>(index));
        Octets octets{};
        parseDottedQuad(server, octets);
        return formatDottedQuad(octets, true);
    };
    const bool hasSecondRow = topIndex + 1 < storedCount();
    if (!hasSecondRow)
        return ">" + padded(topIndex);
    return (cursorRow == 0 ? ">" : " ") + padded(topIndex) + "\n" + (cursorRow == 0 ? " " : ">") +
           padded(topIndex + 1);
}

void IfaceStaticListDNSMenu::redrawList() {
    panel->showText(renderList());
}

void IfaceStaticListDNSMenu::moveMarkerTo(std::uint8_t row) {
    drawMarkers(panel, row);
    cursorRow = row;
}

void IfaceStaticListDNSMenu::selectFirstServer() {
    topIndex = 0;
    cursorRow = 0;
}

void IfaceStaticListDNSMenu::display(MenuContext *) {
    if (drawn)
        return;
    drawn = true;
    if (config == nullptr)
        return;
    readServers();
    // The last server or a place past it: whoever was there starts again at the first.
    if (topIndex + cursorRow >= serverCount - 1)
        selectFirstServer();
    redrawList();
}

void IfaceStaticListDNSMenu::onUp(MenuContext *) {
    if (panel->isHeldShort(keyUp) || serverCount < 1)
        return;
    if (cursorRow == 1) {
        moveMarkerTo(0);
    } else if (topIndex > 0) {
        --topIndex;
        redrawList();
    }
}

void IfaceStaticListDNSMenu::onDown(MenuContext *) {
    if (panel->isHeldShort(keyDown) || serverCount < 2)
        return;
    if (cursorRow == 0) {
        moveMarkerTo(1);
    } else if (topIndex + 2 < storedCount()) {
        ++topIndex;
        redrawList();
    }
}

void IfaceStaticListDNSMenu::onEscape(MenuContext *context) {
    if (isHeld(panel, keyEscape))
        return;
    selectFirstServer();
    leaveScreen(this, drawn, context, IfaceStaticMenu::instance());
}

void IfaceStaticListDNSMenu::onEnter(MenuContext *context) {
    if (isHeld(panel, keyEnter) || serverCount < 1)
        return;
    auto *actions = IfaceStaticDNSActionMenu::instance();
    actions->setConfig(config);
    actions->setServerIndex(topIndex + cursorRow);
    leaveScreen(this, drawn, context, actions);
}
