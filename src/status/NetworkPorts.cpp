#include "status/NetworkPorts.h"

#include "runtime/beginsWith.h"
#include "runtime/runCommand.h"
#include "runtime/splitString.h"

#include <array>
#include <string_view>

namespace {

// Names joined by commas. The filter works on whole lines of the listing, and a single "v" anywhere
// drops the line: virtual interfaces of every kind stay off the panel. The shell's `echo` has to
// turn backslash-n into a line feed.
//
// Those who trace the program's commands on an appliance recognise this one by its text, including
// the runs of blanks. Its length is asserted because nothing else would reveal a lost blank.
constexpr const char *listCommand =
    "echo \"`ifconfig -s |       sed 1d |       egrep -v 'lo|ani|docker|v|ipsec_|ssl_' |"
    "       awk '{ print $1 } '`\\neth4\\neth5\" |       sort -u | tr '\n' ','";
static_assert(std::string_view(listCommand).length() == 151);

constexpr std::string_view nameSeparator = ",";

struct PrefixLabel {
    std::string_view prefix;
    const char *label;
};
constexpr std::array<PrefixLabel, 8> labels = {{
    {"eth0", "E0"},
    {"eth1", "E1"},
    {"eth2", "E2"},
    {"eth3", "E3"},
    {"eth4", "E4"},
    {"eth5", "E5"},
    {"eth6", "E6"},
    {"eth7", "E7"},
}};

// These two are on the front of every appliance, whether the system knows them or not.
bool alwaysHasPage(const std::string &name) {
    return name == "eth4" || name == "eth5";
}

} // namespace

std::vector<std::string> listPortsWithPage() {
    const QLX::String<char> listing = runCommand(listCommand, true);
    std::vector<std::string> paged;
    for (const auto &name : splitString(listing, QLX::String<char>(nameSeparator))) {
        const bool hasAddress = !interfaceAddress(name).empty();
        if (hasAddress || alwaysHasPage(name))
            paged.push_back(name);
    }
    return paged;
}

std::string portLabel(const std::string &name) {
    if (name == "bridge0")
        return "E0/E1";
    if (name == "bridge1")
        return "E2/E3";
    for (const auto &[prefix, label] : labels) {
        if (beginsWith(name, prefix))
            return label;
    }
    return "";
}

std::string interfaceAddress(const std::string &name) {
    const std::string command =
        "ifconfig " + name + " | grep 'inet' | awk '{ print $2 }' | head -n1";
    return runCommand(command.c_str(), true);
}
