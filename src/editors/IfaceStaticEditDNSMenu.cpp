#include "editors/IfaceStaticEditDNSMenu.h"

IfaceStaticEditDNSMenu *IfaceStaticEditDNSMenu::theInstance = nullptr;

IfaceStaticEditDNSMenu *IfaceStaticEditDNSMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new IfaceStaticEditDNSMenu;
    return theInstance;
}

void IfaceStaticEditDNSMenu::display(MenuContext *) {
    editor.display(edited(), serverIndex);
}

void IfaceStaticEditDNSMenu::onUp(MenuContext *) {
    editor.stepUp();
}

void IfaceStaticEditDNSMenu::onDown(MenuContext *) {
    editor.stepDown();
}

void IfaceStaticEditDNSMenu::onEscape(MenuContext *context) {
    if (editor.stepBack(edited(), this, context))
        serverIndex = noServer;
}

void IfaceStaticEditDNSMenu::onEnter(MenuContext *context) {
    if (editor.stepOn(edited(), this, context, serverIndex))
        serverIndex = noServer;
}

const EditedAddress &IfaceStaticEditDNSMenu::edited() const {
    return serverIndex < 0 ? newServer : listedServer;
}
