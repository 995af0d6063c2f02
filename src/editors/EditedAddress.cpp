#include "editors/EditedAddress.h"

#include "editors/IfaceStaticDNSActionMenu.h"
#include "editors/IfaceStaticListDNSMenu.h"
#include "netconfig/IfaceStaticMenu.h"
#include "netconfig/NetworkConfig.h"

namespace {

std::uint32_t position(ServerIndex server) {
    return static_cast<std::uint32_t>(server);
}

template <typename Screen> Menu *to() {
    return Screen::instance();
}

} // namespace

const EditedAddress portAddress{
    "Enter IP Addr:\n",
    [](const NetworkConfig &config, ServerIndex) { return config.getAddress(); },
    [](NetworkConfig &config, ServerIndex, const std::string &text) { config.setAddress(text); },
    to<IfaceStaticMenu>,
    to<IfaceStaticMenu>,
};

const EditedAddress portNetmask{
    "Enter Netmask:\n",
    [](const NetworkConfig &config, ServerIndex) { return config.getNetmask(); },
    [](NetworkConfig &config, ServerIndex, const std::string &text) { config.setNetmask(text); },
    to<IfaceStaticMenu>,
    to<IfaceStaticMenu>,
};

const EditedAddress portGateway{
    "Enter Gateway:\n",
    [](const NetworkConfig &config, ServerIndex) { return config.getGateway(); },
    [](NetworkConfig &config, ServerIndex, const std::string &text) { config.setGateway(text); },
    to<IfaceStaticMenu>,
    to<IfaceStaticMenu>,
};

const EditedAddress newServer{
    "DNS Server Addr:\n",
    [](const NetworkConfig &, ServerIndex) { return std::string(); },
    [](NetworkConfig &config, ServerIndex, const std::string &text) { config.addDns(text); },
    to<IfaceStaticMenu>,
    to<IfaceStaticMenu>,
};

const EditedAddress listedServer{
    "DNS Server Addr:\n",
    [](const NetworkConfig &config, ServerIndex server) { return config.getDns(position(server)); },
    [](NetworkConfig &config, ServerIndex server, const std::string &text) {
        config.setDns(position(server), text);
    },
    to<IfaceStaticDNSActionMenu>,
    to<IfaceStaticListDNSMenu>,
};
