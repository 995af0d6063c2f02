#pragma once

#include "editors/AddressEditor.h"
#include "runtime/Menu.h"

/// Edits the default gateway of the port in work.
class IfaceStaticEditGWMenu : public Menu {
  public:
    static IfaceStaticEditGWMenu *instance();

    /// Not owned. To be called before the screen is made current.
    void setConfig(NetworkConfig *settings) { editor.setConfig(settings); }

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    IfaceStaticEditGWMenu() = default;

    AddressEditor editor;

    static IfaceStaticEditGWMenu *theInstance;
};
