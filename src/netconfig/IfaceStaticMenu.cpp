#include "netconfig/IfaceStaticMenu.h"

#include "editors/IfaceStaticEditDNSMenu.h"
#include "editors/IfaceStaticEditGWMenu.h"
#include "editors/IfaceStaticEditIPMenu.h"
#include "editors/IfaceStaticEditNMMenu.h"
#include "editors/IfaceStaticListDNSMenu.h"
#include "netconfig/IfaceTypeMenu.h"
#include "netconfig/NetworkConfig.h"
#include "runtime/LcdPanel.h"
#include "runtime/drawMarkers.h"
#include "runtime/leaveScreen.h"
#include "status/MainMenu.h"

#include <unistd.h>

namespace {

enum Item : std::int32_t { setAddress, setNetmask, setGateway, addDns, listDns, applyItem };

constexpr std::int32_t lastTopItem = 4;
constexpr std::size_t labelColumns = 13;
constexpr useconds_t errorPauseUs = 3000000;

// Hands the settings to the screen that works on them next.
template <typename Screen> Menu *screenFor(NetworkConfig *config) {
    Screen::instance()->setConfig(config);
    return Screen::instance();
}

} // namespace

IfaceStaticMenu *IfaceStaticMenu::theInstance = nullptr;

IfaceStaticMenu *IfaceStaticMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new IfaceStaticMenu;
    return theInstance;
}

IfaceStaticMenu::IfaceStaticMenu()
    : items{"Set IP Addr", "Set Netmask",  "Set Gateway",
            "Add DNS Svr", "Lst DNS Svrs", "Apply Changes"} {}

bool IfaceStaticMenu::applyStatic() {
    const std::string error = config->apply();
    if (error.empty())
        return true;
    panel->showText("Error:\n" + error);
    usleep(errorPauseUs);
    return false;
}

std::string IfaceStaticMenu::renderItems() const {
    const auto row = [this](std::int32_t item, bool marked, const char *indicator) {
        std::string label = items.at(static_cast<std::size_t>(item));
        label.resize(labelColumns, ' ');
        return (marked ? "> " : "  ") + label + indicator;
    };
    const char *upIndicator = topItem > 0 ? "^" : "";
    const char *downIndicator = topItem < lastTopItem ? "v" : "";
    return row(topItem, !cursorRow, upIndicator) + "\n" +
           row(topItem + 1, cursorRow, downIndicator);
}

void IfaceStaticMenu::redrawItems() {
    panel->showText(renderItems());
}

void IfaceStaticMenu::moveMarkerTo(bool bottomRow) {
    drawMarkers(panel, bottomRow ? 1 : 0);
    cursorRow = bottomRow;
}

std::int32_t IfaceStaticMenu::selectedItem() const {
    return topItem + (cursorRow ? 1 : 0);
}

void IfaceStaticMenu::selectFirstItem() {
    topItem = 0;
    cursorRow = false;
}

void IfaceStaticMenu::display(MenuContext *) {
    if (drawn)
        return;
    drawn = true;
    redrawItems();
}

void IfaceStaticMenu::onUp(MenuContext *) {
    if (panel->isHeldShort(keyUp))
        return;
    if (cursorRow) {
        moveMarkerTo(false);
    } else if (topItem > 0) {
        --topItem;
        redrawItems();
    }
}

void IfaceStaticMenu::onDown(MenuContext *) {
    if (panel->isHeldShort(keyDown))
        return;
    if (!cursorRow) {
        moveMarkerTo(true);
    } else if (topItem < lastTopItem) {
        ++topItem;
        redrawItems();
    }
}

void IfaceStaticMenu::onEscape(MenuContext *context) {
    if (isHeld(panel, keyEscape))
        return;
    selectFirstItem();
    leaveScreen(this, drawn, context, IfaceTypeMenu::instance());
}

void IfaceStaticMenu::onEnter(MenuContext *context) {
    if (isHeld(panel, keyEnter))
        return;
    if (selectedItem() == applyItem) {
        applyChanges(context);
    } else {
        openItem(context);
    }
}

void IfaceStaticMenu::openItem(MenuContext *context) {
    Menu *next = nullptr;
    switch (selectedItem()) {
    case setAddress:
        next = screenFor<IfaceStaticEditIPMenu>(config);
        break;
    case setNetmask:
        next = screenFor<IfaceStaticEditNMMenu>(config);
        break;
    case setGateway:
        next = screenFor<IfaceStaticEditGWMenu>(config);
        break;
    case addDns:
        next = screenFor<IfaceStaticEditDNSMenu>(config);
        break;
    default:
        next = screenFor<IfaceStaticListDNSMenu>(config);
        break;
    }
    leaveScreen(this, drawn, context, next);
}

void IfaceStaticMenu::applyChanges(MenuContext *context) {
    panel->showText("Applying\nStatic Settings");
    if (!applyStatic()) {
        drawn = false; // the items come back where the error stood
        return;
    }
    config = nullptr;
    selectFirstItem();
    leaveScreen(this, drawn, context, MainMenu::instance());
}
