#pragma once

#include "runtime/Menu.h"
#include "runtime/String.h"

#include <string>

/// Asks for confirmation of a new host name, refuses a bad one, and has the configuration script
/// set a good one, which reboots the appliance.
class HostnameApplyMenu : public Menu {
  public:
    static HostnameApplyMenu *instance();

    /// Takes the name without the blanks around it. To be called before the screen is made current.
    void setHostname(const std::string &name);

    void display(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    HostnameApplyMenu() = default;

    bool isValidHostname() const;
    void applyHostname();
    void refuse(const char *error, MenuContext *context);

    bool drawn = false;
    QLX::String<char> hostname;

    static HostnameApplyMenu *theInstance;
};
