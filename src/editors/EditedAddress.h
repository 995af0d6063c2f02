// The addresses that can be edited: one description for each way into an address editor.
#pragma once

#include <cstdint>
#include <string>

class Menu;
class NetworkConfig;

/// Position of a server in the list of DNS servers; negative where the address is not in the list.
using ServerIndex = std::int32_t;
constexpr ServerIndex noServer = -1;

struct EditedAddress {
    const char *prompt; ///< ends with the line feed in front of the address
    std::string (*shown)(const NetworkConfig &config, ServerIndex server);
    void (*store)(NetworkConfig &config, ServerIndex server, const std::string &text);
    Menu *(*afterEscape)();
    Menu *(*afterStore)();
};

extern const EditedAddress portAddress;
extern const EditedAddress portNetmask;
extern const EditedAddress portGateway;
extern const EditedAddress newServer;
extern const EditedAddress listedServer;
