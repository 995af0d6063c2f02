#pragma once

#include "emulator/operators/Operator.h"

#include <optional>
#include <string>
#include <string_view>

namespace emulator {

/// What stands behind the pages that browsers open: answers what they ask for, and takes what is
/// done on them.
class WebService {
  public:
    /// A page that a browser has open.
    struct Page {
        unsigned long number; ///< of this page alone, for as long as the emulator runs
        Use use;              ///< what its address lets whoever opened it do
    };

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
    /// The same for a page that has just been opened, and what holds for this page alone.
    [[nodiscard]] virtual std::string welcome(const Page &page) const = 0;
    /// An open page says this. Returns false if the page could not have said it.
    virtual bool take(const Page &page, std::string_view message) = 0;
    /// An open page has gone away.
    virtual void leave(const Page &page) = 0;
};

} // namespace emulator
