#include "editors/EditedAddress.h"

#include "editors/IfaceStaticDNSActionMenu.h"
#include "editors/IfaceStaticListDNSMenu.h"
#include "netconfig/IfaceStaticMenu.h"
#include "netconfig/NetworkConfig.h"

namespace {

template <std::string (NetworkConfig::*get)() const>
std::string setting(const NetworkConfig &config, ServerIndex) {
    return (config.*get)();
}

template <void (NetworkConfig::*set)(const std::string &)>
void storeSetting(NetworkConfig &config, ServerIndex, const std::string &text) {
    (config.*set)(text);
}

std::string nothing(const NetworkConfig &, ServerIndex) {
    return "";
}

std::string server(const NetworkConfig &config, ServerIndex index) {
    return config.getDns(static_cast<std::uint32_t>(index));
}

void replaceServer(NetworkConfig &config, ServerIndex index, const std::string &text) {
    config.setDns(static_cast<std::uint32_t>(index), text);
}

template <typename Screen> Menu *to() {
    return Screen::instance();
}

} // namespace

// clang-format off
const EditedAddress portAddress{
    "Enter IP Addr:\n",
    setting<&NetworkConfig::getAddress>, storeSetting<&NetworkConfig::setAddress>,
    to<IfaceStaticMenu>, to<IfaceStaticMenu>};
const EditedAddress portNetmask{
    "Enter Netmask:\n",
    setting<&NetworkConfig::getNetmask>, storeSetting<&NetworkConfig::setNetmask>,
    to<IfaceStaticMenu>, to<IfaceStaticMenu>};
const EditedAddress portGateway{
    "Enter Gateway:\n",
    setting<&NetworkConfig::getGateway>, storeSetting<&NetworkConfig::setGateway>,
    to<IfaceStaticMenu>, to<IfaceStaticMenu>};
const EditedAddress newServer{
    "DNS Server Addr:\n",
    nothing, storeSetting<&NetworkConfig::addDns>,
    to<IfaceStaticMenu>, to<IfaceStaticMenu>};
const EditedAddress listedServer{
    "DNS Server Addr:\n",
    server, replaceServer,
    to<IfaceStaticDNSActionMenu>, to<IfaceStaticListDNSMenu>};
// clang-format on
