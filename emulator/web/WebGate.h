#pragma once

#include "emulator/operators/Operator.h"

#include <optional>
#include <string>
#include <string_view>

namespace emulator {

/// Who may come in from the network: whoever knows one of the two tokens that are made at each
/// start, by an address that no other site can stand for. One token leads to the keys, and the
/// other only to the display.
class WebGate {
  public:
    /// Throws std::runtime_error when the system has no random numbers.
    WebGate();

    /// 128 random bits as 32 hexadecimal digits.
    [[nodiscard]] const std::string &token(Use use) const {
        return use == Use::operate ? operatorsToken : watchersToken;
    }

    struct Entry {
        Use use;               ///< that the token stands for
        std::string_view name; ///< what stands behind it
    };
    /// What a request's target, /TOKEN/NAME, asks for; nothing if it does not begin with a token.
    [[nodiscard]] std::optional<Entry> entry(std::string_view target) const;

    /// True for an address in figures and for localhost, with or without a port. Any other name
    /// can be made to lead here by its owner, whose page would then be of the same origin.
    [[nodiscard]] static bool isOwnHost(std::string_view host);
    /// True when a page that was loaded from this host says so itself. Something else may encrypt
    /// what passes between it and the browser.
    [[nodiscard]] static bool isSameOrigin(std::string_view origin, std::string_view host);

  private:
    std::string operatorsToken;
    std::string watchersToken;
};

} // namespace emulator
