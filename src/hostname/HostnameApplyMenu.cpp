#include "hostname/HostnameApplyMenu.h"

#include "hostname/HostnameEditMenu.h"
#include "runtime/ConfigurationScript.h"
#include "runtime/KeyFilters.h"
#include "runtime/LcdPanel.h"
#include "runtime/confirmationText.h"
#include "runtime/showFor.h"
#include "status/MainMenu.h"

namespace {

constexpr std::chrono::seconds errorTime{2};

bool isDigit(char character) {
    return character >= '0' && character <= '9';
}

} // namespace

void HostnameApplyMenu::setHostname(const std::string &name) {
    hostname = name;
    hostname.trim();
}

bool HostnameApplyMenu::isValidHostname() const {
    return hostname.front() != '-' && hostname.back() != '-' && !isDigit(hostname.front());
}

void HostnameApplyMenu::applyHostname() {
    configureHostname(hostname);
    hostname.clear();
}

void HostnameApplyMenu::display(MenuContext *) {
    if (drawn.claimDrawing())
        panel->showText(confirmationText);
}

// No hold filter is needed: the screen is left at once, and Escape does no harm on the status
// pages.
void HostnameApplyMenu::onEscape(MenuContext *context) {
    drawn.leaveFor(context, MainMenu::instance());
}

void HostnameApplyMenu::onEnter(MenuContext *context) {
    if (!actsOncePerPress(panel, keyEnter))
        return;
    if (hostname.empty()) {
        refuse("Error\nEmpty Hostname", context);
    } else if (!isValidHostname()) {
        refuse("Error\nInvalid Hostname", context);
    } else {
        applyHostname();
        panel->showText("Rebooting\nappliance...");
    }
}

void HostnameApplyMenu::refuse(const char *error, MenuContext *context) {
    showFor(panel, errorTime, error);
    drawn.leaveFor(context, HostnameEditMenu::instance());
}
