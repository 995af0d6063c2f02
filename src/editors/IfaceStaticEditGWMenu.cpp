#include "editors/IfaceStaticEditGWMenu.h"

IfaceStaticEditGWMenu *IfaceStaticEditGWMenu::theInstance = nullptr;

IfaceStaticEditGWMenu *IfaceStaticEditGWMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new IfaceStaticEditGWMenu;
    return theInstance;
}

void IfaceStaticEditGWMenu::display(MenuContext *) {
    editor.display(portGateway);
}

void IfaceStaticEditGWMenu::onUp(MenuContext *) {
    editor.stepUp();
}

void IfaceStaticEditGWMenu::onDown(MenuContext *) {
    editor.stepDown();
}

void IfaceStaticEditGWMenu::onEscape(MenuContext *context) {
    editor.stepBack(portGateway, this, context);
}

void IfaceStaticEditGWMenu::onEnter(MenuContext *context) {
    editor.stepOn(portGateway, this, context);
}
