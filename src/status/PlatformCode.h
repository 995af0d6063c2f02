#pragma once

#include <cstdint>

/// The appliance's model: 0 to 2 hardware, 3 cloud, 4 unknown.
using PlatformCode = std::uint32_t;

constexpr PlatformCode platformQ70 = 0;
constexpr PlatformCode platformQ75 = 1;
constexpr PlatformCode platformQ700 = 2;
constexpr PlatformCode platformCloud = 3;
constexpr PlatformCode platformUnknown = 4;

/// The model named at the start of the first line of `/etc/ma-platform`; unknown when the file
/// cannot be read or names none.
[[nodiscard]] PlatformCode detectPlatform();

/// Only hardware models have a banner with the device's name and connect to a management server.
[[nodiscard]] constexpr bool isHardware(PlatformCode platform) {
    return platform < platformCloud;
}
