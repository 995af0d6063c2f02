#pragma once

#include <string>
#include <vector>

/// The names of the network ports that get a status page, in the order of their pages: those that
/// have an address, and "eth4" and "eth5" always.
[[nodiscard]] std::vector<std::string> listPortsWithPage();

/// What is printed beside a port on the front of the appliance, "" for a port without a label.
/// Ports are told apart by their first four characters, so "eth0.100" has the label of "eth0".
[[nodiscard]] std::string portLabel(const std::string &name);

/// The first address of a port as `ifconfig` prints it, line feed included; "" when it has
/// none, "ERROR" when no shell could be started.
[[nodiscard]] std::string interfaceAddress(const std::string &name);
