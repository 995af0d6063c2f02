#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace emulator {

/// Who may come in from the network: whoever knows the token that is made at each start, by an
/// address that no other site can stand for.
class WebGate {
  public:
    /// Throws std::runtime_error when the system has no random numbers.
    WebGate();

    /// 128 random bits as 32 hexadecimal digits.
    [[nodiscard]] const std::string &token() const { return secret; }

    /// What stands behind /TOKEN/ in a request's target; nothing if it does not begin so.
    [[nodiscard]] std::optional<std::string_view> nameBehindToken(std::string_view target) const;

    /// True for an address in figures and for localhost, with or without a port. Any other name
    /// can be made to lead here by its owner, whose page would then be of the same origin.
    [[nodiscard]] static bool isOwnHost(std::string_view host);
    /// True when a page that was loaded from this host says so itself.
    [[nodiscard]] static bool isSameOrigin(std::string_view origin, std::string_view host);

  private:
    std::string secret;
};

} // namespace emulator
