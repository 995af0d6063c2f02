#include "RunningProgram.h"

#include "status/PageTexts.h"

#include <cmath>
#include <csignal>

using emulator::Key;
using namespace std::chrono_literals;

namespace {

constexpr Micros answerTime = 25ms; // from the start of a poll to its drawing

// Lets one turn draw exactly this long after `start`.
void drawAt(RunningProgram &program, Micros start, double seconds) {
    world().now = start + Micros(std::llround(seconds * 1e6)) - answerTime;
    program.answer("?");
}

const std::string product = "Kestrova (TM)|cabinetDevice";

} // namespace

FRESH_TEST(Status, PagesStayFiveSecondsFromTheFirstPollOn) {
    standardAppliance();
    RunningProgram program;
    EXPECT_EQ(world().shown(), "|");
    program.poll();
    const Micros start = world().now - 100ms;
    EXPECT_EQ(world().shown(), product);
    EXPECT_EQ(std::count_if(world().events.begin(), world().events.end(),
                            [](auto &event) { return boost::contains(event, "ifconfig -s"); }),
              1);
    drawAt(program, start, 5);
    EXPECT_EQ(world().shown(), product);
    drawAt(program, start, 5.000001);
    EXPECT_EQ(world().shown(), "Hostname:|monitor");
}

FRESH_TEST(Status, APageThatWasChosenStaysForAMinute) {
    standardAppliance();
    RunningProgram program;
    program.poll();
    program.press(Key::up);
    EXPECT_EQ(world().shown(), "E5 (eth5)|unused");
    program.hold(Key::down, 6); // the first and the sixth poll act
    EXPECT_EQ(world().shown(), "Hostname:|monitor");
    const Micros start = world().now - 225ms; // when the last of them was read
    drawAt(program, start, 60);
    EXPECT_EQ(world().shown(), "Hostname:|monitor");
    drawAt(program, start, 60.000001);
    EXPECT_NE(world().shown(), "Hostname:|monitor");
}

FRESH_TEST(Status, ALongRowKeepsItsPageUntilItIsRead) {
    standardAppliance();
    world().appliance.act({"hostname", "abcdefghijklmnopqrs"}); // three characters too long
    RunningProgram program;
    program.poll();
    program.poll(Key::down);
    const Micros start = world().now - 100ms; // when the page was drawn
    const std::string cycle = "abcdefghijklmnopqrs   abcdefghijklmnopqrs";
    const auto showsFrom = [&](double seconds, std::size_t offset) {
        drawAt(program, start, seconds);
        EXPECT_EQ(world().display.visibleRow(1), cycle.substr(offset, 16)) << seconds;
    };
    program.poll(Key::escape);
    showsFrom(2, 0);
    showsFrom(2.000001, 1);
    showsFrom(2.900001, 1);
    showsFrom(2.900002, 2); // the second of three: restarts the page's five seconds
    showsFrom(3.9, 3);      // the third does not
    showsFrom(4.9, 4);
    showsFrom(7.9, 5);
    drawAt(program, start, 7.900003);
    EXPECT_NE(world().display.visibleRow(0), "Hostname:       ");
}

FRESH_TEST(Status, AKeysPageStartsItsTimeOnceItIsDrawn) {
    standardAppliance();
    RunningProgram program;
    program.poll();
    world().now += 5s;
    world().events.clear();
    program.poll();
    EXPECT_EQ(world().events, (std::vector<std::string>{"clock", "run hostname", "row", "row"}));
    world().events.clear();
    program.poll(Key::up);
    program.poll(Key::down);
    EXPECT_EQ(world().events,
              (std::vector<std::string>{"row", "row", "clock", "clock", "clock", "run hostname",
                                        "row", "row", "clock", "clock", "clock"}));
    world().events.clear();
    world().sent.clear();
    program.wait(1s);
    EXPECT_EQ(world().events, (std::vector<std::string>{"clock", "clock"}));
    EXPECT_EQ(world().sent, std::string("\xFE\0\xFE\x06\xFE\0\xFE\x06", 8));
    world().clockWorks = false;
    program.wait(100s);
    EXPECT_EQ(world().shown(), "Hostname:|monitor");
}

FRESH_TEST(Status, OneCarriageReturnBehindTheServerIsDropped) {
    const std::string config = "/opt/kestrova/config/nis.config";
    world().appliance.act({"file", "/opt/kestrova/seq.site_conn", "Connection OK"});
    world().appliance.act({"file", config, "NIS Address: a b\r\r\n"});
    EXPECT_EQ(connectionText(), "Connected to:\na b\r");
    world().appliance.act({"file", config, "NIS Address: \r\n"});
    EXPECT_EQ(connectionText(), "Connected to:\nno server");
}

FRESH_TEST(Status, AClockThatIsSetBackStopsTheRotationUntilAKeyOrAReload) {
    standardAppliance();
    RunningProgram program;
    program.poll();
    world().now -= 1h;
    program.wait(600s);
    EXPECT_EQ(world().shown(), product);
    program.press(Key::down);
    program.wait(59s);
    EXPECT_EQ(world().shown(), "Hostname:|monitor");
    program.wait(3s);
    const std::string next = world().shown();
    EXPECT_NE(next, "Hostname:|monitor");

    world().now -= 1h;
    program.wait(600s);
    EXPECT_EQ(world().shown(), next);
    raise(SIGUSR1);
    program.poll();
    EXPECT_EQ(world().shown(), product);
}
