#pragma once

#include "netconfig/NetworkConfig.h"
#include "runtime/DrawnOnce.h"
#include "runtime/Menu.h"

#include <memory>
#include <string>

/// Asks whether a port takes its address by DHCP or uses static settings. The marker is the model:
/// moving it changes the setting at once, and Escape does not undo it.
class IfaceTypeMenu : public Menu {
  public:
    static IfaceTypeMenu *instance() {
        static auto *const only = new IfaceTypeMenu;
        return only;
    }

    /// Replaces the settings that are being edited by those that the system's files hold for this
    /// port. To be called before the screen is made current.
    void selectInterface(const std::string &name);

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    IfaceTypeMenu() = default;

    DrawnOnce drawn{this};
    std::unique_ptr<NetworkConfig> config; ///< the one that all configuration screens work on
};
