#include "Operator.h"

#include "status/NetworkPorts.h"
#include "status/PageTexts.h"

#include <cmath>
#include <csignal>

using emulator::Key;
using namespace std::chrono_literals;

namespace {

constexpr Micros answerTime = 25ms; // from the start of a poll to its drawing

// Lets one turn draw exactly this long after `start`.
void drawAt(Operator &person, Micros start, double seconds) {
    world().now = start + Micros(std::llround(seconds * 1e6)) - answerTime;
    person.answer("?");
}

const std::string product = "Kestrova (TM)|cabinetDevice";

} // namespace

FRESH_TEST(Status, PagesStayFiveSecondsFromTheFirstPollOn) {
    standardAppliance();
    Operator person;
    EXPECT_EQ(Operator::sees(), "|");
    person.poll();
    const Micros start = world().now - 100ms;
    EXPECT_EQ(Operator::sees(), product);
    drawAt(person, start, 5);
    EXPECT_EQ(Operator::sees(), product);
    drawAt(person, start, 5.000001);
    EXPECT_EQ(Operator::sees(), "Hostname:|monitor");
}

FRESH_TEST(Status, APageThatWasChosenStaysForAMinute) {
    standardAppliance();
    Operator person;
    person.poll();
    person.press(Key::up);
    EXPECT_EQ(Operator::sees(), "E5 (eth5)|unused");
    person.hold(Key::down, 6); // the first and the sixth poll act
    EXPECT_EQ(Operator::sees(), "Hostname:|monitor");
    const Micros start = world().now - 225ms; // when the last of them was read
    drawAt(person, start, 60);
    EXPECT_EQ(Operator::sees(), "Hostname:|monitor");
    drawAt(person, start, 60.000001);
    EXPECT_EQ(Operator::sees(), "Connected to:|no server");
}

FRESH_TEST(Status, ALongRowKeepsItsPageUntilItIsRead) {
    world().appliance.settings["hostname"] = "abcdefghijklmnopqrs"; // three characters too long
    standardAppliance();
    world().appliance.files["/opt/kestrova/seq.site_conn"] = "Connection OK";
    world().appliance.files["/opt/kestrova/config/nis.config"] = "NIS Address: management.example";
    const std::string server = "Connected to:|management.examp";
    Operator person;
    person.poll();
    person.poll(Key::down);
    const Micros start = world().now - 100ms; // when the page was drawn
    const std::string cycle = "abcdefghijklmnopqrs   abcdefghijklmnopqrs";
    const auto showsFrom = [&](double seconds, std::size_t offset) {
        drawAt(person, start, seconds);
        EXPECT_EQ(world().display.visibleRow(1), cycle.substr(offset, 16)) << seconds;
    };
    person.poll(Key::escape);
    showsFrom(2, 0);
    showsFrom(2.000001, 1);
    showsFrom(2.900001, 1);
    showsFrom(2.900002, 2); // the second of three: restarts the page's five seconds
    showsFrom(3.9, 3);      // the third does not
    showsFrom(4.9, 4);
    showsFrom(7.9, 5);
    drawAt(person, start, 7.900003);
    EXPECT_EQ(Operator::sees(), server);
}

FRESH_TEST(Status, AKeysPageStartsItsTimeOnceItIsDrawn) {
    standardAppliance();
    Operator person;
    person.poll();
    world().now += 5s;
    world().events.clear();
    person.poll();
    EXPECT_EQ(world().events, (std::vector<std::string>{"clock", "run hostname", "row", "row"}));
    world().events.clear();
    person.poll(Key::up);
    person.poll(Key::down);
    EXPECT_EQ(world().events,
              (std::vector<std::string>{"row", "row", "clock", "clock", "clock", "run hostname",
                                        "row", "row", "clock", "clock", "clock"}));
    world().events.clear();
    world().sent.clear();
    person.wait(1.2);
    EXPECT_EQ(world().events, (std::vector<std::string>{"clock", "clock"}));
    EXPECT_EQ(world().sent, std::string("\xFE\0\xFE\x06\xFE\0\xFE\x06", 8));
    world().clockWorks = false;
    person.wait(100);
    EXPECT_EQ(Operator::sees(), "Hostname:|monitor");
}

