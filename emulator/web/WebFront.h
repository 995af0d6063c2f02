#pragma once

#include "emulator/journey/Recorder.h"
#include "emulator/line/LineLoad.h"
#include "emulator/operators/Finger.h"
#include "emulator/operators/Operator.h"
#include "emulator/panel/Display.h"
#include "emulator/panel/Keypad.h"
#include "emulator/web/WebServer.h"
#include "emulator/web/WebService.h"

#include <sstream>
#include <string>

namespace emulator {

/// The panel on a page that any number of browsers may have open. All of them see the same panel
/// and have its one finger: whoever presses a key last has it.
class WebFront : public Operator, private WebService {
  public:
    /// Serves the page from now on. Throws std::runtime_error when it cannot.
    WebFront(Loop &loop, const boost::asio::ip::tcp::endpoint &endpoint, const Display &display,
             Keypad &keypad, Use use);

    [[nodiscard]] const WebServer &webServer() const { return server; }

    std::optional<int> look(TimePoint now) override;
    [[nodiscard]] std::optional<TimePoint> wakeAt() const override;
    void carried(unsigned char byte) override { load.carried(byte); }

    /// All is over: tells the open pages why, and takes nothing any more.
    void finish(const std::string &reason);
    /// True when all browsers have been told.
    [[nodiscard]] bool isIdle() const { return server.isIdle(); }

  private:
    [[nodiscard]] std::optional<Resource> resource(std::string_view name) const override;
    [[nodiscard]] std::string state() const override;
    bool take(const WebSession &page, std::string_view message) override;
    void leave(const WebSession &page) override;

    void letGo();
    [[nodiscard]] bool isRecording();
    [[nodiscard]] std::string programState() const;
    [[nodiscard]] std::string journey() const;

    const Display &display;
    Keypad &keypad;
    Use use;
    Finger finger;
    const WebSession *presser = nullptr;    // whose key is down
    TimePoint holdUntil = TimePoint::max(); // unless that page says that it is still held
    LineLoad load;
    std::ostringstream recording; // of all that has been done since the start
    Recorder recorder;
    std::streamoff recorded = 0; // bytes of it, before the key that is being counted
    std::string ending;          // why all is over, once it is
    std::string shown;           // the last state
    TimePoint showAgain;         // if it has changed
    TimePoint repeat;            // even if it has not
    WebServer server;            // the last: its connections use all of the above until it is gone
};

} // namespace emulator
