#include "runtime/MainLoop.h"

#include "runtime/LcdPanel.h"
#include "runtime/MenuContext.h"
#include "runtime/pauseFor.h"

#include <csignal>

namespace {

constexpr std::chrono::milliseconds turnPause{100};

void (*refreshRequest)() = nullptr;

void onRefreshSignal(int) {
    refreshRequest();
}

} // namespace

MainLoop::MainLoop(const std::function<Menu *()> &firstScreen, void (*requestRefresh)()) {
    refreshRequest = requestRefresh;
    signal(SIGUSR1, onRefreshSignal);
    panel = LcdPanel::instance(); // a static initialiser has opened it already
    context = new MenuContext(firstScreen());
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
    pauseFor(turnPause);
}
