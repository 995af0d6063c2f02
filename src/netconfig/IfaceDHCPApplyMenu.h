#pragma once

#include "runtime/DrawnOnce.h"
#include "runtime/Menu.h"

class NetworkConfig;

/// Asks for confirmation before a port is switched to DHCP. Whether that succeeds or not, the
/// panel goes back to the status pages, where the port shows whether it has got an address.
class IfaceDHCPApplyMenu : public Menu {
  public:
    static IfaceDHCPApplyMenu *instance() {
        static auto *const only = new IfaceDHCPApplyMenu;
        return only;
    }

    /// Not owned. To be called before the screen is made current.
    void setConfig(NetworkConfig *settings) { config = settings; }

    void display(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    IfaceDHCPApplyMenu() = default;

    DrawnOnce drawn{this};
    NetworkConfig *config = nullptr;
};
