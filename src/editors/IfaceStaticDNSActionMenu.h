#pragma once

#include "editors/EditedAddress.h"
#include "runtime/DrawnOnce.h"
#include "runtime/Menu.h"

/// Asks whether a DNS server is to be edited or deleted. A deletion is not confirmed.
class IfaceStaticDNSActionMenu : public Menu {
  public:
    static IfaceStaticDNSActionMenu *instance() {
        static auto *const only = new IfaceStaticDNSActionMenu;
        return only;
    }

    /// Not owned. To be called before the screen is made current.
    void setConfig(NetworkConfig *settings) { config = settings; }
    /// Position of the server to be acted on.
    void setServerIndex(ServerIndex index) { serverIndex = index; }

    /// Shows the marker on `row`, 0 or 1. The choice itself stays.
    void drawMarkers(int row);

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    IfaceStaticDNSActionMenu() = default;

    void select(bool deletion);
    [[nodiscard]] Menu *deleteServer();
    [[nodiscard]] Menu *editServer();

    DrawnOnce drawn{this};
    NetworkConfig *config = nullptr;
    ServerIndex serverIndex = noServer;
    bool deleteSelected = false;
};
