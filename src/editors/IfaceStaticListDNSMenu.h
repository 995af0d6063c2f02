#pragma once

#include "runtime/DrawnOnce.h"
#include "runtime/ListWindow.h"
#include "runtime/Menu.h"

#include <array>
#include <cstdint>
#include <string>

class NetworkConfig;

/// The DNS servers of the port being configured, two at a time; Enter opens what can be done with
/// one. Only the first ten can be reached from the panel.
class IfaceStaticListDNSMenu : public Menu {
  public:
    static IfaceStaticListDNSMenu *instance() {
        static auto *const only = new IfaceStaticListDNSMenu;
        return only;
    }

    /// Not owned. To be called before the screen is made current.
    void setConfig(NetworkConfig *settings) { config = settings; }

    /// The servers in the window, with the marker in front of them.
    [[nodiscard]] std::string renderList() const;
    /// Moves the marker to `row`, 0 or 1, without drawing the servers again.
    void drawMarkers(int row) { window.drawMarkers(row); }

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    IfaceStaticListDNSMenu() = default;

    void readServers();
    [[nodiscard]] std::int32_t storedCount() const;

    DrawnOnce drawn{this};
    NetworkConfig *config = nullptr;
    std::array<std::string, 10> servers; ///< ten: the system itself asks only three
    std::int32_t serverCount = 0;        ///< as the settings reported it; may exceed what is stored
    ListWindow window{panel};
};
