#include "netconfig/RestartNetworkingMenu.h"

#include "runtime/runCommand.h"
#include "runtime/showFor.h"
#include "status/MainMenu.h"

#include <ace/OS_NS_sys_time.h>

namespace {

constexpr std::chrono::seconds firstPause{1};

constexpr const char *restartProcesses =
    "ps aux | egrep '/etc/init.d/networking|/opt/scripts/configureHostname.sh' | grep -v grep";

} // namespace

const ACE_Time_Value RestartNetworkingMenu::pollInterval(1);

void RestartNetworkingMenu::display(MenuContext *context) {
    if (drawn.claimDrawing())
        showFor(panel, firstPause, "Restarting\nNetworking");
    const ACE_Time_Value now = ACE_OS::gettimeofday();
    if (!(now - lastPoll > pollInterval))
        return;
    lastPoll = now;
    if (runCommand(restartProcesses, true).empty())
        leave(context);
}

// No key has a hold filter: any key ends the wait, even one that was down before.
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
    drawn.leaveFor(context, MainMenu::instance());
}
