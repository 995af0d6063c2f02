#pragma once

#include "editors/AddressEditor.h"
#include "runtime/Menu.h"

/// Edits the address of the port being configured.
class IfaceStaticEditIPMenu : public Menu {
  public:
    static IfaceStaticEditIPMenu *instance() {
        static auto *const only = new IfaceStaticEditIPMenu;
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
    IfaceStaticEditIPMenu();

    AddressEditor editor;
};
