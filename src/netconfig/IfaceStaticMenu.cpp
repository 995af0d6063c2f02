#include "netconfig/IfaceStaticMenu.h"

#include "editors/IfaceStaticEditDNSMenu.h"
#include "editors/IfaceStaticEditGWMenu.h"
#include "editors/IfaceStaticEditIPMenu.h"
#include "editors/IfaceStaticEditNMMenu.h"
#include "editors/IfaceStaticListDNSMenu.h"
#include "netconfig/IfaceTypeMenu.h"
#include "netconfig/NetworkConfig.h"
#include "runtime/KeyFilters.h"
#include "runtime/LcdPanel.h"
#include "runtime/showFor.h"
#include "status/MainMenu.h"

#include <iterator>

namespace {

constexpr std::size_t labelColumns = 13; // between the marker with its blank and the indicator
static_assert(2 + labelColumns + 1 == LcdPanel::visibleColumns);

constexpr std::chrono::seconds errorTime{3};

} // namespace

struct IfaceStaticMenu::Item {
    char label[labelColumns + 1]; // an array, so that a label that is too long does not compile
    void (IfaceStaticMenu::*enter)(MenuContext *context);
};

const IfaceStaticMenu::Item IfaceStaticMenu::items[] = {
    {"Set IP Addr", &IfaceStaticMenu::openScreen<IfaceStaticEditIPMenu>},
    {"Set Netmask", &IfaceStaticMenu::openScreen<IfaceStaticEditNMMenu>},
    {"Set Gateway", &IfaceStaticMenu::openScreen<IfaceStaticEditGWMenu>},
    {"Add DNS Svr", &IfaceStaticMenu::openScreen<IfaceStaticEditDNSMenu>},
    {"Lst DNS Svrs", &IfaceStaticMenu::openScreen<IfaceStaticListDNSMenu>},
    {"Apply Changes", &IfaceStaticMenu::applyChanges},
};

bool IfaceStaticMenu::applyStatic() {
    if (config == nullptr)
        return false;
    const std::string error = config->apply();
    if (error.empty())
        return true;
    showFor(panel, errorTime, "Error:\n" + error);
    return false;
}

std::string IfaceStaticMenu::renderItems() const {
    const auto row = [this](int number, bool goesOn, const char *indicator) {
        std::string label = items[window.entryOn(number)].label;
        label.resize(labelColumns, ' ');
        return std::string(1, window.marker(number)) + " " + label + (goesOn ? indicator : "");
    };
    return row(0, window.hasEntriesAbove(), "^") + "\n" +
           row(1, window.hasEntriesBelow(std::size(items)), "v");
}

void IfaceStaticMenu::display(MenuContext *) {
    if (drawn.claimDrawing())
        panel->showText(renderItems());
}

void IfaceStaticMenu::onUp(MenuContext *) {
    if (actsRestsAndRepeats(panel, keyUp) && window.up())
        panel->showText(renderItems());
}

void IfaceStaticMenu::onDown(MenuContext *) {
    if (actsRestsAndRepeats(panel, keyDown) && window.down(std::size(items)))
        panel->showText(renderItems());
}

void IfaceStaticMenu::onEscape(MenuContext *context) {
    if (!actsOncePerPress(panel, keyEscape))
        return;
    window.selectFirst();
    drawn.leaveFor(context, IfaceTypeMenu::instance());
}

void IfaceStaticMenu::onEnter(MenuContext *context) {
    if (actsOncePerPress(panel, keyEnter))
        (this->*items[window.selected()].enter)(context);
}

template <typename Screen> void IfaceStaticMenu::openScreen(MenuContext *context) {
    Screen::instance()->setConfig(config);
    drawn.leaveFor(context, Screen::instance());
}

void IfaceStaticMenu::applyChanges(MenuContext *context) {
    panel->showText("Applying\nStatic Settings");
    if (!applyStatic()) {
        drawn.drawAgain(); // the items come back where the error stood
        return;
    }
    config = nullptr;
    window.selectFirst();
    drawn.leaveFor(context, MainMenu::instance());
}
