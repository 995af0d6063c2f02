#include "editors/IfaceStaticEditIPMenu.h"

IfaceStaticEditIPMenu *IfaceStaticEditIPMenu::theInstance = nullptr;

IfaceStaticEditIPMenu *IfaceStaticEditIPMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new IfaceStaticEditIPMenu;
    return theInstance;
}

void IfaceStaticEditIPMenu::display(MenuContext *) {
    editor.display(portAddress);
}

void IfaceStaticEditIPMenu::onUp(MenuContext *) {
    editor.stepUp();
}

void IfaceStaticEditIPMenu::onDown(MenuContext *) {
    editor.stepDown();
}

void IfaceStaticEditIPMenu::onEscape(MenuContext *context) {
    editor.stepBack(portAddress, this, context);
}

void IfaceStaticEditIPMenu::onEnter(MenuContext *context) {
    editor.stepOn(portAddress, this, context);
}
