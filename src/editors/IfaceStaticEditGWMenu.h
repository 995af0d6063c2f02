#pragma once

#include "editors/AddressEditor.h"

/// Edits the default gateway of the port being configured.
class IfaceStaticEditGWMenu : public AddressEditor {
  public:
    static IfaceStaticEditGWMenu *instance() {
        static auto *const only = new IfaceStaticEditGWMenu;
        return only;
    }

  private:
    IfaceStaticEditGWMenu() : AddressEditor(portGateway) {}
};
