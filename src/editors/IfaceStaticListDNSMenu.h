#pragma once

#include "runtime/Menu.h"

#include <array>
#include <cstdint>
#include <string>

class NetworkConfig;

/// The DNS servers of the port in work, two at a time; Enter opens what can be done with one. Only
/// the first ten can be reached from the panel.
class IfaceStaticListDNSMenu : public Menu {
  public:
    static IfaceStaticListDNSMenu *instance();

    /// Not owned. To be called before the screen is made current.
    void setConfig(NetworkConfig *settings) { config = settings; }

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    IfaceStaticListDNSMenu() = default;

    void readServers();
    std::int32_t storedCount() const;
    std::string renderList() const;
    void redrawList();
    void moveMarkerTo(std::uint8_t row);
    void selectFirstServer();

    bool drawn = false;
    NetworkConfig *config = nullptr;
    std::array<std::string, 10> servers;
    std::int32_t serverCount = 0; ///< as the settings reported it; may exceed what is stored
    std::int32_t topIndex = 0;    ///< server on row 0
    std::uint8_t cursorRow = 0;   ///< the selected server is `topIndex + cursorRow`

    static IfaceStaticListDNSMenu *theInstance;
};
