#pragma once

#include "editors/AddressEditor.h"
#include "runtime/Menu.h"

/// Adds a DNS server to the port being configured, or changes one of those that it has.
class IfaceStaticEditDNSMenu : public Menu {
  public:
    static IfaceStaticEditDNSMenu *instance() {
        static auto *const only = new IfaceStaticEditDNSMenu;
        return only;
    }

    /// Not owned. To be called before the screen is made current.
    void setConfig(NetworkConfig *settings) { editor.setConfig(settings); }
    /// Position of the server to be changed, negative to add one. Holds for one visit.
    void setServerIndex(ServerIndex index);

    void display(MenuContext *) override { editor.display(); }
    void onUp(MenuContext *) override { editor.onUp(); }
    void onDown(MenuContext *) override { editor.onDown(); }
    void onEscape(MenuContext *context) override { editor.onEscape(context); }
    void onEnter(MenuContext *context) override { editor.onEnter(context); }

  private:
    IfaceStaticEditDNSMenu();

    AddressEditor editor;
};
