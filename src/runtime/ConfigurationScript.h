// The appliance's configuration script, through which every change is made: both of its command
// lines. All values are inserted as they stand; nothing is quoted.
#pragma once

#include <string>

/// Changes the settings of the port called `name` and waits until the script has ended. True when
/// the script reported success. The options are built by `NetworkConfig`, each behind a blank.
[[nodiscard]] bool configurePort(const std::string &name, const std::string &options);

/// Starts the change of the host name, which ends with a reboot of the appliance: there is nothing
/// to wait for, and the outcome is unknown.
void configureHostname(const std::string &hostname);
