#pragma once

#include "editors/AddressEditor.h"
#include "runtime/Menu.h"

/// Edits the netmask of the port being configured.
class IfaceStaticEditNMMenu : public Menu {
  public:
    static IfaceStaticEditNMMenu *instance() {
        static auto *const only = new IfaceStaticEditNMMenu;
        return only;
    }

    /// Not owned. To be called before the screen is made current.
    void setConfig(NetworkConfig *settings) { editor.setConfig(settings); }

    void display(MenuContext *) override { editor.display(); }
    void onUp(MenuContext *) override { editor.onUp(); }
    void onDown(MenuContext *) override { editor.onDown(); }
    void onEscape(MenuContext *context) override { editor.onEscape(context); }
    void onEnter(MenuContext *context) override { editor.onEnter(context); }

  private:
    IfaceStaticEditNMMenu();

    AddressEditor editor;
};
