#include "emulator/web/WebServer.h"

#include "emulator/base/plainAddress.h"
#include "emulator/web/WebSession.h"

#include <algorithm>
#include <sstream>
#include <stdexcept>

namespace emulator {

namespace {

using boost::asio::ip::tcp;
using boost::system::error_code;

constexpr std::size_t mostSessions = 32;
constexpr std::chrono::milliseconds restTime{100};

tcp::acceptor listening(Loop &loop, const tcp::endpoint &endpoint) {
    try {
        return {loop.asio(), endpoint};
    } catch (const boost::system::system_error &error) {
        std::ostringstream where;
        where << endpoint;
        throw std::runtime_error("cannot listen on " + where.str() + ": " + error.code().message());
    }
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

std::string WebServer::address() const {
    tcp::endpoint endpoint = acceptor.local_endpoint();
    if (endpoint.address().is_unspecified())
        endpoint.address(boost::asio::ip::address_v4::loopback());
    std::ostringstream address;
    address << "http://" << endpoint << "/" << gate.token() << "/";
    return address.str();
}

bool WebServer::isOpenToOthers() const {
    return !plainAddress(acceptor.local_endpoint().address()).is_loopback();
}

bool WebServer::hasPages() const {
    return std::any_of(sessions.begin(), sessions.end(),
                       [](const auto &session) { return session->isPage(); });
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

// Those who have not shown the token must not keep others out.
void WebServer::admit(tcp::socket socket) {
    if (sessions.size() >= mostSessions) {
        const auto oldest = std::find_if(sessions.begin(), sessions.end(),
                                         [](const auto &session) { return !session->isPage(); });
        if (oldest == sessions.end())
            return;
        std::shared_ptr<WebSession>(*oldest)->close();
    }
    sessions.push_back(
        std::make_shared<WebSession>(loop, gate, service, std::move(socket),
                                     [this](const WebSession &session) { forget(session); }));
    sessions.back()->start();
}

void WebServer::forget(const WebSession &session) {
    sessions.erase(std::find_if(sessions.begin(), sessions.end(),
                                [&](const auto &each) { return each.get() == &session; }));
}

} // namespace emulator
