// An operator who knows nothing about the screens, at appliances in any state: whatever this
// operator does, some things have to hold on every screen (see Rack). The operator writes journeys.
// One that fails is shortened and printed; it can be played again with PANEL_JOURNEY=FILE, or on
// the emulated panel.
#include "Rack.h"

#include <iostream>
#include <numeric>
#include <random>
#include <stdexcept>

namespace {

constexpr unsigned journeyCount = JOURNEY_COUNT;
constexpr long long leastTurns = 12'500; // of each journey, on average
constexpr int actionsPerJourney = 900;

using Lines = std::vector<std::string>;

struct Dice {
    std::mt19937 random;

    int upTo(int most) { return static_cast<int>(random() % (static_cast<unsigned>(most) + 1)); }
    std::string oneOf(const Lines &choices) { return choices[random() % choices.size()]; }
    std::string several(int most, const Lines &choices) {
        std::string text;
        for (int k = upTo(most); k > 0; --k)
            text += oneOf(choices);
        return text;
    }
};

Lines appliance(Dice &dice) {
    Lines lines = {
        "appliance file /etc/ma-platform \"" + dice.oneOf({"q70", "q75", "zvm", "", "x"}) + "\"",
        "appliance file /etc/network/interfaces \"" +
            dice.several(12, {"iface eth0 inet static\\n", "iface eth0 inet dhcp\\n",
                              "iface eth4 inet static\\n", "address 10.1.1.5\\n",
                              "address 99999999999.-1.x\\n", "  netmask 255.255.255.0\\n",
                              "gateway 10.1.1.1\\n", "address \\n", "\\n", "# address 1.2.3.4\\n",
                              "hwaddress ether 00:11:22:33:44:55\\n", "address \xFF\xFE\\n",
                              std::string(300, '.') + "\\n"}) +
            "\"",
        "appliance file /etc/resolv.conf \"" +
            dice.several(14, {"nameserver 8.8.8.8\\n", "nameserver x\\n", "search y\\n"}) + "\""};
    for (const std::string name : {"eth0", "eth1", "eth5", "eth10", "bridge0", "wlan0"})
        lines.push_back("appliance port " + name + dice.oneOf({" -", " 10.1.1.5/8"}));
    lines.push_back(dice.oneOf({"appliance hostname a", "appliance hostname sixteencharacter",
                                "appliance hostname a.b.example-17", R"(prints hostname "")",
                                "appliance hostname " + std::string(40, 'Z'),
                                "appliance hostname " + std::string(64, 'z'),
                                R"(prints hostname "\n")", R"(prints hostname "two\nlines\n")"}));
    if (dice.upTo(1))
        lines.push_back("appliance remove /opt/kestrova/seq.site_conn");
    lines.emplace_back("appliance reboot"); // what has begun by then starts with all this
    return lines;
}

// What the operator does next; a key that is still down is released before the next one is tapped.
void act(Dice &dice, Lines &journey, bool &isKeyDown) {
    static const Lines names = {"up", "down", "down", "enter", "enter", "enter", "escape"};
    static const Lines polls = {"1", "1", "1", "2", "5", "6", "7", "30"};
    const int what = dice.upTo(11);
    if (what < 8) {
        const std::string name = dice.oneOf(names); // in this order with every compiler
        journey.push_back("hold " + name + " " + dice.oneOf(polls));
        isKeyDown = dice.upTo(7) == 0; // else the next key follows without a release
        if (!isKeyDown)
            journey.emplace_back("release");
    } else if (what == 8) {
        journey.push_back("wait " + dice.oneOf({"0.03", "0.4", "1", "6", "18"}));
    } else if (what == 9) {
        journey.push_back("answer B8*" + dice.oneOf(polls));
    } else if (what == 10) {
        journey.push_back(
            dice.oneOf({"appliance refresh", "appliance script works", "appliance script fails",
                        "appliance script chatters", "appliance script hangs 3",
                        "appliance port eth1 gone", "appliance port eth1 10.2.2.2/8"}));
    } else {
        // From the deepest screen, or from the end of the longest name, Escape leads to the pages.
        if (std::exchange(isKeyDown, false))
            journey.emplace_back("release");
        journey.emplace_back("tap escape 60");
        journey.emplace_back("tap down until \"Hostname:\"");
    }
}

Lines randomJourney(unsigned seed) {
    Dice dice{std::mt19937(seed)};
    Lines journey = appliance(dice);
    bool isKeyDown = false;
    for (int k = 0; k < actionsPerJourney; ++k)
        act(dice, journey, isKeyDown);
    return journey;
}

std::string textOf(const Lines &lines) {
    return std::accumulate(
        lines.begin(), lines.end(), std::string(),
        [](const std::string &text, const std::string &line) { return text + line + "\n"; });
}

Outcome playLines(const Lines &lines) try {
    return play(readJourney(textOf(lines), "random"), true);
} catch (const std::invalid_argument &) {
    return {true, 0}; // what is left is not a journey, because, for example, a key is still held
}

// Leaves out everything, in ever smaller pieces, without which the fault still shows.
Lines shortest(Lines journey) {
    for (std::size_t piece = journey.size() / 2; piece > 0; piece /= 2) {
        for (std::size_t at = 0; at < journey.size();) {
            Lines rest(journey.begin(), journey.begin() + static_cast<long>(at));
            const std::size_t after = std::min(at + piece, journey.size());
            rest.insert(rest.end(), journey.begin() + static_cast<long>(after), journey.end());
            if (playLines(rest).holds)
                at += piece;
            else
                journey = rest;
        }
    }
    return journey;
}

} // namespace

TEST(RandomOperator, FindsNoScreenThatBreaksItsPromises) {
    // By hand, PANEL_SEEDS=FIRST-LAST plays others.
    unsigned first = 1, last = journeyCount;
    if (const std::string seeds = getenv("PANEL_SEEDS") ? getenv("PANEL_SEEDS") : "";
        !seeds.empty()) {
        ASSERT_EQ(sscanf(seeds.c_str(), "%u-%u", &first, &last), 2) << "PANEL_SEEDS=FIRST-LAST";
        ASSERT_EQ(seeds, std::to_string(first) + "-" + std::to_string(last));
        ASSERT_LE(first, last);
    }
    long long turns = 0;
    for (unsigned seed = first; seed <= last; ++seed) {
        const Lines journey = randomJourney(seed);
        const Outcome outcome = playLines(journey);
        turns += outcome.turns;
        if (outcome.holds)
            continue;
        const std::string text = textOf(shortest(journey));
        play(readJourney(text, "random"));
        FAIL() << "seed " << seed << ", the shortest journey:\n" << text;
    }
    EXPECT_GE(turns, (last - first + 1) * leastTurns);
    std::cout << turns << " turns\n";
}
