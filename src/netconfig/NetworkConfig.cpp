#include "netconfig/NetworkConfig.h"

#include "runtime/ConfigurationScript.h"
#include "runtime/TextFile.h"
#include "runtime/beginsWith.h"

#include <utility>

namespace {

bool contains(const std::string &line, const char *word) {
    return line.find(word) != std::string::npos;
}

// Returns the whole line if it contains no space.
std::string afterLastSpace(const std::string &line) {
    return line.substr(line.rfind(' ') + 1);
}

} // namespace

NetworkConfig::NetworkConfig(std::string interfaceName) : name(std::move(interfaceName)) {}

void NetworkConfig::load() {
    *this = NetworkConfig(name);
    if (loadStanza())
        loadDnsServers();
}

bool NetworkConfig::loadStanza() {
    TextFile file("/etc/network/interfaces");
    if (!file.isOpen())
        return false;

    // The blank at the end keeps "eth1" from finding the stanza of "eth10".
    const std::string key = "iface " + name + " ";
    auto line = file.nextLine();
    while (line && !beginsWith(*line, key))
        line = file.nextLine();
    if (!line)
        return true; // no stanza: a static port without settings
    dhcp = beginsWith(afterLastSpace(*line), "dhcp");
    if (dhcp)
        return true;

    // Only an empty line ends a stanza, and a keyword counts anywhere in a line: a hardware address
    // is taken for an address, and what follows without an empty line is read into this port.
    for (line = file.nextLine(); line && !line->empty(); line = file.nextLine()) {
        if (contains(*line, "#"))
            continue;
        if (contains(*line, "address")) {
            address = afterLastSpace(*line);
        } else if (contains(*line, "netmask")) {
            netmask = afterLastSpace(*line);
        } else if (contains(*line, "gateway")) {
            gateway = afterLastSpace(*line);
        }
    }
    return true;
}

void NetworkConfig::loadDnsServers() {
    const std::string key = "nameserver ";
    TextFile file("/etc/resolv.conf");
    while (const auto line = file.nextLine()) {
        if (beginsWith(*line, key))
            addDns(line->substr(key.length()));
    }
}

std::string NetworkConfig::apply() const {
    if (!dhcp && !isAddressSet(address))
        return "Invalid IP Addr";
    if (!dhcp && !isAddressSet(netmask))
        return "Invalid Netmask";

    const std::string options = (dhcp ? " --dhcp" : staticOptions()) + dnsOptions();
    // This cannot happen, because each way above gives an option. The guard keeps a later change
    // from running the script without options.
    if (options.empty())
        return "Unknown";

    return configurePort(name, options) ? "" : "Check Logfile";
}

std::string NetworkConfig::staticOptions() const {
    std::string options = " --ipaddress " + address + " --netmask " + netmask;
    if (isAddressSet(gateway))
        options += " --gateway " + gateway;
    return options;
}

std::string NetworkConfig::dnsOptions() const {
    std::string options;
    for (const auto &server : dnsServers) {
        if (isAddressSet(server))
            options += " --dns " + server;
    }
    return options;
}

std::int32_t NetworkConfig::getDnsCount() const {
    return static_cast<std::int32_t>(dnsServers.size());
}

std::string NetworkConfig::getDns(std::uint32_t position) const {
    return position < dnsServers.size() ? dnsServers[position] : "";
}

void NetworkConfig::setDns(std::uint32_t position, const std::string &text) {
    if (position < dnsServers.size())
        dnsServers[position] = text;
}

void NetworkConfig::removeDns(std::uint32_t position) {
    if (position < dnsServers.size())
        dnsServers.erase(dnsServers.begin() + position);
}

void NetworkConfig::addDns(const std::string &text) {
    if (isAddressSet(text))
        dnsServers.push_back(text);
}

bool NetworkConfig::isAddressSet(const std::string &text) {
    return !text.empty() && text != "0.0.0.0";
}
