#include "runtime/MainLoop.h"
#include "status/MainMenu.h"

int main() {
    MainLoop loop(MainMenu::instance, MainMenu::requestRefresh);
    for (;;)
        loop.turn();
}
