#include "netconfig/IfaceTypeMenu.h"

#include "netconfig/IfaceDHCPApplyMenu.h"
#include "netconfig/IfaceStaticMenu.h"
#include "runtime/KeyFilters.h"
#include "runtime/LcdPanel.h"
#include "runtime/drawMarkers.h"
#include "status/MainMenu.h"

void IfaceTypeMenu::selectInterface(const std::string &name) {
    config = std::make_unique<NetworkConfig>(name);
    config->load();
}

void IfaceTypeMenu::display(MenuContext *) {
    if (!drawn.claimDrawing())
        return;
    const bool dhcpChosen = config != nullptr && config->isDhcp();
    panel->showText(std::string(1, rowMarker(dhcpChosen)) + " DHCP\n" + rowMarker(!dhcpChosen) +
                    " Static");
}

// Up and Down have no hold filter: the marker stops at once, so a held key has nothing to repeat.
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
    if (actsOncePerPress(panel, keyEscape))
        drawn.leaveFor(context, MainMenu::instance());
}

void IfaceTypeMenu::onEnter(MenuContext *context) {
    if (!actsOncePerPress(panel, keyEnter) || config == nullptr)
        return;
    if (config->isDhcp()) {
        IfaceDHCPApplyMenu::instance()->setConfig(config.get());
        drawn.leaveFor(context, IfaceDHCPApplyMenu::instance());
    } else {
        IfaceStaticMenu::instance()->setConfig(config.get());
        drawn.leaveFor(context, IfaceStaticMenu::instance());
    }
}
