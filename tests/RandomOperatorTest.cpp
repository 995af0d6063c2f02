// An operator who knows nothing of any screen, at appliances in any state: whatever happens, some
// things hold on every screen. A failure names its seed and the shortest journey that shows it.
#include "Operator.h"

#include <algorithm>
#include <array>
#include <csignal>
#include <filesystem>
#include <iostream>
#include <random>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

constexpr unsigned journeys = 80;
constexpr long long leastTurns = 1'000'000;
constexpr int actionsPerJourney = 900;

// A letter for what is done, as in `Operator::keys`, and how often or how long.
struct Action {
    char what;
    int amount;
};
using Journey = std::vector<Action>;

using Random = std::mt19937;
int upTo(Random &random, int most) {
    return static_cast<int>(random() % (static_cast<unsigned>(most) + 1));
}
template <typename T> T oneOf(Random &random, const std::vector<T> &choices) {
    return choices[random() % choices.size()];
}

void setUpAppliance(Random &random) {
    World &appliance = world();
    appliance.files["/etc/ma-platform"] =
        oneOf<std::string>(random, {"q70", "q75", "zvm", "", "x"});
    appliance.hostname = oneOf<std::string>(
        random, {"box\n", "", "\n", std::string(16, 'h') + "\n", "a.b.example-17ch\n",
                 std::string(40, 'Z') + "\n", std::string(64, '-') + "\n", "two\nlines\n"});
    appliance.scriptOutput = oneOf<std::string>(random, {"0\n", "0\n", "1\n", "", "x\n0\n"});
    for (const std::string name : {"eth0", "eth1", "eth10", "bridge0", "wlan0"}) {
        if (upTo(random, 1))
            appliance.portAddresses[name] = oneOf<std::string>(random, {"", "10.1.1.5"});
        appliance.portMethods[name] = oneOf<std::string>(random, {"dhcp", "static", ""});
    }
    const std::vector<std::string> lines = {"iface eth0 inet static",
                                            "iface eth0 inet dhcp",
                                            "iface eth4 inet static",
                                            "address 10.1.1.5",
                                            "address 99999999999.-1.x",
                                            "  netmask 255.255.255.0",
                                            "gateway 10.1.1.1",
                                            "address ",
                                            "",
                                            "hwaddress ether 00:11:22:33:44:55",
                                            "# address 1.2.3.4",
                                            std::string(5000, '.'),
                                            std::string("address \0\xFF", 10)};
    std::string &interfaces = appliance.files["/etc/network/interfaces"];
    for (int k = upTo(random, 20); k > 0; --k)
        interfaces += oneOf(random, lines) + "\n";
    std::string &servers = appliance.files["/etc/resolv.conf"];
    for (int k = upTo(random, 14); k > 0; --k)
        servers +=
            oneOf<std::string>(random, {"nameserver 8.8.8.8\n", "nameserver x\n", "search y\n"});
    appliance.files["/opt/kestrova/seq.site_conn"] = "Connection OK\n";
    appliance.files["/opt/kestrova/config/nis.config"] = "NIS Address: " + std::string(30, 'n');
}

Journey randomJourney(Random &random) {
    Journey journey;
    for (int k = 0; k < actionsPerJourney; ++k) {
        const char what =
            oneOf<char>(random, {'u', 'd', 'd', 'e', 'e', 'e', 'x', 'w', 'g', 's', 'c', 'B'});
        journey.push_back({what, oneOf<int>(random, {1, 1, 1, 2, 5, 6, 7, 30})});
    }
    return journey;
}

std::string rowZero() {
    return Operator::sees().substr(0, Operator::sees().find('|'));
}

bool isStatusPage() {
    const std::string row = rowZero();
    return row.empty() || row.rfind("Kestrova", 0) == 0 || row == "Hostname:" ||
           row == "Connected to:" || row == "undefined" || row.find(" (") != std::string::npos;
}

bool isEditor() {
    return rowZero().rfind("Enter ", 0) == 0 || rowZero() == "DNS Server Addr:";
}

bool isApplyScreen() {
    return rowZero() == "ESC   - Cancel" ||
           Operator::sees().find("> Apply Changes") != std::string::npos;
}

class Watch {
  public:
    explicit Watch(long long *turnCount) : turns(turnCount) {
        world().onText = [this](const std::string &text) { note(text); };
    }

    // One turn with this key down, or with an answer that is none.
    void poll(KeyCode key, const std::string &garbled = "") {
        const bool mayApply = isApplyScreen() && key == keyEnter;
        const long long before = world().microseconds;
        world().events.clear();
        world().sent.clear();
        noted = 0;
        garbled.empty() ? person.poll(key) : person.answer(garbled);
        ++*turns;
        const bool hasApplied =
            !world().commands("run " + applyScript).empty() || !world().commands("start ").empty();
        EXPECT_TRUE(mayApply || !hasApplied) << "applied unasked";
        EXPECT_EQ(Operator::cursor() != "off", isEditor()) << "the cursor at " << Operator::sees();
        EXPECT_EQ(world().sent.compare(0, 4, std::string("\xFE\0\xFE\x06", 4)), 0)
            << "asked no key";
        EXPECT_LE(world().microseconds - before, 3'600'000) << "stopped answering";
        EXPECT_EQ(world().display.unknownCommands(), 0U);
        for (const int row : {0, 1})
            EXPECT_EQ(world().display.wholeRow(row), rows.at(static_cast<std::size_t>(row)));
    }

