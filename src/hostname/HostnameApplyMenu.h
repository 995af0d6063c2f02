#pragma once

#include "runtime/DrawnOnce.h"
#include "runtime/Menu.h"
#include "runtime/String.h"

#include <string>

/// Asks for confirmation of a new host name, refuses a bad one, and has the configuration script
/// set a good one, which reboots the appliance.
class HostnameApplyMenu : public Menu {
  public:
    static HostnameApplyMenu *instance() {
        static auto *const only = new HostnameApplyMenu;
        return only;
    }

    /// Takes the name without the blanks around it. To be called before the screen is made current.
    void setHostname(const std::string &name);

    void display(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

    /// True for a name that neither begins nor ends with a hyphen and does not begin with a digit.
    /// The name must not be empty.
    [[nodiscard]] bool isValidHostname() const;
    /// Starts the configuration script, and forgets the name: another Enter applies nothing.
    void applyHostname();

  private:
    HostnameApplyMenu() = default;

    void refuse(const char *error, MenuContext *context);

    DrawnOnce drawn{this};
    QLX::String<char> hostname;
};
