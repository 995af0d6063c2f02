#pragma once

#include "emulator/base/Loop.h"
#include "emulator/web/WebGate.h"
#include "emulator/web/WebService.h"

#include <boost/asio/ip/tcp.hpp>
#include <boost/beast/core/basic_stream.hpp>
#include <boost/beast/core/flat_buffer.hpp>
#include <boost/beast/core/rate_policy.hpp>
#include <boost/beast/http.hpp>
#include <boost/beast/websocket.hpp>

#include <functional>
#include <memory>
#include <string>

namespace emulator {

/// A connection from a browser: one request and its answer, or, when that asks for a WebSocket, an
/// open page, which is shown states and sends messages until one of the two ends it.
///
/// Of the states a page gets the newest whenever it has taken the one before; what comes meanwhile
/// is left out. Whatever breaks the rules, or takes too long, is closed without a word, but for a
/// header that is too long, which may be no fault of the operator's.
class WebSession : public std::enable_shared_from_this<WebSession> {
  public:
    using Text = std::shared_ptr<const std::string>;

    /// All three have to be there until this is closed; `onClosed` is called once then.
    WebSession(Loop &loop, const WebGate &gate, WebService &service,
               boost::asio::ip::tcp::socket socket,
               std::function<void(const WebSession &)> onClosed);

    /// Waits for the request.
    void start();
    /// True from the WebSocket's handshake on.
    [[nodiscard]] bool isPage() const { return hasOpened; }
    void show(Text state);
    /// Shows this as the last, takes nothing any more, and ends the connection.
    void finish(Text state);
    void close();

  private:
    // It lets no more in than a person at a page could send, whatever the bytes are.
    using Stream = boost::beast::basic_stream<boost::asio::ip::tcp, boost::asio::any_io_executor,
                                              boost::beast::simple_rate_policy>;
    using Response = boost::beast::http::response<boost::beast::http::string_body>;

    template <typename Step> auto then(Step step);
    void refuseHeader();
    void passOverRest();
    void answerRequest();
    void respond(boost::beast::http::status status, WebService::Resource resource = {});
    void openPage();
    void awaitMessage();
    void takeMessage();
    [[nodiscard]] bool isTooFast();
    void writeNext();
    void endWriting();

    Loop &loop;
    const WebGate &gate;
    WebService &service;
    std::function<void(const WebSession &)> onClosed;
    boost::beast::websocket::stream<Stream, false> socket; // states are not compressed
    boost::asio::steady_timer writeLimit;
    boost::beast::flat_buffer received;
    boost::beast::http::request_parser<boost::beast::http::empty_body> parser;
    Response response;
    Text next;    // to be written
    Text current; // being written
    TimePoint countedSince;
    int messages = 0; // since then
    bool hasOpened = false;
    bool isLeaving = false;
    bool isClosed = false;
};

} // namespace emulator