    void act(const Action &action) {
        static const std::map<char, KeyCode> keys = {
            {'u', keyUp}, {'d', keyDown}, {'e', keyEnter}, {'x', keyEscape}, {'w', keyNone}};
        const auto interrupt = [] { raise(SIGUSR1); };
        if (action.what == 'g')
            poll(keyNone, std::string(static_cast<std::size_t>(action.amount), '\xB8'));
        if (action.what == 's')
            world().duringPoll = interrupt;
        if (action.what == 'c')
            world().duringCommand = interrupt;
        if (action.what == 'B')
            goBack();
        if (keys.count(action.what) == 0)
            return;
        for (int k = 0; k < action.amount; ++k)
            poll(keys.at(action.what));
        if (action.amount != 7)
            poll(keyNone); // else the next key follows without a release
    }

    // From the deepest screen, or from the end of the longest name.
    void goBack() {
        for (int k = 0; k < 60; ++k) {
            poll(keyEscape);
            poll(keyNone);
        }
        EXPECT_TRUE(isStatusPage()) << "Escape leads to " << Operator::sees();
    }

  private:
    // Keeps by itself what was written where since the panel was last cleared.
    void note(const std::string &text) {
        if (world().sent.find("\xFE\x01", noted) != std::string::npos)
            rows = blankRows;
        noted = world().sent.length();
        const auto column = static_cast<std::size_t>(world().display.cursorColumn());
        ASSERT_LE(column + text.length(), 40U) << "runs past: " << text;
        rows.at(static_cast<std::size_t>(world().display.cursorRow()))
            .replace(column, text.length(), text);
    }

    const std::array<std::string, 2> blankRows = {std::string(40, ' '), std::string(40, ' ')};
    std::array<std::string, 2> rows = blankRows;
    std::size_t noted = 0; // how much of what was sent
    Operator person;
    long long *turns;
};

std::size_t openDescriptors() {
    const std::filesystem::directory_iterator entries("/proc/self/fd");
    return static_cast<std::size_t>(std::distance(begin(entries), end(entries)));
}

// True when everything held. The program is a new one in a process of its own.
bool holds(unsigned seed, const Journey &journey, long long *turns, bool silent) {
    std::cout.flush();
    const pid_t child = fork();
    if (child == 0) {
        if (silent && freopen("/dev/null", "w", stdout) == nullptr)
            _exit(2);
        Random random(seed);
        setUpAppliance(random);
        const std::size_t before = openDescriptors();
        Watch watch(turns);
        for (const Action &action : journey) {
            watch.act(action);
            if (testing::Test::HasFailure())
                break;
        }
        EXPECT_EQ(openDescriptors(), before);
        std::cout.flush();
        _exit(testing::Test::HasFailure() ? 1 : 0);
    }
    int status = 0;
    waitpid(child, &status, 0);
    return status == 0;
}

// Leaves out whatever can be left out with the fault still showing, in ever smaller pieces.
Journey shortest(unsigned seed, Journey journey, long long *turns) {
    for (std::size_t piece = journey.size() / 2; piece > 0; piece /= 2) {
        for (std::size_t at = 0; at < journey.size();) {
            Journey rest(journey.begin(), journey.begin() + static_cast<long>(at));
            const std::size_t after = std::min(at + piece, journey.size());
            rest.insert(rest.end(), journey.begin() + static_cast<long>(after), journey.end());
            if (holds(seed, rest, turns, true)) {
                at += piece;
            } else {
                journey = rest;
            }
        }
    }
    return journey;
}

} // namespace

TEST(RandomOperator, FindsNoScreenThatBreaksItsPromises) {
    auto *turns = static_cast<long long *>(mmap(nullptr, sizeof(long long), PROT_READ | PROT_WRITE,
                                                MAP_SHARED | MAP_ANONYMOUS, -1, 0));
    for (unsigned seed = 1; seed <= journeys; ++seed) {
        Random random(seed + journeys);
        const Journey journey = randomJourney(random);
        if (holds(seed, journey, turns, true))
            continue;
        std::string steps;
        const Journey cut = shortest(seed, journey, turns);
        for (const Action &action : cut)
            steps += action.what + std::to_string(action.amount) + " ";
        holds(seed, cut, turns, false);
        FAIL() << "seed " << seed << ", shortest journey: " << steps;
    }
    EXPECT_GE(*turns, leastTurns);
    std::cout << *turns << " turns\n";
}
