#include "editors/IfaceStaticDNSActionMenu.h"

#include "editors/IfaceStaticEditDNSMenu.h"
#include "editors/IfaceStaticListDNSMenu.h"
#include "netconfig/NetworkConfig.h"
#include "runtime/KeyFilters.h"
#include "runtime/LcdPanel.h"
#include "runtime/drawMarkers.h"

void IfaceStaticDNSActionMenu::display(MenuContext *) {
    if (!drawn.claimDrawing())
        return;
    panel->showText("  Edit Svr\n  Delete Svr");
    drawMarkers(deleteSelected ? 1 : 0);
}

// Up and Down have no hold filter: the marker stops at once, so a held key has nothing to repeat.
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
    drawMarkers(deletion ? 1 : 0);
}

void IfaceStaticDNSActionMenu::drawMarkers(int row) {
    ::drawMarkers(panel, row);
}

void IfaceStaticDNSActionMenu::onEscape(MenuContext *context) {
    if (!actsOncePerPress(panel, keyEscape))
        return;
    deleteSelected = false;
    drawn.leaveFor(context, IfaceStaticListDNSMenu::instance());
}

void IfaceStaticDNSActionMenu::onEnter(MenuContext *context) {
    if (!actsOncePerPress(panel, keyEnter))
        return;
    drawn.leaveFor(context, deleteSelected ? deleteServer() : editServer());
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
