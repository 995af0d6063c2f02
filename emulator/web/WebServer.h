#pragma once

#include "emulator/base/Loop.h"
#include "emulator/web/WebGate.h"
#include "emulator/web/WebService.h"

#include <boost/asio/ip/tcp.hpp>

#include <memory>
#include <string>
#include <vector>

namespace emulator {

/// Serves a page to browsers, and keeps the open ones up to date.
class WebServer {
  public:
    /// Listens from now on. Throws std::runtime_error when it cannot.
    WebServer(Loop &loop, const boost::asio::ip::tcp::endpoint &endpoint, WebService &service);
    WebServer(const WebServer &) = delete;
    WebServer &operator=(const WebServer &) = delete;
    ~WebServer();

    /// Where the page can be opened on this machine.
    [[nodiscard]] std::string address() const;
    /// True when other machines may reach the page, too.
    [[nodiscard]] bool isOpenToOthers() const;

    [[nodiscard]] bool hasPages() const;
    /// Shows this state on all open pages.
    void show(std::string state);
    /// Shows the last state, and lets nobody in any more.
    void finish(std::string state);
    /// True when all connections have ended.
    [[nodiscard]] bool isIdle() const { return sessions.empty(); }

  private:
    void accept();
    void admit(boost::asio::ip::tcp::socket socket);
    void forget(const WebSession &session);

    Loop &loop;
    WebService &service;
    WebGate gate;
    boost::asio::ip::tcp::acceptor acceptor;
    boost::asio::steady_timer rest; // after a connection that could not be accepted
    std::vector<std::shared_ptr<WebSession>> sessions;
};

} // namespace emulator
