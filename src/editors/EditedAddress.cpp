#include "editors/EditedAddress.h"

#include "editors/IfaceStaticDNSActionMenu.h"
#include "editors/IfaceStaticListDNSMenu.h"
#include "netconfig/IfaceStaticMenu.h"
#include "netconfig/NetworkConfig.h"

namespace {

using Config = NetworkConfig;
using Text = const std::string &;

std::uint32_t position(ServerIndex server) {
    return static_cast<std::uint32_t>(server);
}

template <typename Screen> Menu *to() {
    return Screen::instance();
}

} // namespace

const EditedAddress portAddress{
    "Enter IP Addr:\n",
    [](const Config &config, ServerIndex) { return config.getAddress(); },
    [](Config &config, ServerIndex, Text text) { config.setAddress(text); },
    to<IfaceStaticMenu>,
    to<IfaceStaticMenu>,
};

const EditedAddress portNetmask{
    "Enter Netmask:\n",
    [](const Config &config, ServerIndex) { return config.getNetmask(); },
    [](Config &config, ServerIndex, Text text) { config.setNetmask(text); },
    to<IfaceStaticMenu>,
    to<IfaceStaticMenu>,
};

const EditedAddress portGateway{
    "Enter Gateway:\n",
    [](const Config &config, ServerIndex) { return config.getGateway(); },
    [](Config &config, ServerIndex, Text text) { config.setGateway(text); },
    to<IfaceStaticMenu>,
    to<IfaceStaticMenu>,
};

const EditedAddress newServer{
    "DNS Server Addr:\n",
    [](const Config &, ServerIndex) { return std::string(); },
    [](Config &config, ServerIndex, Text text) { config.addDns(text); },
    to<IfaceStaticMenu>,
    to<IfaceStaticMenu>,
};

const EditedAddress listedServer{
    "DNS Server Addr:\n",
    [](const Config &config, ServerIndex server) { return config.getDns(position(server)); },
    [](Config &config, ServerIndex server, Text text) { config.setDns(position(server), text); },
    to<IfaceStaticDNSActionMenu>,
    to<IfaceStaticListDNSMenu>,
};
