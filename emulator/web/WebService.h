#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace emulator {

class WebSession;

/// What stands behind the pages that browsers open: answers what they ask for, and takes what is
/// done on them.
class WebService {
  public:
    struct Resource {
        std::string_view type; ///< as in the header Content-Type
        std::string body;
    };

    WebService() = default;
    WebService(const WebService &) = delete;
    WebService &operator=(const WebService &) = delete;
    virtual ~WebService() = default;

    /// What is served under this name, behind the token; nothing if there is no such thing.
    [[nodiscard]] virtual std::optional<Resource> resource(std::string_view name) const = 0;
    /// What an open page is to show, as JSON.
    [[nodiscard]] virtual std::string state() const = 0;
    /// An open page says this. Returns false if it makes no sense.
    virtual bool take(const WebSession &page, std::string_view message) = 0;
    /// An open page has gone away.
    virtual void leave(const WebSession &page) = 0;
};

} // namespace emulator
