#pragma once

#include "editors/DottedQuad.h"
#include "editors/EditedAddress.h"

#include <cstdint>

class LcdPanel;
class Menu;
class MenuContext;
class NetworkConfig;

/// What the four address screens have in common: an address on row 1, with the cursor blinking on
/// the last digit of one octet. Up and Down change that octet; Enter walks on and, on the last
/// octet, stores the address; Escape walks back and, on the first, leaves without storing. Which
/// address it is, and where the screen leads, stands in its row of the table of addresses.
class AddressEditor {
  public:
    AddressEditor();

    /// Not owned. Without it nothing is drawn and nothing stored.
    void setConfig(NetworkConfig *settings) { config = settings; }

    void display(const EditedAddress &edited, ServerIndex server = noServer);
    void stepUp();
    void stepDown();
    /// Both return true when they have left `screen`, the one that this is the editor of.
    bool stepBack(const EditedAddress &edited, Menu *screen, MenuContext *context);
    bool stepOn(const EditedAddress &edited, Menu *screen, MenuContext *context,
                ServerIndex server = noServer);

  private:
    std::int32_t &octet();
    void leave(Menu *screen, MenuContext *context, Menu *next);

    LcdPanel *panel;
    bool drawn = false;
    NetworkConfig *config = nullptr;
    Octets octets{};
    std::int32_t octetIndex = 0; ///< 0 to 3
};
