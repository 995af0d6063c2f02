#pragma once

#include "runtime/Menu.h"

#include <ace/Time_Value.h>

/// Waits until the system has finished restarting its network, or until any key is pressed.
class RestartNetworkingMenu : public Menu {
  public:
    static RestartNetworkingMenu *instance();

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

    bool drawn = false;
    ACE_Time_Value lastPoll; ///< zero: the first check is due at once

    static RestartNetworkingMenu *theInstance;
};
