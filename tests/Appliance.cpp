#include "Appliance.h"

#include <gtest/gtest.h>

#include <arpa/inet.h>
#include <bitset>
#include <fstream>
#include <functional>
#include <sstream>
#include <stdexcept>

using namespace std::chrono_literals;

namespace {

// Returns the part of a command line between `before` and `after`, of which it must consist
// otherwise.
std::optional<std::string> between(const std::string &command, const std::string &before,
                                   const std::string &after) {
    const std::size_t fixed = before.length() + after.length();
    if (command.length() < fixed)
        return std::nullopt;
    std::string name = command.substr(before.length(), command.length() - fixed);
    return before + name + after == command ? std::optional(name) : std::nullopt;
}

Appliance::Words wordsOf(const std::string &text) {
    std::istringstream input(text);
    return {std::istream_iterator<std::string>(input), {}};
}

Appliance::Words linesOf(const std::string &text) {
    Appliance::Words lines;
    std::istringstream input(text);
    for (std::string line; std::getline(input, line);)
        lines.push_back(line);
    return lines;
}

// The fact that a verb changes or checks, and the value that the verb gives.
std::pair<std::string, std::string> factAndValue(const Appliance::Words &words) {
    const std::set<std::string> oneOfMany = {"port", "file", "server", "prints"};
    std::string name = words[0], value;
    std::size_t next = 1;
    if (oneOfMany.count(name))
        name += " " + words[next++];
    for (; next < words.size(); next++)
        value += (value.empty() ? "" : " ") + words[next];
    return {name, value};
}

// Returns the text without some of its lines, which are asked about in order.
std::string without(const std::string &text,
                    const std::function<bool(const std::string &)> &isDropped) {
    std::string rest;
    for (const std::string &line : linesOf(text))
        rest += isDropped(line) ? "" : line + "\n";
    return rest;
}

bool isAddress(const std::string &text) {
    in_addr address{};
    return inet_pton(AF_INET, text.c_str(), &address) == 1;
}

} // namespace

std::string contents(const std::filesystem::path &path) {
    std::ostringstream text;
    text << std::ifstream(path, std::ios::binary).rdbuf();
    return text.str();
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
    appliance.act({"script", "works"});
    for (const auto &entry : std::filesystem::recursive_directory_iterator(folder)) {
        if (entry.is_regular_file())
            appliance.act(
                {"file", "/" + relative(entry.path(), folder).string(), contents(entry.path())});
    }
    for (const std::string &line : linesOf(contents(folder / "links"))) {
        const Words words = wordsOf(line);
        if (words.empty() || words[0][0] == '#')
            continue;
        appliance.act({"port", words[0], words[1]});
        if (words.size() > 3)
            appliance.act({"server", words[0], words[3]});
    }
    appliance.act({"hostname", wordsOf(contents(folder / "etc/hostname"))[0]});
    return appliance;
}

void Appliance::act(const Words &words) {
    const auto [name, value] = factAndValue(words);
    if (name == "has") {
        lookUp(Words(words.begin() + 1, words.end()));
    } else if (name == "remove") {
        facts.erase("file " + value);
    } else if (words[0] == "port" && value == "gone") {
        facts.erase(name);
    } else {
        facts[name] = value;
        if (name == "hostname")
            facts["file /etc/hostname"] = value + "\n";
    }
}

void Appliance::lookUp(const Words &words) const {
    const auto [name, wanted] = factAndValue(words);
    const std::string found = fact(name).value_or("gone");
    if (("\n" + found + "\n").find("\n" + wanted + "\n") == std::string::npos)
        throw std::runtime_error(name + " is '" + found + "', not '" + wanted + "'");
    if (name == "hostname")
        lookUp({"file", "/etc/hostname", wanted});
}

std::optional<std::string> Appliance::fact(const std::string &name) const {
    const auto found = facts.find(name);
    return found == facts.end() ? std::nullopt : std::optional(found->second);
}

std::set<std::string> Appliance::ports() const {
    std::set<std::string> names;
    for (const auto &[name, value] : facts) {
        if (boost::starts_with(name, "port "))
            names.insert(name.substr(name.find(' ') + 1));
    }
    return names;
}

std::string Appliance::address(const std::string &port) const {
    const std::string found = fact("port " + port).value_or("-");
    return found == "-" ? "" : found.substr(0, found.find('/')) + "\n";
}

