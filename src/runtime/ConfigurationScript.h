// The two ways in which the appliance's configuration script, which makes every change, is called.
// All values are inserted as they stand; nothing is quoted.
#pragma once

#include <string>

/// Changes the settings of the port called `name` and waits until the script has ended. True when
/// the script reported success. `NetworkConfig` builds the options; a blank stands before each.
[[nodiscard]] bool configurePort(const std::string &name, const std::string &options);

/// Starts the change of the host name, which ends with a reboot of the appliance: there is nothing
/// to wait for, and the outcome is unknown.
void configureHostname(const std::string &hostname);
