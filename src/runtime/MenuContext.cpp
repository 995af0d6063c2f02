#include "runtime/MenuContext.h"

#include "runtime/Menu.h"

MenuContext::MenuContext(Menu *first) : current(first) {}

void MenuContext::setMenu(Menu *next) {
    current = next;
}

void MenuContext::display() {
    current->display(this);
}
void MenuContext::onUp() {
    current->onUp(this);
}
void MenuContext::onDown() {
    current->onDown(this);
}
void MenuContext::onEscape() {
    current->onEscape(this);
}
void MenuContext::onEnter() {
    current->onEnter(this);
}
