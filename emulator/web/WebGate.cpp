#include "emulator/web/WebGate.h"

#include "emulator/base/Number.h"

#include <boost/asio/ip/address.hpp>

#include <algorithm>
#include <array>
#include <stdexcept>
#include <sys/random.h>

namespace emulator {

namespace {

constexpr std::size_t tokenBytes = 16;

std::string newToken() {
    std::array<unsigned char, tokenBytes> bytes{};
    if (getrandom(bytes.data(), bytes.size(), 0) != static_cast<ssize_t>(bytes.size()))
        throw std::runtime_error("the system has no random numbers");
    std::string token;
    for (const unsigned char byte : bytes)
        token += hexadecimal(byte);
    return token;
}

// Takes as long for any two texts of this length: how much of a guess is right must not be seen.
bool isEqual(std::string_view one, std::string_view other) {
    if (one.size() != other.size())
        return false;
    unsigned difference = 0;
    for (std::size_t k = 0; k < one.size(); k++)
        difference |= static_cast<unsigned char>(one[k]) ^ static_cast<unsigned char>(other[k]);
    return difference == 0;
}

bool isPort(std::string_view text) {
    return text.empty() || (text.size() > 1 && text.front() == ':' &&
                            text.find_first_not_of("0123456789", 1) == std::string_view::npos);
}

} // namespace

WebGate::WebGate() : operatorsToken(newToken()), watchersToken(newToken()) {}

std::optional<WebGate::Entry> WebGate::entry(std::string_view target) const {
    for (const Use use : {Use::operate, Use::watch}) {
        const std::string start = "/" + token(use) + "/";
        if (isEqual(target.substr(0, start.size()), start))
            return Entry{use, target.substr(start.size())};
    }
    return std::nullopt;
}

bool WebGate::isOwnHost(std::string_view host) {
    const bool isBracketed = !host.empty() && host.front() == '[';
    const std::size_t end = std::min(isBracketed ? host.find(']') : host.find(':'), host.size());
    const std::string name(host.substr(isBracketed ? 1 : 0, isBracketed ? end - 1 : end));
    if (isBracketed && end == host.size())
        return false;
    if (!isPort(host.substr(isBracketed ? end + 1 : end)))
        return false;
    boost::system::error_code error;
    const auto address = boost::asio::ip::make_address(name, error);
    return name == "localhost" || (!error && address.is_v6() == isBracketed);
}

bool WebGate::isSameOrigin(std::string_view origin, std::string_view host) {
    return origin == "http://" + std::string(host) || origin == "https://" + std::string(host);
}

} // namespace emulator
