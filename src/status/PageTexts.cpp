#include "status/PageTexts.h"

#include "runtime/TextFile.h"
#include "runtime/beginsWith.h"
#include "runtime/runCommand.h"
#include "status/NetworkPorts.h"

#include <optional>

namespace {

// The rest of the first line that begins with `prefix`.
std::optional<std::string> lineAfter(TextFile &file, std::string_view prefix) {
    while (const auto line = file.nextLine()) {
        if (beginsWith(*line, prefix))
            return line->substr(prefix.length());
    }
    return std::nullopt;
}

std::string connectedServer() {
    TextFile status("/opt/kestrova/seq.site_conn");
    TextFile config("/opt/kestrova/config/nis.config");
    if (!lineAfter(status, "Connection OK"))
        return "";

    std::string server = lineAfter(config, "NIS Address: ").value_or("");
    const bool endsInCarriageReturn = !server.empty() && server.back() == '\r';
    if (endsInCarriageReturn)
        server.pop_back();
    return server;
}

bool isListed(const std::string &name) {
    const std::string command = "ifconfig | grep '" + name + "'";
    return !runCommand(command.c_str(), true).empty();
}

bool isConfiguredForDhcp(const std::string &name) {
    const std::string command = "cat /etc/network/interfaces 2>/dev/null |"
                                "         grep -v \"#\" | grep \"iface " +
                                name + " \" |         awk '{ print $4 }'";
    return beginsWith(runCommand(command.c_str(), true), "dhcp");
}

} // namespace

std::string productText(PlatformCode platform) {
    if (isHardware(platform))
        return "Kestrova (TM)\ncabinetDevice";
    if (platform == platformCloud)
        return "Kestrova Cloud\nAppliance";
    return "";
}

std::string hostnameText() {
    return "Hostname:\n" + runCommand("hostname", true);
}

std::string connectionText() {
    const std::string server = connectedServer();
    return "Connected to:\n" + (server.empty() ? "no server" : server);
}

std::string interfaceText(const std::string &name) {
    const std::string title = portLabel(name) + " (" + name + ")\n";
    const std::string address = interfaceAddress(name);
    if (!address.empty())
        return title + (isListed(name) ? address : "unused");
    return title + (isConfiguredForDhcp(name) ? "DHCP: no address" : "unused");
}
