#include "netconfig/IfaceDHCPApplyMenu.h"

#include "netconfig/IfaceTypeMenu.h"
#include "netconfig/NetworkConfig.h"
#include "runtime/KeyFilters.h"
#include "runtime/LcdPanel.h"
#include "runtime/confirmationText.h"
#include "status/MainMenu.h"

void IfaceDHCPApplyMenu::display(MenuContext *) {
    if (drawn.claimDrawing())
        panel->showText(confirmationText);
}

void IfaceDHCPApplyMenu::onEscape(MenuContext *context) {
    if (actsOncePerPress(panel, keyEscape))
        drawn.leaveFor(context, IfaceTypeMenu::instance());
}

void IfaceDHCPApplyMenu::onEnter(MenuContext *context) {
    if (!actsOncePerPress(panel, keyEnter))
        return;
    panel->showText("Applying\nDHCP Settings");
    if (config != nullptr)
        config->apply(); // the page of the port shows the outcome
    drawn.leaveFor(context, MainMenu::instance());
}