FRESH_TEST(Status, WithoutAShellAWordCountsAsAnAddress) {
    world().shellWorks = false;
    EXPECT_EQ(listPortsWithPage(), std::vector<std::string>{"ERROR"});
    EXPECT_EQ(interfaceText("eth0"), "E0 (eth0)\nERROR");
    EXPECT_EQ(hostnameText(), "Hostname:\nERROR");
}

FRESH_TEST(Status, APortPageSaysWhyThereIsNoAddress) {
    const std::vector<std::pair<std::string, std::string>> labels = {
        {"bridge0", "E0/E1"}, {"bridge1", "E2/E3"}, {"bridge0x", ""}, {"eth10", "E1"},
        {"eth0.100", "E0"},   {"eth7", "E7"},       {"eth8", ""},     {"eth", ""}};
    for (const auto &[name, label] : labels)
        EXPECT_EQ(portLabel(name), label) << name;

    world().appliance.ports = {{"eth0", "10.1.1.5/8"}, {"eth1", "-"}, {"eth2", "-"}};
    world().appliance.files["/etc/network/interfaces"] =
        "iface eth1 inet dhcp\niface eth2 inet static\niface eth3 inet dhcp\niface eth3 inet x\n";
    EXPECT_EQ(interfaceText("eth0"), "E0 (eth0)\n10.1.1.5\n");
    EXPECT_EQ(interfaceText("eth1"), "E1 (eth1)\nDHCP: no address");
    EXPECT_EQ(interfaceText("eth2"), "E2 (eth2)\nunused");
    EXPECT_EQ(interfaceText("eth3"), "E3 (eth3)\nDHCP: no address");
    EXPECT_EQ(interfaceText("bridge9"), " (bridge9)\nunused");
    world().appliance.prints["ifconfig | grep 'eth0'"] = "";
    EXPECT_EQ(interfaceText("eth0"), "E0 (eth0)\nunused");
}

FRESH_TEST(Status, TheServerIsNamedOnlyWhenBothFilesSaySo) {
    const std::string none = "no server";
    const std::vector<std::tuple<const char *, const char *, std::string>> cases = {
        {"Connection OK\n", "NIS Address: 10.1.2.3\n", "10.1.2.3"},
        {"x\nConnection OK since 10:00", "a\nNIS Address: a b\r\r\nNIS Address: z\n", "a b\r"},
        {"Connection ON\n", "NIS Address: 10.1.2.3\n", none},
        {"connection ok\n", "NIS Address: 10.1.2.3\n", none},
        {" Connection OK\n", "NIS Address: 10.1.2.3\n", none},
        {"", "NIS Address: 10.1.2.3\n", none},
        {"Connection OK", "NIS Address:10.1.2.3\n", none},
        {"Connection OK", "NIS Address: \r\nNIS Address: 10.1.2.3\n", none},
        {"Connection OK", "", none},
        {nullptr, "NIS Address: 10.1.2.3\n", none},
        {"Connection OK", nullptr, none},
    };
    for (const auto &[status, config, server] : cases) {
        world().appliance.files.clear();
        if (status != nullptr)
            world().appliance.files["/opt/kestrova/seq.site_conn"] = status;
        if (config != nullptr)
            world().appliance.files["/opt/kestrova/config/nis.config"] = config;
        EXPECT_EQ(connectionText(), "Connected to:\n" + server) << status << config;
    }
}

FRESH_TEST(Status, AQ75HasTheBannerOfAQ70ButIsAModelOfItsOwn) {
    standardAppliance();
    EXPECT_EQ(detectPlatform(), 1U);
}

FRESH_TEST(Status, AClockThatIsSetBackStopsTheRotationUntilAKeyOrAReload) {
    standardAppliance();
    Operator person;
    person.poll();
    world().now -= 1h;
    person.wait(600);
    EXPECT_EQ(Operator::sees(), product);
    person.press(Key::down);
    person.wait(59);
    EXPECT_EQ(Operator::sees(), "Hostname:|monitor");
    person.wait(3);
    EXPECT_EQ(Operator::sees(), "Connected to:|no server");

    world().now -= 1h;
    person.wait(600);
    EXPECT_EQ(Operator::sees(), "Connected to:|no server");
    raise(SIGUSR1);
    person.poll();
    EXPECT_EQ(Operator::sees(), product);
}
