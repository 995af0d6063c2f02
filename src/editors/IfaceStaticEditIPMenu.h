#pragma once

#include "editors/AddressEditor.h"

/// Edits the address of the port being configured.
class IfaceStaticEditIPMenu : public AddressEditor {
  public:
    static IfaceStaticEditIPMenu *instance() {
        static auto *const only = new IfaceStaticEditIPMenu;
        return only;
    }

  private:
    IfaceStaticEditIPMenu() : AddressEditor(portAddress) {}
};
