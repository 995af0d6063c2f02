#pragma once

#include "runtime/Menu.h"

#include <array>
#include <cstdint>
#include <string>

class NetworkConfig;

/// The list of what can be done with a port's static settings, two items at a time. The marker
/// moves within the window first; the window scrolls when the marker is at its edge.
class IfaceStaticMenu : public Menu {
  public:
    static IfaceStaticMenu *instance();

    /// Not owned. To be called before the screen is made current.
    void setConfig(NetworkConfig *settings) { config = settings; }

    /// Applies the settings and waits for the outcome. False when they were refused; the reason has
    /// then been on the panel for 3 s, during which no key is read.
    bool applyStatic();

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    IfaceStaticMenu();

    std::string renderItems() const;
    void redrawItems();
    void moveMarkerTo(bool bottomRow);
    std::int32_t selectedItem() const;
    void selectFirstItem();
    void openItem(MenuContext *context);
    void applyChanges(MenuContext *context);

    bool drawn = false;
    NetworkConfig *config = nullptr;
    std::array<std::string, 6> items;
    std::int32_t topItem = 0; ///< item on the top row, 0 to 4
    bool cursorRow = false;   ///< true: the marker is on the bottom row

    static IfaceStaticMenu *theInstance;
};
