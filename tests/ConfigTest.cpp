#include "Operator.h"

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
    world().appliance.files = {{"/etc/network/interfaces", interfaces},
                               {"/etc/resolv.conf", servers}};
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

FRESH_TEST(Config, ServersAreNotReadWithoutTheInterfaces) {
    const std::string servers = "nameserver 8.8.8.8\nnameserver 0.0.0.0\nnameserver \n"
                                "# nameserver 1.1.1.1\n nameserver 2.2.2.2\nnameserver\t3.3.3.3\n"
                                "nameserver  9.9.9.9";
    EXPECT_EQ(settingsOf(loaded("iface eth1 inet dhcp\n", servers)),
              "dhcp [] [] [] 8.8.8.8  9.9.9.9");
    NetworkConfig config = loaded("", servers);
    EXPECT_EQ(config.getDns(2), "");
    config.setDns(2, "1.1.1.1");
    config.removeDns(2);
    config.removeDns(UINT32_MAX);
    config.addDns("0.0.0.0");
    config.addDns("");
    EXPECT_EQ(settingsOf(config), "static [] [] [] 8.8.8.8  9.9.9.9");
    config.setAddress("10.1.1.1");
    world().appliance.files.erase("/etc/network/interfaces");
    config.load();
    EXPECT_EQ(settingsOf(config), "static [] [] []");
}

FRESH_TEST(Config, SettingsBecomeACommandLine) {
    struct Case {
        bool dhcp;
        std::string address, netmask, gateway, options, refusal;
    };
    const std::string dns = " --dns 8.8.8.8 --dns 1.1.1.1";
    const std::vector<Case> cases = {
        {true, "", "", "", " --dhcp" + dns, ""},
        {true, "10.1.1.1", "255.0.0.0", "10.1.1.2", " --dhcp" + dns, ""},
        {false, "10.1.1.1", "255.0.0.0", "10.1.1.2",
         " --ipaddress 10.1.1.1 --netmask 255.0.0.0 --gateway 10.1.1.2" + dns, ""},
        {false, "10.1.1.1", "255.0.0.0", "0.0.0.0",
         " --ipaddress 10.1.1.1 --netmask 255.0.0.0" + dns, ""},
        {false, "$(x) y", "z", "", " --ipaddress $(x) y --netmask z" + dns, ""},
        {false, "0.0.0.0", "", "", "", "Invalid IP Addr"},
        {false, "", "255.0.0.0", "", "", "Invalid IP Addr"},
        {false, "10.1.1.1", "", "", "", "Invalid Netmask"},
        {false, "10.1.1.1", "0.0.0.0", "", "", "Invalid Netmask"},
    };
    for (const auto &test : cases) {
        NetworkConfig config =
            loaded("", "nameserver 8.8.8.8\nnameserver 7.7.7.7\nnameserver 1.1.1.1\n");
        config.setDhcp(test.dhcp);
        config.setAddress(test.address);
        config.setNetmask(test.netmask);
        config.setGateway(test.gateway);
        config.setDns(1, "0.0.0.0");
        world().events.clear();
        std::vector<std::string> expected;
        if (test.refusal.empty())
            expected = {applyScript + "iface --name eth1" + test.options + ";echo $?"};
        for (const std::string &command : expected)
            world().appliance.prints[command] = "0\n";
        EXPECT_EQ(config.apply(), test.refusal);
        EXPECT_EQ(world().commands("run"), expected);
    }
    NetworkConfig bare = loaded("iface eth1 inet dhcp\n", "");
    std::string &output =
        world().appliance.prints[applyScript + "iface --name eth1 --dhcp;echo $?"];
    for (const std::string good : {"0\n", "0", "0x"}) {
        output = good;
        EXPECT_EQ(bare.apply(), "") << output;
    }
    for (const std::string bad : {"1\n", "127\n", "", "note\n0\n", " 0\n"}) {
        output = bad;
        EXPECT_EQ(bare.apply(), "Check Logfile") << output;
    }
    world().shellWorks = false;
    EXPECT_EQ(bare.apply(), "Check Logfile");
}
