#pragma once

#include "editors/AddressEditor.h"
#include "runtime/Menu.h"

/// Edits the default gateway of the port being configured.
class IfaceStaticEditGWMenu : public Menu {
  public:
    static IfaceStaticEditGWMenu *instance() {
        static auto *const only = new IfaceStaticEditGWMenu;
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
    IfaceStaticEditGWMenu();

    AddressEditor editor;
};
