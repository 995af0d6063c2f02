#pragma once

#include "editors/AddressEditor.h"
#include "runtime/Menu.h"

/// Adds a DNS server to the port in work, or changes one of those that it has.
class IfaceStaticEditDNSMenu : public Menu {
  public:
    static IfaceStaticEditDNSMenu *instance();

    /// Not owned. To be called before the screen is made current.
    void setConfig(NetworkConfig *settings) { editor.setConfig(settings); }

    /// Position of the server to be changed, negative to add one. Holds for one visit.
    void setServerIndex(ServerIndex index) { serverIndex = index; }

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    IfaceStaticEditDNSMenu() = default;

    const EditedAddress &edited() const;

    AddressEditor editor;
    ServerIndex serverIndex = noServer;

    static IfaceStaticEditDNSMenu *theInstance;
};
