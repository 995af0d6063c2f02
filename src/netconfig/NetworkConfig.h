#pragma once

#include <cstdint>
#include <string>
#include <vector>

/// The network settings of one port while the operator works on them. They are text throughout,
/// taken from the system's files and handed to the configuration script as they stand; "0.0.0.0"
/// means not set, as "" does.
class NetworkConfig {
  public:
    /// An empty, static configuration of the port called `interfaceName`.
    explicit NetworkConfig(std::string interfaceName);

    /// Reads the port's stanza in `/etc/network/interfaces` and the servers in `/etc/resolv.conf`.
    /// What a file does not say, or a missing file, leaves the setting empty; without the first
    /// file the second is not read.
    void load();

    /// Hands the settings to the configuration script and waits for it. Returns "" on success, else
    /// a message that fits a row of the panel; settings that cannot work are refused without
    /// asking the script.
    std::string apply() const;

    [[nodiscard]] std::string getName() const { return name; }
    [[nodiscard]] std::string getAddress() const { return address; }
    [[nodiscard]] std::string getNetmask() const { return netmask; }
    [[nodiscard]] std::string getGateway() const { return gateway; }
    void setAddress(const std::string &text) { address = text; }
    void setNetmask(const std::string &text) { netmask = text; }
    void setGateway(const std::string &text) { gateway = text; }

    [[nodiscard]] bool isDhcp() const { return dhcp; }
    void setDhcp(bool enabled) { dhcp = enabled; }

    [[nodiscard]] std::int32_t getDnsCount() const;
    /// "" for a position that is not below the count.
    [[nodiscard]] std::string getDns(std::uint32_t position) const;
    /// Does nothing for a position that is not below the count.
    void setDns(std::uint32_t position, const std::string &text);
    /// Does nothing for a position that is not below the count.
    void removeDns(std::uint32_t position);
    /// Appends a server; ignores an address that is not set.
    void addDns(const std::string &text);

    [[nodiscard]] static bool isAddressSet(const std::string &text);

  private:
    [[nodiscard]] bool loadStanza();
    void loadDnsServers();
    [[nodiscard]] std::string staticOptions() const;
    [[nodiscard]] std::string dnsOptions() const;

    std::string name;
    std::string address;
    std::string netmask;
    std::string gateway;
    bool dhcp = false;
    std::vector<std::string> dnsServers;
};
