#pragma once

#include <boost/asio/ip/address.hpp>

namespace emulator {

/// The IPv4 address that an IPv6 address of the form ::ffff:192.0.2.1 stands for; any other address
/// as it is.
inline boost::asio::ip::address plainAddress(const boost::asio::ip::address &address) {
    namespace ip = boost::asio::ip;
    const bool isMapped = address.is_v6() && address.to_v6().is_v4_mapped();
    return isMapped ? ip::make_address_v4(ip::v4_mapped, address.to_v6()) : address;
}

} // namespace emulator
