#include "runtime/DrawnOnce.h"

#include "runtime/Menu.h"

#include <utility>

bool DrawnOnce::claimDrawing() {
    return !std::exchange(drawn, true);
}

void DrawnOnce::leaveFor(MenuContext *context, Menu *next) {
    drawn = false;
    screen->setMenu(context, next);
}
