#pragma once

#include "runtime/DrawnOnce.h"
#include "runtime/ListWindow.h"
#include "runtime/Menu.h"

#include <string>

class NetworkConfig;

/// The list of what can be done with a port's static settings, two items at a time.
class IfaceStaticMenu : public Menu {
  public:
    static IfaceStaticMenu *instance() {
        static auto *const only = new IfaceStaticMenu;
        return only;
    }

    /// Not owned. To be called before the screen is made current.
    void setConfig(NetworkConfig *settings) { config = settings; }

    /// The two items in the window, with the marker in front of them and, at the end of a row, a
    /// "^" or "v" where the list goes on.
    [[nodiscard]] std::string renderItems() const;

    /// Applies the settings and waits for the outcome. False without settings, and when they were
    /// refused; the reason has then been on the panel for 3 s, during which no key is read.
    [[nodiscard]] bool applyStatic();

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    struct Item;
    static const Item items[];

    IfaceStaticMenu() = default;

    template <typename Screen> void openScreen(MenuContext *context);
    void applyChanges(MenuContext *context);

    DrawnOnce drawn{this};
    NetworkConfig *config = nullptr;
    ListWindow window{panel};
};
