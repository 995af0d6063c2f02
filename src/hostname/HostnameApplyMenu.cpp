#include "hostname/HostnameApplyMenu.h"

#include "hostname/HostnameEditMenu.h"
#include "runtime/LcdPanel.h"
#include "runtime/configurationScript.h"
#include "runtime/confirmationText.h"
#include "runtime/leaveScreen.h"
#include "status/MainMenu.h"

#include <unistd.h>

namespace {

constexpr useconds_t errorPauseUs = 2000000;

bool isDigit(char character) {
    return character >= '0' && character <= '9';
}

} // namespace

HostnameApplyMenu *HostnameApplyMenu::theInstance = nullptr;

HostnameApplyMenu *HostnameApplyMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new HostnameApplyMenu;
    return theInstance;
}

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

void HostnameApplyMenu::refuse(const char *error, MenuContext *context) {
    panel->showText(error);
    usleep(errorPauseUs);
    leaveScreen(this, drawn, context, HostnameEditMenu::instance());
}

void HostnameApplyMenu::display(MenuContext *) {
    if (drawn)
        return;
    drawn = true;
    panel->showText(confirmationText);
}

void HostnameApplyMenu::onEscape(MenuContext *context) {
    leaveScreen(this, drawn, context, MainMenu::instance());
}

void HostnameApplyMenu::onEnter(MenuContext *context) {
    if (isHeld(panel, keyEnter))
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
