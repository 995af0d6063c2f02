#pragma once

#include "editors/AddressEditor.h"

/// Adds a DNS server to the port being configured, or changes one of those that it has.
class IfaceStaticEditDNSMenu : public AddressEditor {
  public:
    static IfaceStaticEditDNSMenu *instance() {
        static auto *const only = new IfaceStaticEditDNSMenu;
        return only;
    }

    /// Position of the server to be changed, negative to add one. Holds for one visit.
    void setServerIndex(ServerIndex index) {
        editForOneVisit(index < 0 ? newServer : listedServer, index);
    }

  private:
    IfaceStaticEditDNSMenu() : AddressEditor(newServer) {}
};