std::string Appliance::method(const std::string &port) const {
    std::string found;
    for (const std::string &line : linesOf(fact("file /etc/network/interfaces").value_or(""))) {
        const Words words = wordsOf(line);
        if (line.find('#') == std::string::npos &&
            line.find("iface " + port + " ") != std::string::npos)
            found += (words.size() > 3 ? words[3] : "") + "\n";
    }
    return found;
}

std::string Appliance::output(const std::string &command) const {
    if (const auto given = fact("prints " + command))
        return *given;
    if (command == "hostname")
        return fact("hostname").value() + "\n";
    if (command ==
        "echo \"`ifconfig -s |       sed 1d |       egrep -v 'lo|ani|docker|v|ipsec_|ssl_' |"
        "       awk '{ print $1 } '`\\neth4\\neth5\" |       sort -u | tr '\n' ','") {
        std::set<std::string> names = ports();
        names.insert({"eth4", "eth5"});
        std::string joined;
        for (const std::string &name : names)
            joined += name.find('v') == std::string::npos ? name + "," : "";
        return joined;
    }
    if (const auto port =
            between(command, "ifconfig ", " | grep 'inet' | awk '{ print $2 }' | head -n1"))
        return address(*port);
    if (const auto port = between(command, "ifconfig | grep '", "'")) {
        std::string found;
        for (const std::string &name : ports())
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

std::chrono::milliseconds Appliance::scriptTime() const {
    const Words mode = wordsOf(fact("script").value());
    return mode[0] == "hangs" ? std::chrono::seconds(std::stoi(mode[1])) : 300ms;
}

int Appliance::runScript(const Words &arguments) {
    if (fact("script") == "fails")
        return EXIT_FAILURE;
    if (arguments[0] == "iface")
        return configurePort(arguments);
    act({"hostname", arguments.at(2)});
    return EXIT_SUCCESS;
}

// The real script checks more of what it is given.
int Appliance::configurePort(const Words &arguments) {
    const std::string &port = arguments.at(2);
    const std::set<std::string> options{"--dhcp", "--ipaddress", "--netmask", "--gateway", "--dns"};
    std::map<std::string, Words> given;
    std::string option;
    for (const std::string &word : Words(arguments.begin() + 3, arguments.end())) {
        if (boost::starts_with(word, "--"))
            given[option = word];
        else
            given[option].push_back(word);
    }
    for (const auto &[name, values] : given) {
        if (!options.count(name))
            return EXIT_FAILURE;
    }
    const auto dhcpServer = fact("server " + port);
    if (!fact("port " + port) || (given.count("--dhcp") && !dhcpServer))
        return EXIT_FAILURE;
    std::string stanza = "dhcp\n";
    if (given.count("--dhcp")) {
        const std::size_t lastOctet = dhcpServer->rfind('.') + 1;
        act({"port", port,
             dhcpServer->substr(0, lastOctet) + "100" + dhcpServer->substr(dhcpServer->find('/'))});
    } else {
        const std::string &address = given["--ipaddress"].at(0), &mask = given["--netmask"].at(0);
        if (!isAddress(address) || !isAddress(mask))
            return EXIT_FAILURE;
        const auto prefix = std::bitset<32>(inet_addr(mask.c_str())).count();
        act({"port", port, address + "/" + std::to_string(prefix)});
        stanza = "static\n    address " + address + "\n    netmask " + mask + "\n";
        for (const std::string &gateway : given["--gateway"]) {
            act({"gateway", gateway, port});
            stanza += "    gateway " + gateway + "\n";
        }
    }
    const std::string head = "iface " + port + " inet ";
    std::string &interfaces = facts["file /etc/network/interfaces"];
    interfaces = without(interfaces, [&, isOld = false](const std::string &line) mutable {
        if (boost::starts_with(line, "iface ") || line.empty())
            isOld = boost::starts_with(line, head);
        return isOld;
    });
    interfaces += "\n" + head + stanza;
    std::string &servers = facts["file /etc/resolv.conf"];
    servers = without(servers, [](auto &line) { return boost::starts_with(line, "nameserver"); });
    for (const std::string &server : given["--dns"])
        servers += "nameserver " + server + "\n";
    return EXIT_SUCCESS;
}
