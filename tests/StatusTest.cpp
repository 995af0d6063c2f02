#include "Operator.h"

#include "status/NetworkPorts.h"
#include "status/PageTexts.h"

#include <csignal>

namespace {

constexpr long long answerTime = 25'000; // microseconds from the start of a poll to its drawing

// Lets one turn draw exactly this long after `start`.
void drawAt(Operator &person, long long start, double seconds) {
    world().microseconds = start + static_cast<long long>(seconds * 1e6) - answerTime;
    person.answer("?");
}

const std::string product = "Kestrova (TM)|cabinetDevice";

} // namespace

TEST(Status, NothingIsDrawnBeforeTheFirstPollAndThenPagesStayFiveSeconds) {
    standardAppliance(world());
    Operator person;
    EXPECT_EQ(Operator::sees(), "|");
    person.poll();
    const long long start = world().microseconds - 100'000;
    EXPECT_EQ(Operator::sees(), product);
    drawAt(person, start, 5);
    EXPECT_EQ(Operator::sees(), product);
    drawAt(person, start, 5.000001);
    EXPECT_EQ(Operator::sees(), "Hostname:|monitor");
    const std::vector<std::string> rest = {"Connected to:|no server", "E0 (eth0)|10.1.1.5",
                                           "E4 (eth4)|unused", "E5 (eth5)|unused", product};
    for (const auto &page : rest) {
        person.wait(5.5);
        EXPECT_EQ(Operator::sees(), page);
    }
}

TEST(Status, UpAndDownStepRoundRepeatWhenHeldAndPauseTheRotationForAMinute) {
    standardAppliance(world());
    Operator person;
    person.poll();
    person.press(keyUp);
    EXPECT_EQ(Operator::sees(), "E5 (eth5)|unused");
    person.hold(keyDown, 6); // the first and the sixth poll act
    EXPECT_EQ(Operator::sees(), "Hostname:|monitor");
    const long long start = world().microseconds - 225'000; // when the last of them was read
    drawAt(person, start, 60);
    EXPECT_EQ(Operator::sees(), "Hostname:|monitor");
    drawAt(person, start, 60.000001);
    EXPECT_EQ(Operator::sees(), "Connected to:|no server");
    person.wait(5.5);
    EXPECT_EQ(Operator::sees(), "E0 (eth0)|10.1.1.5");

    person.press(keyDown);
    person.press(keyEscape); // the rotation goes on five seconds after the last press
    person.wait(3.5);
    EXPECT_EQ(Operator::sees(), "E4 (eth4)|unused");
    person.wait(1.5);
    EXPECT_EQ(Operator::sees(), "E5 (eth5)|unused");
    person.press(keyUp);
    person.wait(20);
    EXPECT_EQ(Operator::sees(), "E4 (eth4)|unused");
    person.poll(keyEscape);
    EXPECT_EQ(Operator::sees(), "E5 (eth5)|unused");
}

TEST(Status, ALongSecondRowScrollsAfterTwoSecondsAndKeepsItsPageUntilItIsRead) {
    world().hostname = "abcdefghijklmnopqrs\n"; // three characters too long
    standardAppliance(world());
    world().files["/opt/kestrova/seq.site_conn"] = "Connection OK";
    world().files["/opt/kestrova/config/nis.config"] = "NIS Address: management.example";
    const std::string server = "Connected to:|management.examp";
    Operator person;
    person.poll();
    person.poll(keyDown);
    const long long start = world().microseconds - 100'000; // when the page was drawn
    const std::string cycle = "abcdefghijklmnopqrs   abcdefghijklmnopqrs";
    const auto showsFrom = [&](double seconds, std::size_t offset) {
        drawAt(person, start, seconds);
        EXPECT_EQ(world().display.visibleRow(1), cycle.substr(offset, 16)) << seconds;
    };
    person.poll(keyEscape);
    showsFrom(2, 0);
    showsFrom(2.000001, 1);
    showsFrom(2.900001, 1);
    showsFrom(2.900002, 2); // the second of three: restarts the page's five seconds
    showsFrom(3.9, 3);      // the third does not
    showsFrom(4.9, 4);
    showsFrom(7.9, 5);
    drawAt(person, start, 7.900003);
    EXPECT_EQ(Operator::sees(), server);
    // However the next page comes, its row rests for two seconds again.
    drawAt(person, start, 9.9);
    EXPECT_EQ(Operator::sees(), server);
    drawAt(person, start, 9.900004);
    EXPECT_EQ(Operator::sees(), "Connected to:|anagement.exampl");
    person.press(keyUp);
    person.press(keyDown);
    person.wait(1.5);
    EXPECT_EQ(Operator::sees(), server);
}

