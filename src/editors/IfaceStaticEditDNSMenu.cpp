#include "editors/IfaceStaticEditDNSMenu.h"

IfaceStaticEditDNSMenu::IfaceStaticEditDNSMenu() : editor(this, newServer) {}

void IfaceStaticEditDNSMenu::setServerIndex(ServerIndex index) {
    editor.editForOneVisit(index < 0 ? newServer : listedServer, index);
}
