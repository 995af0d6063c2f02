#include "Appliance.h"

#include <gtest/gtest.h>

#include <arpa/inet.h>
#include <bitset>
#include <filesystem>
#include <fstream>
#include <iomanip>
#include <optional>
#include <set>
#include <sstream>
#include <stdexcept>

using namespace std::chrono_literals;

namespace {

const std::string interfacesFile = "/etc/network/interfaces", serversFile = "/etc/resolv.conf";

// What stands between `before` and `after` in a command line made of just these three.
std::optional<std::string> between(const std::string &command, const std::string &before,
                                   const std::string &after) {
    if (!startsWith(command, before) || command.length() < before.length() + after.length())
        return std::nullopt;
    std::string name =
        command.substr(before.length(), command.length() - before.length() - after.length());
    return before + name + after == command ? std::optional(name) : std::nullopt;
}

std::uint32_t number(const std::string &address) {
    in_addr binary{};
    if (inet_pton(AF_INET, address.c_str(), &binary) != 1)
        throw std::invalid_argument(address);
    return ntohl(binary.s_addr);
}

void refuseIf(bool isRefused) {
    if (isRefused)
        throw std::invalid_argument("refused");
}

std::uint32_t host(const std::string &address) {
    const std::uint32_t value = number(address);
    refuseIf(value == 0 || value >> 24U == 127 || value >> 28U == 14);
    return value;
}

Appliance::Words linesOf(const std::string &text) {
    Appliance::Words lines;
    std::istringstream input(text);
    for (std::string line; std::getline(input, line);)
        lines.push_back(line);
    return lines;
}

// As the script does: the port's stanza goes to the place of the old one, or to the end.
std::string withStanza(const std::string &text, const std::string &port,
                       const std::string &stanza) {
    std::string result;
    bool isPlaced = false, isOwn = false;
    for (const std::string &line : linesOf(text)) {
        if (startsWith(line, "iface ") || line.empty())
            isOwn = startsWith(line, "iface " + port + " ");
        if (isOwn && !std::exchange(isPlaced, true))
            result += stanza;
        if (!isOwn)
            result += line + "\n";
    }
    return isPlaced ? result : result + "\nauto " + port + "\n" + stanza;
}

std::string withServers(const std::string &text, const Appliance::Words &servers) {
    std::string result;
    for (const std::string &line : linesOf(text))
        result += startsWith(line, "nameserver") ? "" : line + "\n";
    for (const std::string &server : servers)
        result += "nameserver " + server + "\n";
    return result;
}

void expectFact(const std::string &what, const std::string &wanted, const std::string &found) {
    if (wanted != found)
        throw std::runtime_error(what + " is '" + found + "', not '" + wanted + "'");
}

std::string contents(const std::filesystem::path &path) {
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    return text.str();
}

} // namespace

bool startsWith(const std::string &text, const std::string &beginning) {
    return text.compare(0, beginning.length(), beginning) == 0;
}

Appliance::Words wordsOf(const std::string &text) {
    std::istringstream input(text);
    return {std::istream_iterator<std::string>(input), {}};
}

Appliance::Words scriptArguments(const std::string &command) {
    const std::size_t at = command.find(applyScript);
    if (at > 1) // behind a backquote
        return {};
    const std::string rest = command.substr(at + applyScript.length());
    return wordsOf(rest.substr(0, rest.find_first_of(";`")));
}

Appliance Appliance::delivered() {
    const std::filesystem::path folder = SOURCE "/box/appliance";
    Appliance appliance;
    for (const std::string part : {"etc", "opt"}) {
        for (const auto &entry : std::filesystem::recursive_directory_iterator(folder / part)) {
            if (entry.is_regular_file())
                appliance.files["/" + relative(entry.path(), folder).string()] =
                    contents(entry.path());
        }
    }
    for (const std::string &line : linesOf(contents(folder / "links"))) {
        const Words words = wordsOf(line);
        if (words.empty() || words[0][0] == '#')
            continue;
        appliance.ports[words[0]] = words[1];
        if (words.size() > 3)
            appliance.servers[words[0]] = words[3];
    }
    appliance.settings["hostname"] = wordsOf(appliance.files["/etc/hostname"])[0];
    return appliance;
}

void Appliance::act(const Words &words) {
    const std::string &verb = words[0];
    if (verb == "script") {
        settings["script"] = words[1] + (words.size() > 2 ? " " + words[2] : "");
    } else if (verb == "port") {
        ports[words[1]] = words[2];
        if (words[2] == "gone")
            ports.erase(words[1]);
    } else if (verb == "hostname") {
        settings["hostname"] = words[1];
        files["/etc/hostname"] = words[1] + "\n";
    } else if (verb == "file") {
        files[words[1]] = words[2];
    } else if (verb == "remove") {
        files.erase(words[1]);
    } else if (words[1] == "port") {
        const auto port = ports.find(words[2]);
        expectFact("port " + words[2], words[3], port == ports.end() ? "gone" : port->second);
    } else if (words[1] == "gateway") {
        expectFact("the default route", words[2] + " " + words[3], settings["gateway"]);
    } else if (words[1] == "hostname") {
        expectFact("the host name", words[2], settings["hostname"]);
        expectFact("/etc/hostname", words[2] + "\n", files["/etc/hostname"]);
    } else {
        if (("\n" + files[words[2]] + "\n").find("\n" + words[3] + "\n") == std::string::npos)
            throw std::runtime_error(words[2] + " holds other lines:\n" + files[words[2]]);
    }
}

std::string Appliance::address(const std::string &port) const {
    const auto found = ports.find(port);
    return found == ports.end() || found->second == "-"
               ? ""
               : found->second.substr(0, found->second.find('/')) + "\n";
}

