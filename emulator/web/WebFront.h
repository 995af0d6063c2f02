#pragma once

#include "emulator/journey/Recorder.h"
#include "emulator/line/LineLoad.h"
#include "emulator/operators/Finger.h"
#include "emulator/operators/Operator.h"
#include "emulator/panel/Display.h"
#include "emulator/panel/Keypad.h"
#include "emulator/web/WebServer.h"
#include "emulator/web/WebService.h"

#include <functional>
#include <optional>
#include <sstream>
#include <string>

namespace emulator {

/// The panel on a page that any number of browsers may have open. All of them see the same panel
/// and have its one finger: whoever presses a key last has it.
class WebFront : public Operator, private WebService {
  public:
    /// Serves the page from now on. Throws std::runtime_error when it cannot. `startOver` is called
    /// when somebody at a page wants a fresh appliance; it is empty if there can be none.
    WebFront(Loop &loop, const boost::asio::ip::tcp::endpoint &endpoint, const Display &display,
             Keypad &keypad, Use use, std::function<void()> startOver);

    [[nodiscard]] const WebServer &webServer() const { return server; }

    std::optional<int> look(TimePoint now) override;
    [[nodiscard]] std::optional<TimePoint> wakeAt() const override;
    void carried(unsigned char byte) override { load.carried(byte); }

    /// The panel stands before a fresh appliance from now on, with which the recording begins anew.
    void beginAnew();
    /// All is over: tells the open pages why, and takes nothing any more.
    void finish(const std::string &reason);
    /// True when all browsers have been told.
    [[nodiscard]] bool isIdle() const { return server.isIdle(); }

  private:
    [[nodiscard]] std::optional<Resource> resource(std::string_view name) const override;
    [[nodiscard]] std::string state() const override;
    [[nodiscard]] std::string welcome(const Page &page) const override;
    bool take(const Page &page, std::string_view message) override;
    void leave(const Page &page) override;

    void press(Key key, const Page &page);
    void letGo();
    [[nodiscard]] std::string programState() const;
    [[nodiscard]] std::string journey() const;

    const Display &display;
    Keypad &keypad;
    Use use;
    std::function<void()> startOver;
    Finger finger;
    std::optional<unsigned long> presser;   // the page that has pressed a key last
    TimePoint holdUntil = TimePoint::max(); // unless that page says that it still holds the key
    LineLoad load;
    unsigned appliances = 1;      // so far
    bool isStartingOver = false;  // until the next one is there
    std::ostringstream recording; // of all that has been done at the present one
    std::optional<Recorder> recorder;
    bool isFull = false;         // of as much as may be recorded
    std::streamoff recorded = 0; // bytes of it, before the key that is being counted
    std::string ending;          // why all is over, once it is
    std::string shown;           // the last state
    TimePoint showAgain;         // if it has changed
    TimePoint repeat;            // even if it has not
    WebServer server;            // the last: its connections use all of the above until it is gone
};

} // namespace emulator
