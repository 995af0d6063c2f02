#include "runtime/MainLoop.h"

#include "runtime/LcdPanel.h"
#include "runtime/MenuContext.h"
#include "status/MainMenu.h"

#include <csignal>
#include <unistd.h>

namespace {

constexpr useconds_t turnPauseUs = 100000;

// The request is a flag that needs no object: the signal may come before the main menu exists, or
// while its constructor is waiting for a command, where building a second one would deadlock.
void requestRefresh(int) {
    MainMenu::requestRefresh();
}

} // namespace

MainLoop::MainLoop() {
    signal(SIGUSR1, requestRefresh);
    panel = LcdPanel::instance(); // opened long since, by an initialiser
    context = new MenuContext(MainMenu::instance());
}

void MainLoop::turn() {
    switch (panel->pollKey()) {
    case keyUp:
        context->onUp();
        break;
    case keyDown:
        context->onDown();
        break;
    case keyEnter:
        context->onEnter();
        break;
    case keyEscape:
        context->onEscape();
        break;
    default:
        break;
    }
    context->display();
    usleep(turnPauseUs);
}
