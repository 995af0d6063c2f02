#include "runtime/leaveScreen.h"

#include "runtime/Menu.h"

void leaveScreen(Menu *screen, bool &drawn, MenuContext *context, Menu *next) {
    drawn = false;
    screen->setMenu(context, next);
}
