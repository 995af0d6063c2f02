#include "editors/IfaceStaticDNSActionMenu.h"

#include "editors/IfaceStaticEditDNSMenu.h"
#include "editors/IfaceStaticListDNSMenu.h"
#include "netconfig/NetworkConfig.h"
#include "runtime/LcdPanel.h"
#include "runtime/drawMarkers.h"
#include "runtime/leaveScreen.h"

IfaceStaticDNSActionMenu *IfaceStaticDNSActionMenu::theInstance = nullptr;

IfaceStaticDNSActionMenu *IfaceStaticDNSActionMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new IfaceStaticDNSActionMenu;
    return theInstance;
}

void IfaceStaticDNSActionMenu::display(MenuContext *) {
    if (drawn)
        return;
    drawn = true;
    panel->showText("  Edit Svr\n  Delete Svr");
    drawMarkers(panel, deleteSelected ? 1 : 0);
}

void IfaceStaticDNSActionMenu::onUp(MenuContext *) {
    if (deleteSelected)
        select(false);
}

void IfaceStaticDNSActionMenu::onDown(MenuContext *) {
    if (!deleteSelected)
        select(true);
}

void IfaceStaticDNSActionMenu::select(bool deletion) {
    deleteSelected = deletion;
    drawMarkers(panel, deletion ? 1 : 0);
}

void IfaceStaticDNSActionMenu::onEscape(MenuContext *context) {
    if (isHeld(panel, keyEscape))
        return;
    deleteSelected = false;
    leaveScreen(this, drawn, context, IfaceStaticListDNSMenu::instance());
}

void IfaceStaticDNSActionMenu::onEnter(MenuContext *context) {
    if (isHeld(panel, keyEnter))
        return;
    leaveScreen(this, drawn, context, deleteSelected ? deleteServer() : editServer());
}

Menu *IfaceStaticDNSActionMenu::deleteServer() {
    if (config != nullptr)
        config->removeDns(static_cast<std::uint32_t>(serverIndex));
    deleteSelected = false;
    serverIndex = noServer;
    return IfaceStaticListDNSMenu::instance();
}

Menu *IfaceStaticDNSActionMenu::editServer() {
    auto *editor = IfaceStaticEditDNSMenu::instance();
    editor->setConfig(config);
    editor->setServerIndex(serverIndex);
    return editor;
}
