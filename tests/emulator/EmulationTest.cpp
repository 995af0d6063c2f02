#include "emulator/journey/JourneyPlayer.h"
#include "emulator/line/Line.h"
#include "emulator/line/LineLoad.h"
#include "emulator/panel/Font.h"
#include "emulator/panel/Picture.h"

#include <gtest/gtest.h>

#include <fcntl.h>

#include <fstream>
#include <set>
#include <sstream>

using namespace emulator;
using namespace std::string_literals;

namespace {

Display showing(const std::string &bytes) { // '^' stands for the prefix FE
    Display display;
    bool keyRequest = false;
    for (const char c : bytes)
        keyRequest = display.receive(c == '^' ? 0xFE : static_cast<unsigned char>(c));
    EXPECT_EQ(keyRequest, bytes.size() > 1 && bytes.substr(bytes.size() - 2) == "^\6");
    return display;
}

TEST(Display, PutsBytesWhereTheControllerDoes) {
    struct Case {
        std::string bytes, row0, row1;
        std::pair<int, int> cursor;
        std::pair<unsigned long, unsigned long> odd; // unknown commands, hidden characters
    };
    const std::vector<Case> cases{
        {"^\1^\2top^A^\x10go"s, "top", "go", {1, 2}, {0, 0}},
        {"old^E^\1x"s, "x", "", {0, 1}, {0, 0}},
        {"^\xA7xy"s, "", "y", {1, 1}, {0, 1}},
        {"^\x80^\x10"s, "", "", {1, 39}, {0, 0}},
        {"^h^\x10"s, "", "", {1, 39}, {0, 0}},
        {"^\xC2go^\xE7xt"s, "t", "  go", {0, 1}, {0, 1}},
        {"^\x8Fxy"s, "               x", "", {0, 17}, {0, 1}},
        {"x^(^\0y\6^\6"s, "xy\6", "", {0, 3}, {0, 0}},
        {"x^\3^i^\xA8^\xE8^\xFFy"s, "xy", "", {0, 2}, {5, 0}},
        {"^^\1x"s, "x", "", {0, 1}, {1, 0}},
    };
    for (const Case &c : cases) {
        const Display display = showing(c.bytes);
        const std::string text = Picture(display).text();
        EXPECT_EQ(text, Picture(Picture::Rows{c.row0, c.row1}).text());
        EXPECT_EQ(std::pair(display.cursorRow(), display.cursorColumn()), c.cursor) << text;
        EXPECT_EQ(std::pair(display.unknownCommands(), display.hiddenCharacters()), c.odd) << text;
    }
}

TEST(LineLoad, IsFullAt218BytesASecond) {
    const TimePoint start;
    LineLoad load(start);
    for (int k = 0; k < 218; k++)
        load.carried(0xFE);
    load.look(start + std::chrono::seconds(1));
    EXPECT_NEAR(load.percent(), 99.9, 0.05);
}

TEST(Picture, ShowsDotsAndAVisibleCursor) {
    const std::string rows = "|a?c             |\n|                |\n",
                      plain = "+----------------+\n";
    const auto text = [](const char *more) { return Picture(showing("a\tc"s + more)).text(); };
    EXPECT_EQ(text("^\x0D^\x0C"), plain + rows + plain);
    EXPECT_EQ(text("^\x0D"), "+---v------------+\n" + rows + plain);
    EXPECT_EQ(text("^\x0D^O"), plain + rows + "+---------------^+\n");
    EXPECT_EQ(text("^\x0D^P"), text("")) << "past the visible columns";
    const std::string svg = Picture(showing("<T")).svg();
    EXPECT_NE(svg.find("<title>&lt;T "), std::string::npos);
    EXPECT_NE(svg.find("M15 9h5M17 10h1M17 11h1"), std::string::npos) << svg;
    EXPECT_NE(svg, Picture(showing("<T^\x0D")).svg());
    std::set<Glyph> glyphs{glyph('\n')};
    for (char c = ' '; c <= '~'; c++)
        EXPECT_TRUE(glyphs.insert(glyph(c)).second) << c << " looks like another character";
}

TEST(Line, CarriesAByteEach11BitsAndKnowsWhatFollowsAReadAnswer) {
    Line line(false);
    const FileDescriptor end(open(line.path().c_str(), O_RDWR | O_NOCTTY));
    const TimePoint sent = Clock::now();
    ASSERT_EQ(write(end.get(), "a\n", 2), 2);
    line.collect();
    const TimePoint arrived = Clock::now();
    EXPECT_FALSE(line.next(sent + std::chrono::microseconds(4583)));
    EXPECT_TRUE(line.next(arrived + std::chrono::microseconds(4584)));
    EXPECT_FALSE(line.next(sent + std::chrono::microseconds(9166)));
    EXPECT_EQ(line.next(arrived + std::chrono::microseconds(9167)).value().value, '\n');

    std::array<char, 8> answer{};
    const auto sentAfterRead = [&] {
        line.collect();
        EXPECT_EQ(write(end.get(), "a", 1), 1);
        line.collect();
        return line.next(Clock::now() + std::chrono::milliseconds(50)).value().sinceAnswerRead;
    };
    line.answer(0xBE);
    EXPECT_FALSE(sentAfterRead());
    ASSERT_EQ(read(end.get(), answer.data(), answer.size()), 2);
    EXPECT_EQ(answer[1], '\xBE');
    EXPECT_TRUE(sentAfterRead());
}

Journey parse(const std::string &text) {
    std::istringstream input(text);
    return {input, "trip"};
}

template <typename Action> std::string refusal(Action action) try {
    action();
    return "none";
} catch (const std::exception &error) {
    return error.what();
}

// Each line of the file is a step that is refused, some of them only because a key is held.
TEST(Journey, RefusesWrongStepsWithTheirLine) {
    std::vector<std::string> steps{"\x1B[2J", "say \x01"};
    std::ifstream file(REFUSED_STEPS);
    for (std::string line; std::getline(file, line);)
        steps.push_back(line);
    EXPECT_GT(steps.size(), 30U);
    for (const std::string &step : steps) {
        const std::string message = refusal([&] { parse("hold up 1\n# then\n" + step); });
        EXPECT_EQ(message.substr(0, 8), step[0] == '#' ? "none" : "trip:3: ") << step << message;
        EXPECT_EQ(message.find('\x1B'), std::string::npos);
    }
    EXPECT_EQ(refusal([] { parse(" \n# nothing\n"); }), "trip: there is no step in it");
    EXPECT_EQ(refusal([] { parse("walk up\n\nrelease\n"); }),
              "trip:1: no sights stand behind this step");
    parse("\xEF\xBB\xBFsay a\r\nsay " + std::string(4092, '.'));
    EXPECT_EQ(refusal([] { parse("say a\nsay " + std::string(4093, '.')); }),
              "trip:2: the line is too long");
}

struct Nowhere : Surroundings {
    void start(const step::Run &) override {}
    void start(const step::Appliance &) override {}
    std::optional<int> status() override { return std::nullopt; }
    std::string act(const TestAction &) override { return ""; }
};

struct Trip {
    explicit Trip(const std::string &text)
        : player(parse(text), {display, keypad}, surroundings, output, std::chrono::seconds(1)) {}

