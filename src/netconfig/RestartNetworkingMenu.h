#pragma once

#include "runtime/DrawnOnce.h"
#include "runtime/Menu.h"

#include <ace/Time_Value.h>

/// Waits until the system has finished restarting its network, or until any key is pressed.
///
/// Both applies wait for the script and go straight back to the status pages, so no screen opens
/// this one. It is kept, whole and tested, for a script that restarts the network in the
/// background.
class RestartNetworkingMenu : public Menu {
  public:
    static RestartNetworkingMenu *instance() {
        static auto *const only = new RestartNetworkingMenu;
        return only;
    }

    /// Blocks for 1 s when the screen is first drawn, then looks for the restart's processes at
    /// most once a second.
    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    RestartNetworkingMenu() = default;

    void leave(MenuContext *context);

    static const ACE_Time_Value pollInterval;

    DrawnOnce drawn{this};
    ACE_Time_Value lastPoll; ///< zero: the first check is due at once
};
