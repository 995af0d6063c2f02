#include "netconfig/RestartNetworkingMenu.h"

#include "runtime/LcdPanel.h"
#include "runtime/leaveScreen.h"
#include "runtime/runCommand.h"
#include "status/MainMenu.h"

#include <ace/OS_NS_sys_time.h>

#include <unistd.h>

namespace {

constexpr useconds_t firstPauseUs = 1000000;

constexpr const char *restartProcesses =
    "ps aux | egrep '/etc/init.d/networking|/opt/scripts/configureHostname.sh' | grep -v grep";

} // namespace

const ACE_Time_Value RestartNetworkingMenu::pollInterval(1);
RestartNetworkingMenu *RestartNetworkingMenu::theInstance = nullptr;

RestartNetworkingMenu *RestartNetworkingMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new RestartNetworkingMenu;
    return theInstance;
}

void RestartNetworkingMenu::display(MenuContext *context) {
    if (!drawn) {
        drawn = true;
        panel->showText("Restarting\nNetworking");
        usleep(firstPauseUs);
    }
    const ACE_Time_Value now = ACE_OS::gettimeofday();
    if (!(now - lastPoll > pollInterval))
        return;
    lastPoll = now;
    if (runCommand(restartProcesses, true).empty())
        leave(context);
}

void RestartNetworkingMenu::onUp(MenuContext *context) {
    leave(context);
}

void RestartNetworkingMenu::onDown(MenuContext *context) {
    leave(context);
}

void RestartNetworkingMenu::onEscape(MenuContext *context) {
    leave(context);
}

void RestartNetworkingMenu::onEnter(MenuContext *context) {
    leave(context);
}

void RestartNetworkingMenu::leave(MenuContext *context) {
    leaveScreen(this, drawn, context, MainMenu::instance());
}
