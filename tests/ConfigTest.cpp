#include "RunningProgram.h"

#include "netconfig/NetworkConfig.h"

namespace {

std::string settingsOf(const NetworkConfig &config) {
    std::string all = config.isDhcp() ? "dhcp" : "static";
    for (const auto &setting : {config.getAddress(), config.getNetmask(), config.getGateway()})
        all += " [" + setting + "]";
    for (std::uint32_t k = 0; k < static_cast<std::uint32_t>(config.getDnsCount()); ++k)
        all += " " + config.getDns(k);
    return all;
}

NetworkConfig loaded(const std::string &interfaces, const std::string &servers) {
    world().appliance.act({"file", "/etc/network/interfaces", interfaces});
    world().appliance.act({"file", "/etc/resolv.conf", servers});
    NetworkConfig config("eth1");
    config.load();
    return config;
}

} // namespace

FRESH_TEST(Config, AStanzaIsReadAsItStands) {
    const std::string head = "auto eth1\niface eth1 inet static\n";
    const std::vector<std::pair<std::string, std::string>> cases = {
        {"iface eth1 inet dhcp\naddress 10.1.1.1\n", "dhcp [] [] []"},
        {"iface eth1 inet dhcpish", "dhcp [] [] []"},
        {"iface eth1 inet dhcp \naddress 10.1.1.1\n", "static [10.1.1.1] [] []"},
        {"iface eth1 \naddress 10.1.1.1\n", "static [10.1.1.1] [] []"},
        {"iface eth10 inet dhcp\n", "static [] [] []"},
        {" iface eth1 inet dhcp\n#iface eth1 inet dhcp\n", "static [] [] []"},
        {"iface eth1 inet manual\n\niface eth1 inet dhcp\n", "static [] [] []"},
        {head + "  address 10.1.1.5\n\tnetmask 255.0.0.0\ngateway 10.1.1.1\n\n  address 10.9.9.9\n",
         "static [10.1.1.5] [255.0.0.0] [10.1.1.1]"},
        {head + "address 10.1.1.5\niface eth2 inet static\naddress 10.2.2.5\n",
         "static [10.2.2.5] [] []"},
        {head + "address 10.1.1.5\n \nnetmask 255.0.0.0\nhwaddress ether 00:11:22",
         "static [00:11:22] [255.0.0.0] []"},
        {head + "#address 1.1.1.1\naddress 1.1.1.2 # old\nnetmask # gateway\ngateway\n",
         "static [] [] [gateway]"},
        {head + "address\t10.0.0.5\nnetmask 255.0.0.0\r\ngateway address 1.2.3.4\n",
         "static [1.2.3.4] [255.0.0.0\r] []"},
        {head + "address 10.0.0.5 \nnetmas 1.1.1.1\ngatewa 1.1.1.1\n\n", "static [] [] []"},
        {"", "static [] [] []"},
    };
    for (const auto &[interfaces, settings] : cases)
        EXPECT_EQ(settingsOf(loaded(interfaces, "")), settings) << interfaces;
}

FRESH_TEST(Config, AServerThatIsNotThereIsLeftAlone) {
    NetworkConfig config = loaded("", "nameserver 8.8.8.8\n");
    EXPECT_EQ(config.getDns(1), "");
    config.setDns(1, "1.1.1.1");
    config.removeDns(1);
    config.removeDns(UINT32_MAX);
    EXPECT_EQ(settingsOf(config), "static [] [] [] 8.8.8.8");
}
