#include "runtime/Menu.h"

#include "runtime/LcdPanel.h"
#include "runtime/MenuContext.h"

Menu::Menu() : panel(LcdPanel::instance()) {}

void Menu::display(MenuContext *) {}
void Menu::onUp(MenuContext *) {}
void Menu::onDown(MenuContext *) {}
void Menu::onEscape(MenuContext *) {}
void Menu::onEnter(MenuContext *) {}

void Menu::setMenu(MenuContext *context, Menu *next) {
    context->setMenu(next);
}