std::string Appliance::method(const std::string &port) const {
    std::string found;
    const auto file = files.find(interfacesFile);
    for (const std::string &line : linesOf(file == files.end() ? "" : file->second)) {
        const Words words = wordsOf(line);
        if (line.find('#') == std::string::npos &&
            line.find("iface " + port + " ") != std::string::npos)
            found += (words.size() > 3 ? words[3] : "") + "\n";
    }
    return found;
}

std::string Appliance::output(const std::string &command) const {
    if (const auto given = prints.find(command); given != prints.end())
        return given->second;
    if (command == "hostname")
        return settings.at("hostname") + "\n";
    if (command ==
        "echo \"`ifconfig -s |       sed 1d |       egrep -v 'lo|ani|docker|v|ipsec_|ssl_' |"
        "       awk '{ print $1 } '`\\neth4\\neth5\" |       sort -u | tr '\n' ','") {
        std::set<std::string> names = {"eth4", "eth5"};
        for (const auto &[name, address] : ports) {
            if (name.find('v') == std::string::npos)
                names.insert(name);
        }
        std::string joined;
        for (const std::string &name : names)
            joined += name + ",";
        return joined;
    }
    if (const auto port =
            between(command, "ifconfig ", " | grep 'inet' | awk '{ print $2 }' | head -n1"))
        return address(*port);
    if (const auto port = between(command, "ifconfig | grep '", "'")) {
        std::string found;
        for (const auto &[name, address] : ports)
            found += name.find(*port) == std::string::npos ? "" : name + ": flags=4163<UP>\n";
        return found;
    }
    if (const auto port =
            between(command,
                    "cat /etc/network/interfaces 2>/dev/null |         grep -v \"#\" | "
                    "grep \"iface ",
                    " \" |         awk '{ print $4 }'"))
        return method(*port);
    ADD_FAILURE() << "a command that no appliance knows: " << command;
    return "";
}

std::chrono::milliseconds Appliance::scriptTime(const Words &arguments) const {
    constexpr auto settingTakes = 300ms, leaseTakes = 2000ms, askingInVainTakes = 6000ms;
    const Words mode = wordsOf(settings.at("script"));
    const std::chrono::seconds hang(mode[0] == "hangs" ? std::stoi(mode[1]) : 0);
    if (mode[0] == "fails" || arguments.size() < 4 || arguments[3] != "--dhcp")
        return hang + settingTakes;
    return hang + (servers.count(arguments[2]) ? leaseTakes : askingInVainTakes);
}

int Appliance::runScript(const Words &arguments) try {
    constexpr int failed = 1;
    if (settings["script"] == "fails")
        return failed;
    if (arguments[0] == "iface")
        return configurePort(arguments);
    act({"hostname", arguments.at(2)});
    return 0;
} catch (const std::logic_error &) { // what makes no sense
    return 2;
}

int Appliance::configurePort(const Words &arguments) {
    const std::string &port = arguments.at(2);
    std::map<std::string, Words> given;
    std::string option;
    for (const std::string &word : Words(arguments.begin() + 3, arguments.end())) {
        if (startsWith(word, "--"))
            given[option = word];
        else
            given[option].push_back(word);
    }
    refuseIf(!startsWith(port, "eth") || ports.count(port) == 0);
    Words names = given["--dns"];
    for (const std::string &server : names)
        host(server);
    const std::string head = "iface " + port + " inet ";
    if (given.count("--dhcp")) {
        if (servers.count(port) == 0)
            return 1;
        const std::string server = servers[port].substr(0, servers[port].find('/'));
        const std::string lease = server.substr(0, server.rfind('.')) + ".100";
        setPort(port, lease + servers[port].substr(server.length()), head + "dhcp\n");
        settings["gateway"] = server + " " + port;
        if (names.empty())
            names = {server};
    } else {
        const std::string &address = given["--ipaddress"].at(0), &mask = given["--netmask"].at(0);
        const std::uint32_t own = host(address), network = number(mask), rest = ~network;
        refuseIf(network == 0 || (rest & (rest + 1)) != 0);
        refuseIf(rest > 1 && ((own & rest) == 0 || (own & rest) == rest));
        std::string stanza =
            head + "static\n    address " + address + "\n    netmask " + mask + "\n";
        Words gateway = given["--gateway"];
        for (const std::string &each : gateway) {
            refuseIf(((host(each) ^ own) & network) != 0 || host(each) == own);
            stanza += "    gateway " + each + "\n";
        }
        const auto prefix = std::bitset<32>(network).count();
        setPort(port, address + "/" + std::to_string(prefix), stanza);
        if (!gateway.empty())
            settings["gateway"] = gateway[0] + " " + port;
    }
    files[serversFile] = withServers(files[serversFile], names);
    return 0;
}

void Appliance::setPort(const std::string &port, const std::string &address,
                        const std::string &stanza) {
    ports[port] = address;
    if (between(settings["gateway"], "", " " + port))
        settings["gateway"] = ""; // the route goes with the address that it came through
    files[interfacesFile] = withStanza(files[interfacesFile], port, stanza);
}

std::ostream &operator<<(std::ostream &out, const Appliance &appliance) {
    for (const auto part : Appliance::parts) {
        out << (appliance.*part).size() << '\n';
        for (const auto &[name, value] : appliance.*part)
            out << std::quoted(name) << std::quoted(value) << '\n';
    }
    return out;
}

std::istream &operator>>(std::istream &in, Appliance &appliance) {
    for (const auto part : Appliance::parts) {
        (appliance.*part).clear();
        std::size_t count{};
        std::string name;
        for (in >> count; count > 0 && in >> std::quoted(name); count--)
            in >> std::quoted((appliance.*part)[name]);
    }
    return in;
}
