// The texts of the status pages: two lines, separated by a line feed, computed afresh at each call.
#pragma once

#include "status/PlatformCode.h"

#include <string>

/// The banner of the model; empty for an unknown one.
[[nodiscard]] std::string productText(PlatformCode platform);

[[nodiscard]] std::string hostnameText();

/// Which management server the appliance is connected to. A file that is missing, or says nothing
/// about it, means that there is no server.
[[nodiscard]] std::string connectionText();

/// A port's label and name, and its address or the reason why there is none.
[[nodiscard]] std::string interfaceText(const std::string &name);