    Display display;
    std::string polls; // one character each: the key's initial, or a full stop
    Keypad keypad{[this](Key key) { polls.back() = traits(key).name.front(); }};
    std::ostringstream output;
    Nowhere surroundings;
    JourneyPlayer player;
    TimePoint now;
};

TEST(JourneyPlayer, CountsKeysInPolls) {
    Trip trip("tap up 2 # twice\nhold down 3\nhold down 2\nhold enter 1\nrelease\nsay # yes\n"
              "keys u3x d");
    while (!trip.player.advance(trip.now) && trip.polls.size() < 50) {
        trip.polls += '.';
        // The second request was on the line before the first one's answer was read.
        trip.keypad.request(trip.polls.size() != 2);
    }
    EXPECT_EQ(trip.polls, "u..u.ddddde.uuu.e.d..");
    EXPECT_EQ(trip.output.str(), "# yes\n");
}

TEST(JourneyPlayer, WaitsForWhatIsExpectedUpToTheLimit) {
    Trip trip("expect \"say \\\"\\\\\" \"\"\nlimit 2\nexpect-cursor 0 6 off\nexpect gone \"\"");
    EXPECT_FALSE(trip.player.advance(trip.now));
    trip.display = showing("say \"\\");
    EXPECT_FALSE(trip.player.advance(trip.now + std::chrono::milliseconds(999)));
    trip.now += std::chrono::milliseconds(999 + 2000);
    EXPECT_FALSE(trip.player.advance(trip.now - std::chrono::milliseconds(1)));
    const std::string message = refusal([&] { trip.player.advance(trip.now); });
    EXPECT_EQ(message.substr(0, 8), "trip:4: ");
    EXPECT_LT(message.find("|gone            |"), message.find("|say \"\\          |")) << message;
}

TEST(Sight, IsShownOrNotAndTellsWhatWasWanted) {
    const std::vector<std::tuple<std::string, std::string, bool>> cases{
        {"> Set Srv", "chosen \"Set Srv\"", true},
        {"> Set Srv", "chosen \"Set Sr\"", false},
        {"^A^\x10> Set Entry 13 v"s, "chosen \"Set Entry 13\"", true},
        {"go^\r"s, "\"go\" at 0 2", true},
        {"go^\f"s, "\"go\" at 0 2", false},
        {"go^\r"s, "* \"\" at 0 39", false},
    };
    for (const auto &[bytes, sight, isShown] : cases) {
        Trip trip("expect " + sight);
        trip.display = showing(bytes);
        trip.keypad.request(true);
        EXPECT_EQ(trip.player.advance(trip.now), isShown) << sight;
        const std::string message =
            refusal([&] { trip.player.advance(trip.now + std::chrono::seconds(1)); });
        EXPECT_EQ(message.find("wanted:\n") == std::string::npos, isShown) << message;
        EXPECT_EQ(message.find("the last that the panel showed") == std::string::npos, isShown);
    }
}

} // namespace
