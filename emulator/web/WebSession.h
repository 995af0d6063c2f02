#pragma once

#include "emulator/base/Loop.h"
#include "emulator/web/WebService.h"

#include <boost/asio/ip/tcp.hpp>
#include <boost/beast/core/basic_stream.hpp>
#include <boost/beast/core/flat_buffer.hpp>
#include <boost/beast/core/rate_policy.hpp>
#include <boost/beast/http.hpp>
#include <boost/beast/websocket.hpp>

#include <memory>
#include <optional>
#include <string>

namespace emulator {

class WebServer;

/// A connection from a browser: requests and their answers, until one of them asks for a WebSocket.
/// From then on it is an open page, which is shown states and sends messages until one of the two
/// ends it.
///
/// Of the states a page gets the newest whenever it has taken the one before; what comes meanwhile
/// is left out. Whatever breaks the rules, or takes too long, is closed without a word, but for a
/// header that is too long, or a browser too many, which may be no fault of the operator's.
class WebSession : public std::enable_shared_from_this<WebSession> {
  public:
    using Text = std::shared_ptr<const std::string>;

    /// The server, which is told when this is closed, and the service have to be there until then.
    /// One that is too many is only told so.
    WebSession(Loop &loop, WebServer &server, WebService &service,
               boost::asio::ip::tcp::socket socket, unsigned long number, bool isTooMany);

    /// Waits for a request.
    void start();
    /// True once it has begun to open a page.
    [[nodiscard]] bool isPage() const { return isOpening; }
    /// True while it has nothing to answer.
    [[nodiscard]] bool isWaiting() const { return !isOpening && !isAnswering; }
    /// Shows this once the page is open.
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
    void refuse(boost::beast::http::status status, const std::string &sentence);
    void passOverRest();
    void answerRequest();
    void answerFor(std::string_view name, bool isUpgrade);
    void respond(boost::beast::http::status status, WebService::Resource resource = {});
    void endResponse();
    void openPage();
    void awaitMessage();
    void takeMessage();
    [[nodiscard]] bool isTooFast(int mostPerSecond);
    void writeNext();
    void endWriting();

    Loop &loop;
    WebServer &server;
    WebService &service;
    WebService::Page page;
    bool isTooMany;
    boost::beast::websocket::stream<Stream, false> socket; // states are not compressed
    boost::asio::steady_timer writeLimit;
    boost::beast::flat_buffer received;
    std::optional<boost::beast::http::request_parser<boost::beast::http::empty_body>> parser;
    Response response;
    Text next;    // to be written
    Text current; // being written
    TimePoint countedSince;
    int counted = 0; // requests or messages since then
    bool isAnswering = false;
    bool isOpening = false;
    bool hasOpened = false;
    bool isLeaving = false;
    bool isClosed = false;
};

} // namespace emulator
