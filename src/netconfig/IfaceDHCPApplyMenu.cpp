#include "netconfig/IfaceDHCPApplyMenu.h"

#include "netconfig/IfaceTypeMenu.h"
#include "netconfig/NetworkConfig.h"
#include "runtime/LcdPanel.h"
#include "runtime/confirmationText.h"
#include "runtime/leaveScreen.h"
#include "status/MainMenu.h"

IfaceDHCPApplyMenu *IfaceDHCPApplyMenu::theInstance = nullptr;

IfaceDHCPApplyMenu *IfaceDHCPApplyMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new IfaceDHCPApplyMenu;
    return theInstance;
}

void IfaceDHCPApplyMenu::display(MenuContext *) {
    if (drawn)
        return;
    drawn = true;
    panel->showText(confirmationText);
}

void IfaceDHCPApplyMenu::onEscape(MenuContext *context) {
    if (isHeld(panel, keyEscape))
        return;
    leaveScreen(this, drawn, context, IfaceTypeMenu::instance());
}

void IfaceDHCPApplyMenu::onEnter(MenuContext *context) {
    if (isHeld(panel, keyEnter))
        return;
    panel->showText("Applying\nDHCP Settings");
    if (config != nullptr)
        config->apply();
    leaveScreen(this, drawn, context, MainMenu::instance());
}
