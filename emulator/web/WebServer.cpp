#include "emulator/web/WebServer.h"

#include "emulator/base/plainAddress.h"
#include "emulator/web/WebSession.h"

#include <boost/asio/ip/udp.hpp>

#include <algorithm>
#include <fcntl.h>
#include <sstream>
#include <stdexcept>

namespace emulator {

namespace {

using boost::asio::ip::tcp;
using boost::system::error_code;

constexpr std::size_t mostPages = 64;
constexpr std::size_t mostRequests = 64; // connections that are no pages
constexpr std::size_t mostRefused = 16;  // connections beyond that, which are only told so
constexpr std::chrono::milliseconds restTime{100};

// What the command starts must not hold a browser's connection.
template <typename Socket> void closeInCommand(Socket &socket) {
    fcntl(socket.native_handle(), F_SETFD, FD_CLOEXEC);
}

tcp::acceptor listening(Loop &loop, const tcp::endpoint &endpoint) {
    try {
        tcp::acceptor acceptor(loop.asio(), endpoint);
        closeInCommand(acceptor);
        return acceptor;
    } catch (const boost::system::system_error &error) {
        std::ostringstream where;
        where << endpoint;
        throw std::runtime_error("cannot listen on " + where.str() + ": " + error.code().message());
    }
}

// Where it listens, by the plain address.
tcp::endpoint place(const tcp::acceptor &acceptor) {
    const tcp::endpoint endpoint = acceptor.local_endpoint();
    return {plainAddress(endpoint.address()), endpoint.port()};
}

// The address of this machine from which it would send to far ones. Nothing is sent.
boost::asio::ip::address ownAddress(Loop &loop) {
    using boost::asio::ip::udp;
    constexpr const char *anyFarAddress = "192.0.2.1";
    udp::socket socket(loop.asio());
    error_code error;
    socket.connect({boost::asio::ip::make_address(anyFarAddress), 9}, error);
    const auto own = socket.local_endpoint(error);
    return error ? boost::asio::ip::address() : own.address();
}

} // namespace

WebServer::WebServer(Loop &itsLoop, const tcp::endpoint &endpoint, WebService &itsService)
    : loop(itsLoop), service(itsService), acceptor(listening(loop, endpoint)), rest(loop.asio()) {
    accept();
}

WebServer::~WebServer() {
    const auto all = sessions;
    for (const auto &session : all)
        session->close();
}

std::string WebServer::address(Use use) const {
    tcp::endpoint endpoint = place(acceptor);
    if (endpoint.address().is_unspecified())
        endpoint.address(boost::asio::ip::address_v4::loopback());
    return addressAt(endpoint, use);
}

std::optional<std::string> WebServer::addressForOthers(Use use) const {
    tcp::endpoint endpoint = place(acceptor);
    if (endpoint.address().is_loopback())
        return std::nullopt;
    if (endpoint.address().is_unspecified())
        endpoint.address(ownAddress(loop));
    if (endpoint.address().is_unspecified())
        return "";
    return addressAt(endpoint, use);
}

std::string WebServer::addressAt(tcp::endpoint endpoint, Use use) const {
    std::ostringstream address;
    address << "http://" << endpoint << "/" << gate.token(use) << "/";
    return address.str();
}

bool WebServer::hasRoom() const {
    return pages() < mostPages;
}

std::string WebServer::tooManyPages() {
    return std::to_string(mostPages) +
           " browsers have the panel open, which is the most there can be. Close one of them, and "
           "reload this page.";
}

std::string WebServer::tooManyRequests() {
    return "More than " + std::to_string(mostRequests) +
           " requests are being answered. Reload this page in a few seconds.";
}

std::size_t WebServer::pages() const {
    return static_cast<std::size_t>(std::count_if(
        sessions.begin(), sessions.end(), [](const auto &session) { return session->isPage(); }));
}

void WebServer::show(std::string state) {
    const auto shared = std::make_shared<const std::string>(std::move(state));
    for (const auto &session : sessions) {
        if (session->isPage())
            session->show(shared);
    }
}

void WebServer::finish(std::string state) {
    error_code ignored;
    acceptor.close(ignored);
    rest.cancel();
    const auto shared = std::make_shared<const std::string>(std::move(state));
    const auto all = sessions;
    for (const auto &session : all)
        session->finish(shared);
}

void WebServer::accept() {
    acceptor.async_accept(loop.turnAfter([this](const error_code &error, tcp::socket socket) {
        if (!acceptor.is_open())
            return;
        if (!error) {
            admit(std::move(socket));
            return accept();
        }
        rest.expires_after(restTime);
        rest.async_wait(loop.turnAfter([this](const error_code &cancelled) {
            if (!cancelled)
                accept();
        }));
    }));
}

// Those who have no token must not keep others out, and neither must a connection that is only kept
// for a request to come.
void WebServer::admit(tcp::socket socket) {
    closeInCommand(socket);
    if (sessions.size() - pages() >= mostRequests) {
        const auto oldest = std::find_if(sessions.begin(), sessions.end(),
                                         [](const auto &session) { return session->isWaiting(); });
        if (oldest != sessions.end())
            std::shared_ptr<WebSession>(*oldest)->close();
    }
    const std::size_t requests = sessions.size() - pages();
    if (requests >= mostRequests + mostRefused)
        return;
    sessions.push_back(std::make_shared<WebSession>(loop, *this, service, std::move(socket),
                                                    ++admitted, requests >= mostRequests));
    sessions.back()->start();
}

void WebServer::forget(const WebSession &session) {
    sessions.erase(std::find_if(sessions.begin(), sessions.end(),
                                [&](const auto &each) { return each.get() == &session; }));
}

} // namespace emulator
