#include "netconfig/IfaceTypeMenu.h"

#include "netconfig/IfaceDHCPApplyMenu.h"
#include "netconfig/IfaceStaticMenu.h"
#include "runtime/LcdPanel.h"
#include "runtime/drawMarkers.h"
#include "runtime/leaveScreen.h"
#include "status/MainMenu.h"

IfaceTypeMenu *IfaceTypeMenu::theInstance = nullptr;

IfaceTypeMenu *IfaceTypeMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new IfaceTypeMenu;
    return theInstance;
}

void IfaceTypeMenu::selectInterface(const std::string &name) {
    config = std::make_unique<NetworkConfig>(name);
    config->load();
}

void IfaceTypeMenu::display(MenuContext *) {
    if (drawn)
        return;
    drawn = true;
    const bool dhcpChosen = config != nullptr && config->isDhcp();
    panel->showText(dhcpChosen ? "> DHCP\n  Static" : "  DHCP\n> Static");
}

void IfaceTypeMenu::onUp(MenuContext *) {
    if (config == nullptr || config->isDhcp())
        return;
    drawMarkers(panel, 0);
    config->setDhcp(true);
}

void IfaceTypeMenu::onDown(MenuContext *) {
    if (config == nullptr || !config->isDhcp())
        return;
    drawMarkers(panel, 1);
    config->setDhcp(false);
}

void IfaceTypeMenu::onEscape(MenuContext *context) {
    if (isHeld(panel, keyEscape))
        return;
    leaveScreen(this, drawn, context, MainMenu::instance());
}

void IfaceTypeMenu::onEnter(MenuContext *context) {
    if (isHeld(panel, keyEnter) || config == nullptr)
        return;
    if (config->isDhcp()) {
        IfaceDHCPApplyMenu::instance()->setConfig(config.get());
        leaveScreen(this, drawn, context, IfaceDHCPApplyMenu::instance());
    } else {
        IfaceStaticMenu::instance()->setConfig(config.get());
        leaveScreen(this, drawn, context, IfaceStaticMenu::instance());
    }
}
