#pragma once

#include "editors/AddressEditor.h"

/// Edits the netmask of the port being configured.
class IfaceStaticEditNMMenu : public AddressEditor {
  public:
    static IfaceStaticEditNMMenu *instance() {
        static auto *const only = new IfaceStaticEditNMMenu;
        return only;
    }

  private:
    IfaceStaticEditNMMenu() : AddressEditor(portNetmask) {}
};
