#include "emulator/web/WebSession.h"

#include "emulator/web/WebServer.h"

#include <utility>

namespace emulator {

namespace {

namespace asio = boost::asio;
namespace beast = boost::beast;
namespace http = beast::http;
namespace websocket = beast::websocket;
using boost::system::error_code;

constexpr std::chrono::seconds requestTime{5}; // for the next request to be there as a whole
constexpr std::chrono::seconds answerTime{30}; // for its answer to be taken
constexpr std::chrono::seconds writeTime{5};   // for a state to be taken
constexpr std::chrono::seconds silence{6};     // of a browser that does not even answer a ping
constexpr std::size_t mostHeaderBytes = 8192;
constexpr std::size_t mostMessageBytes = 64;
constexpr std::size_t mostBytesPerSecond = 16'384;
constexpr int mostMessagesPerSecond = 100;
constexpr int mostRequestsPerSecond = 20; // opening the page takes four
constexpr int sendBufferBytes = 16'384;   // what is older than that in states is of no use

constexpr const char *contentPolicy =
    "default-src 'none'; img-src data:; script-src 'self'; style-src 'self'; connect-src 'self'; "
    "base-uri 'none'; form-action 'none'; frame-ancestors 'none'";

std::string_view view(beast::string_view text) {
    return {text.data(), text.size()};
}

} // namespace

WebSession::WebSession(Loop &itsLoop, WebServer &itsServer, WebService &itsService,
                       asio::ip::tcp::socket itsSocket, unsigned long number, bool itIsTooMany)
    : loop(itsLoop), server(itsServer), service(itsService), page{number, Use::watch},
      isTooMany(itIsTooMany), socket(std::move(itsSocket)), writeLimit(loop.asio()) {
    error_code ignored;
    Stream &stream = socket.next_layer();
    stream.socket().set_option(asio::ip::tcp::no_delay(true), ignored);
    stream.socket().set_option(asio::socket_base::send_buffer_size(sendBufferBytes), ignored);
    stream.rate_policy().read_limit(mostBytesPerSecond);
}

// What comes after an operation: the session ends if it failed.
template <typename Step> auto WebSession::then(Step step) {
    return loop.turnAfter([self = shared_from_this(), step](const error_code &error, auto &&...) {
        if (error)
            self->close();
        else if (!self->isClosed)
            (self.get()->*step)();
    });
}

void WebSession::start() {
    isAnswering = received.size() > 0; // what came with the last request
    parser.emplace();
    parser->header_limit(mostHeaderBytes);
    socket.next_layer().expires_after(requestTime);
    http::async_read(
        socket.next_layer(), received, *parser,
        loop.turnAfter([self = shared_from_this()](const error_code &error, std::size_t) {
            if (error == http::error::header_limit)
                self->refuse(http::status::request_header_fields_too_large,
                             "The browser has sent a header of more than " +
                                 std::to_string(mostHeaderBytes) +
                                 " bytes. Cookies of other servers at this address may be the "
                                 "cause: delete them, or open the page in a private window.");
            else if (error)
                self->close();
            else if (!self->isClosed)
                self->answerRequest();
        }));
}

void WebSession::refuse(http::status status, const std::string &sentence) {
    respond(status, {"text/plain; charset=utf-8", sentence + "\n"});
}

// Closed at once, the connection would be reset, and the answer lost with what has not been read.
void WebSession::passOverRest() {
    error_code ignored;
    socket.next_layer().socket().shutdown(asio::socket_base::shutdown_send, ignored);
    received.clear();
    socket.next_layer().async_read_some(received.prepare(mostHeaderBytes),
                                        then(&WebSession::passOverRest));
}

void WebSession::answerRequest() {
    isAnswering = true;
    if (isTooFast(mostRequestsPerSecond))
        return close();
    const auto &request = parser->get();
    const std::string_view host = view(request[http::field::host]);
    const auto origin = request.find(http::field::origin);
    const bool isUpgrade = websocket::is_upgrade(request);
    const bool isFromHere =
        origin == request.end() ? !isUpgrade : WebGate::isSameOrigin(view(origin->value()), host);
    if (!WebGate::isOwnHost(host) || !isFromHere)
        return respond(http::status::forbidden);
    const auto entry = server.webGate().entry(view(request.target()));
    if (!entry)
        return respond(http::status::not_found);
    page.use = entry->use;
    if (request.method() != http::verb::get)
        return respond(http::status::method_not_allowed);
    if (isTooMany)
        return refuse(http::status::service_unavailable, WebServer::tooManyRequests());
    answerFor(entry->name, isUpgrade);
}

void WebSession::answerFor(std::string_view name, bool isUpgrade) {
    // A WebSocket does not tell a page why it was refused, but what the page asks for just before
    // does. The document itself comes in any case: a page that is loaded anew may still count as
    // the open one that it was.
    const bool isForPage = name == "glass.json" || name == "panel";
    if (isForPage && !server.hasRoom())
        return refuse(http::status::service_unavailable, WebServer::tooManyPages());
    if (isUpgrade && name == "panel") {
        isOpening = true;
        socket.next_layer().expires_never(); // the WebSocket keeps its own time
        socket.set_option(websocket::stream_base::timeout{requestTime, silence, true});
        socket.read_message_max(mostMessageBytes);
        return socket.async_accept(parser->get(), then(&WebSession::openPage));
    }
    auto resource = service.resource(name);
    resource ? respond(http::status::ok, std::move(*resource)) : respond(http::status::not_found);
}

void WebSession::respond(http::status status, WebService::Resource resource) {
    response = {};
    response.result(status);
    response.keep_alive(status == http::status::ok && parser->keep_alive());
    response.set("Content-Security-Policy", contentPolicy);
    response.set(http::field::cache_control, "no-store");
    response.set("X-Content-Type-Options", "nosniff");
    response.set("Referrer-Policy", "no-referrer");
    response.set(http::field::x_frame_options, "DENY");
    if (!resource.type.empty())
        response.set(http::field::content_type,
                     beast::string_view(resource.type.data(), resource.type.size()));
    response.body() = std::move(resource.body);
    response.prepare_payload();
    socket.next_layer().expires_after(answerTime);
    http::async_write(socket.next_layer(), response, then(&WebSession::endResponse));
}

void WebSession::endResponse() {
    if (response.keep_alive())
        return start();
    parser->is_done() ? close() : passOverRest();
}

void WebSession::openPage() {
    hasOpened = true;
    socket.text(true);
    show(std::make_shared<const std::string>(service.welcome(page)));
    awaitMessage();
}

void WebSession::awaitMessage() {
    received.clear();
    socket.async_read(received, then(&WebSession::takeMessage));
}

void WebSession::takeMessage() {
    const auto bytes = received.cdata();
    const std::string_view message(static_cast<const char *>(bytes.data()), bytes.size());
    if (!isLeaving && (isTooFast(mostMessagesPerSecond) || !service.take(page, message)))
        return close();
    awaitMessage();
}

bool WebSession::isTooFast(int mostPerSecond) {
    const TimePoint now = Clock::now();
    if (now - countedSince >= std::chrono::seconds(1)) {
        countedSince = now;
        counted = 0;
    }
    return ++counted > mostPerSecond;
}

void WebSession::show(Text state) {
    if (!hasOpened || isLeaving || isClosed)
        return;
    next = std::move(state);
    if (!current)
        writeNext();
}

void WebSession::finish(Text state) {
    if (!hasOpened)
        return close();
    show(std::move(state));
    isLeaving = true;
}

void WebSession::writeNext() {
    if (!next) {
        if (isLeaving)
            socket.async_close(websocket::close_code::going_away, then(&WebSession::close));
        return;
    }
    current = std::move(next);
    writeLimit.expires_after(writeTime);
    writeLimit.async_wait(loop.turnAfter([self = shared_from_this()](const error_code &error) {
        if (!error)
            self->close();
    }));
    socket.async_write(asio::buffer(*current), then(&WebSession::endWriting));
}

void WebSession::endWriting() {
    current.reset();
    writeLimit.cancel();
    writeNext();
}

void WebSession::close() {
    if (std::exchange(isClosed, true))
        return;
    writeLimit.cancel();
    socket.next_layer().close();
    if (hasOpened)
        service.leave(page);
    server.forget(*this);
}

} // namespace emulator
