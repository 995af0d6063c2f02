#pragma once

#include "emulator/base/Loop.h"
#include "emulator/web/WebGate.h"
#include "emulator/web/WebService.h"

#include <boost/asio/ip/tcp.hpp>

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace emulator {

class WebSession;

/// Serves a page to browsers, and keeps the open ones up to date. It knows how many there may be.
class WebServer {
  public:
    /// Listens from now on. Throws std::runtime_error when it cannot.
    WebServer(Loop &loop, const boost::asio::ip::tcp::endpoint &endpoint, WebService &service);
    WebServer(const WebServer &) = delete;
    WebServer &operator=(const WebServer &) = delete;
    ~WebServer();

    /// Where the page can be opened on this machine, for this use of it.
    [[nodiscard]] std::string address(Use use) const;
    /// Where other machines can open it; empty if this machine cannot tell its own address, and
    /// nothing if none can.
    [[nodiscard]] std::optional<std::string> addressForOthers(Use use) const;

    [[nodiscard]] bool hasPages() const { return pages() > 0; }
    /// Shows this state on all open pages.
    void show(std::string state);
    /// Shows the last state, and lets nobody in any more.
    void finish(std::string state);
    /// True when all connections have ended.
    [[nodiscard]] bool isIdle() const { return sessions.empty(); }

    // For the connections.

    [[nodiscard]] const WebGate &webGate() const { return gate; }
    /// True when another page may be opened.
    [[nodiscard]] bool hasRoom() const;
    /// What is said to whoever would open a page too many, or asks for too much at once.
    [[nodiscard]] static std::string tooManyPages();
    [[nodiscard]] static std::string tooManyRequests();
    /// This connection has ended.
    void forget(const WebSession &session);

  private:
    void accept();
    void admit(boost::asio::ip::tcp::socket socket);
    [[nodiscard]] std::size_t pages() const;
    [[nodiscard]] std::string addressAt(boost::asio::ip::tcp::endpoint endpoint, Use use) const;

    Loop &loop;
    WebService &service;
    WebGate gate;
    boost::asio::ip::tcp::acceptor acceptor;
    boost::asio::steady_timer rest; // after a connection that could not be accepted
    std::vector<std::shared_ptr<WebSession>> sessions;
    unsigned long admitted = 0;
};

} // namespace emulator