TEST(Status, TheClockIsReadBeforeAPageIsComputedByItselfAndAfterwardsForAKey) {
    standardAppliance(world());
    Operator person;
    person.poll();
    world().microseconds += 5'000'000;
    world().events.clear();
    person.poll();
    EXPECT_EQ(world().events, (std::vector<std::string>{"clock", "run hostname", "row", "row"}));
    world().events.clear();
    person.poll(keyUp);
    person.poll(keyDown);
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

TEST(Status, TheModelDecidesTheBannerAndTheConnectionPage) {
    const std::vector<std::tuple<std::string, std::string, bool>> cases = {
        {"q70", product, true},    {"q75-x\nzvm", product, true},
        {"q700-x", product, true}, {"q7", "|", false},
        {"Q75", "|", false},       {"", "|", false},
        {"\nq75", "|", false},     {"zvm", "Kestrova Cloud|Appliance", false},
        {" q75", "|", false},      {"x q75", "|", false},
    };
    for (const auto &[firstLine, banner, connects] : cases) {
        inFreshProgram([&, line = firstLine, expected = banner, third = connects] {
            world().files["/etc/ma-platform"] = line;
            Operator person;
            person.poll();
            EXPECT_EQ(Operator::sees(), expected) << line;
            person.press(keyDown, 2);
            EXPECT_EQ(Operator::sees(), third ? "Connected to:|no server" : "E4 (eth4)|unused");
        });
    }
    inFreshProgram([] {
        Operator person; // no file at all
        person.poll();
        EXPECT_EQ(Operator::sees(), "|");
    });
    world().files["/etc/ma-platform"] = "q75";
    EXPECT_EQ(detectPlatform(), 1U); // its banner is that of a q70, but it is a model of its own
}

TEST(Status, PortsAreListedWhenTheyHaveAnAddressAndASignalListsThemAgain) {
    world().portAddresses = {
        {"eth0", ""}, {"eth1", "10.2.2.2"}, {"eth4", ""}, {"bridge1", "10.9.9.9"}};
    Operator person;
    person.poll();
    const auto pages = [&] {
        std::string titles;
        person.press(keyDown);
        for (person.press(keyDown); Operator::sees() != "|"; person.press(keyDown))
            titles += Operator::sees() + ";";
        return titles;
    };
    EXPECT_EQ(pages(), "E2/E3 (bridge1)|10.9.9.9;E1 (eth1)|10.2.2.2;E4 (eth4)|unused;"
                       "E5 (eth5)|unused;");
    world().portAddresses = {{"eth0", "10.1.1.1"}, {"wlan0", "10.3.3.3"}};
    world().events.clear();
    raise(SIGUSR1);
    person.poll();
    EXPECT_EQ(world().commands("run ifconfig eth").size(), 3U);
    EXPECT_EQ(pages(), "E0 (eth0)|10.1.1.1;E4 (eth4)|unused;E5 (eth5)|unused;undefined|;");

    world().shellWorks = false; // every look-up now gives the same word, which counts as an address
    raise(SIGUSR1);
    person.poll();
    EXPECT_EQ(listPortsWithPage(), std::vector<std::string>{"ERROR"});
    EXPECT_EQ(interfaceText("eth0"), "E0 (eth0)\nERROR");
    EXPECT_EQ(hostnameText(), "Hostname:\nERROR");
}

TEST(Status, APortPageShowsItsLabelAndItsAddressOrWhyThereIsNone) {
    const std::vector<std::pair<std::string, std::string>> labels = {
        {"bridge0", "E0/E1"}, {"bridge1", "E2/E3"}, {"bridge0x", ""}, {"eth10", "E1"},
        {"eth0.100", "E0"},   {"eth7", "E7"},       {"eth8", ""},     {"eth", ""}};
    for (const auto &[name, label] : labels)
        EXPECT_EQ(portLabel(name), label) << name;

    world().portAddresses = {{"eth0", "10.1.1.5"}, {"eth1", ""}, {"eth2", ""}};
    world().portMethods = {{"eth1", "dhcp"}, {"eth2", "static"}, {"eth3", "dhcp\nstatic"}};
    EXPECT_EQ(interfaceText("eth0"), "E0 (eth0)\n10.1.1.5\n");
    EXPECT_EQ(interfaceText("eth1"), "E1 (eth1)\nDHCP: no address");
    EXPECT_EQ(interfaceText("eth2"), "E2 (eth2)\nunused");
    EXPECT_EQ(interfaceText("eth3"), "E3 (eth3)\nDHCP: no address");
    EXPECT_EQ(interfaceText("bridge9"), " (bridge9)\nunused");
    world().outputs["ifconfig | grep 'eth0'"] = "";
    EXPECT_EQ(interfaceText("eth0"), "E0 (eth0)\nunused");
}

TEST(Status, TheServerIsNamedOnlyWhenBothFilesSaySo) {
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
        world().files.clear();
        if (status != nullptr)
            world().files["/opt/kestrova/seq.site_conn"] = status;
        if (config != nullptr)
            world().files["/opt/kestrova/config/nis.config"] = config;
        EXPECT_EQ(connectionText(), "Connected to:\n" + server) << status << config;
    }
}
