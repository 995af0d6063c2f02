#pragma once

#include "runtime/DrawnOnce.h"
#include "runtime/Menu.h"
#include "runtime/onlyOne.h"

class NetworkConfig;

/// Asks for confirmation before a port is switched to DHCP. Whatever comes of it, the panel goes
/// back to the status pages: there the port shows whether it got an address.
class IfaceDHCPApplyMenu : public Menu {
  public:
    static IfaceDHCPApplyMenu *instance() {
        return onlyOne([] { return new IfaceDHCPApplyMenu; });
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
