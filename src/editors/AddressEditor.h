#pragma once

#include "editors/DottedQuad.h"
#include "editors/EditedAddress.h"
#include "runtime/DrawnOnce.h"
#include "runtime/Menu.h"

#include <cstdint>

class NetworkConfig;

/// What the four address screens have in common: an address on row 1, with the cursor blinking on
/// the last digit of one octet. Up and Down change that octet; Enter goes on and, on the last
/// octet, stores the address; Escape goes back and, on the first, leaves without storing. An
/// `EditedAddress` says which address it is and where the screen leads.
class AddressEditor : public Menu {
  public:
    /// Not owned. To be called before the screen is made current; without it nothing is drawn and
    /// nothing stored.
    void setConfig(NetworkConfig *settings) { config = settings; }

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  protected:
    explicit AddressEditor(const EditedAddress &edited);
    ~AddressEditor() = default;

    /// Edits another address, one in the list of servers, until the screen is left.
    void editForOneVisit(const EditedAddress &edited, ServerIndex index);

  private:
    std::int32_t &octet();
    void changeOctet(std::int32_t value);
    void leaveFor(MenuContext *context, Menu *next);

    DrawnOnce drawn;
    NetworkConfig *config = nullptr;
    Octets octets{};
    std::int32_t octetIndex = 0; ///< 0 to 3
    const EditedAddress &ownAddress;
    const EditedAddress *address; ///< the one that is edited on this visit
    ServerIndex serverIndex = noServer;
};
