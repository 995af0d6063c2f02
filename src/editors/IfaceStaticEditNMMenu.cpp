#include "editors/IfaceStaticEditNMMenu.h"

IfaceStaticEditNMMenu *IfaceStaticEditNMMenu::theInstance = nullptr;

IfaceStaticEditNMMenu *IfaceStaticEditNMMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new IfaceStaticEditNMMenu;
    return theInstance;
}

void IfaceStaticEditNMMenu::display(MenuContext *) {
    editor.display(portNetmask);
}

void IfaceStaticEditNMMenu::onUp(MenuContext *) {
    editor.stepUp();
}

void IfaceStaticEditNMMenu::onDown(MenuContext *) {
    editor.stepDown();
}

void IfaceStaticEditNMMenu::onEscape(MenuContext *context) {
    editor.stepBack(portNetmask, this, context);
}

void IfaceStaticEditNMMenu::onEnter(MenuContext *context) {
    editor.stepOn(portNetmask, this, context);
}
