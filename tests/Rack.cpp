#include "Rack.h"

#include "emulator/base/FileDescriptor.h"
#include "emulator/panel/Picture.h"

#include <boost/algorithm/string/erase.hpp>
#include <boost/algorithm/string/trim.hpp>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <iomanip>
#include <sstream>
#include <sys/mman.h>
#include <unistd.h>

using namespace emulator;
using namespace std::chrono_literals;

namespace {

constexpr std::chrono::seconds usualLimit{10};
constexpr Micros commandTime = 5ms;
// The longest pause is 3 s; a poll, the turn's own pause, and the commands of a page come on top.
constexpr Micros longestTurn = 3'700ms;
constexpr std::size_t hiddenByAWipe = 24; // blanks past the visible columns

// The titles of the editors are built alike.
bool isEditor() {
    const std::string title = boost::trim_right_copy(world().display.visibleRow(0));
    return boost::starts_with(title, "Enter ") || boost::ends_with(title, " Addr:");
}

bool isApplyScreen() {
    const Sight confirmation{"ESC   - Cancel  ", "ENTER - Apply   ", {}, {}};
    const Sight lastItem{{}, {}, {}, "Apply Changes"};
    return confirmation.isShownBy(world().display) || lastItem.isShownBy(world().display);
}

/// What one start of the program hands over to the next.
struct Passage {
    std::size_t position = 0; // in the journey
    Micros::rep now = world().now.count();
    long long turns = 0;
    bool isOver = false;
    bool isInScene = false;
    Appliance appliance = Appliance::delivered();

    void write(std::ostream &out) const {
        out << position << ' ' << now << ' ' << turns << ' ' << isOver << ' ' << isInScene;
        for (const auto &[name, value] : appliance.facts)
            out << std::quoted(name) << std::quoted(value);
    }
    void read(std::istream &in) {
        in >> position >> now >> turns >> isOver >> isInScene;
        appliance.facts.clear();
        for (std::string name; in >> std::quoted(name);)
            in >> std::quoted(appliance.facts[name]);
    }
};

/// Thrown out of the program when it is to be started afresh, or is no longer needed.
struct ProgramEnds {};

class Rack : public Surroundings {
  public:
    Rack(const Journey &itsJourney, Passage &itsPassage, const std::string &pictures)
        : journey(itsJourney), passage(itsPassage),
          player(journey, {world().display, world().keypad}, *this, said, usualLimit,
                 pictures.empty() ? std::nullopt : std::optional(pictures)) {}

    void start(const step::Run &) override {
        throw std::runtime_error("a test runs no commands of the machine's own");
    }

    /// Runs the program until the journey is over or goes on with another start of it.
    void run() {
        World &w = world();
        w.appliance = passage.appliance;
        w.now = Micros(passage.now);
        setUp();
        player.goTo(passage.position);
        w.commandTime = commandTime;
        w.look = [this] { look(); };
        w.wakeAt = [&] {
            const auto wake = std::chrono::ceil<Micros>(player.wakeAt().time_since_epoch());
            return std::max(w.now, std::min(wake, hostnameScriptEnds));
        };
        try {
            MainLoop loop(MainMenu::instance, MainMenu::requestRefresh);
            for (;; passage.turns++)
                loop.turn();
        } catch (const ProgramEnds &) {
        } catch (const std::exception &error) {
            ADD_FAILURE() << error.what();
        }
        passage.appliance = w.appliance;
        passage.now = w.now.count();
    }

    void look() {
        World &w = world();
        if (testing::Test::HasFailure())
            throw ProgramEnds{};
        if (w.keypad.requests() != requestsSeen)
            noteRequest();
        if (w.now >= hostnameScriptEnds) {
            hostnameScriptEnds = Micros::max();
            if (w.appliance.runScript(hostnameScript) == 0)
                startAfresh(player.position());
        }
        if (player.advance(TimePoint(w.now))) {
            endScene();
            passage.isOver = true;
            throw ProgramEnds{};
        }
        if (w.keypad.answered() != answersSeen) {
            answersSeen = w.keypad.answered();
            if (std::exchange(keyStep, player.position()) != player.position())
                w.sent.clear();
        }
        if (w.runs.size() != runsSeen)
            noteRun();
    }

    void start(const step::Appliance &appliance) override {
        isDone = [] { return true; };
        if (appliance.words[0] == "reboot")
            startAfresh(player.position() + 1);
        if (appliance.words[0] == "refresh")
            world().hasSignalled = raise(SIGUSR1) == 0;
        else
            world().appliance.act(appliance.words);
    }

    std::optional<int> status() override {
        return isDone() ? std::optional<int>(EXIT_SUCCESS) : std::nullopt;
    }

    std::string act(const TestAction &action) override {
        isDone = [] { return true; };
        std::visit([this](const auto &step) { begin(step); }, action);
        return "";
    }

  private:
    // The state of the appliance before the program starts.
    void setUp() {
        const auto &steps = journey.steps();
        for (; passage.position < steps.size(); passage.position++) {
            const Action &action = steps[passage.position].action;
            const auto *inTest = std::get_if<TestAction>(&action);
            if (const auto *verb = std::get_if<step::Appliance>(&action)) {
                if (verb->words[0] != "reboot" && verb->words[0] != "refresh")
                    start(*verb);
            } else if (inTest != nullptr && std::holds_alternative<step::Scene>(*inTest)) {
                world().appliance = Appliance::delivered();
                passage.isInScene = true;
            } else if (inTest != nullptr && std::holds_alternative<step::Prints>(*inTest)) {
                act(*inTest);
            } else {
                break;
            }
        }
    }

    // The program has finished drawing and asks for the next key.
    void noteRequest() {
        World &w = world();
        requestsSeen = w.keypad.requests();
        check(w.display.cursorBlinking() == isEditor(), "the cursor blinks just where one edits");
        check(w.display.unknownCommands() == 0, "the panel knows no such command");
        check(w.overruns == 0, "a text runs past the end of its row");
        check(w.now - std::min(lastRequest, w.now) <= longestTurn,
              "it did not ask for keys so long");
        lastRequest = w.now;
        mayApply = isApplyScreen();
        w.events.clear();
        w.writes.clear();
    }

    void check(bool holds, const std::string &complaint) {
        if (!holds)
            throw std::runtime_error(journey.place(journey.steps()[player.position()]) + complaint +
                                     "\nshown:\n" + Picture(world().display).text());
    }

    void noteRun() {
        World &w = world();
        const char enter = static_cast<char>(traits(Key::enter).code);
        check(mayApply && w.lastRead.find(enter) == 1, "this was applied unasked");
        mayApply = false;
        lastRequest = Micros::max(); // nobody knows how long the script takes
        runsSeen++;
        const std::string &command = w.runs.back().what;
        if (boost::starts_with(command, "`")) {
            hostnameScript = scriptArguments(command);
            hostnameScriptEnds = w.now + w.appliance.scriptTime();
        }
    }

    // A scene has to expect everything that the program has done in the meantime.
    void endScene() {
        const World &w = world();
        if (!passage.isInScene)
            return;
        EXPECT_EQ(w.runs.size(), runsExpected) << "also ran " << w.runs.back().what;
        EXPECT_EQ(w.pauses.size(), pausesExpected) << "also paused behind\n"
                                                   << Picture(w.pauses.back().display).text();
        EXPECT_EQ(w.display.hiddenCharacters() % hiddenByAWipe, 0U) << "only a wiped name's blanks";
    }

    [[noreturn]] void startAfresh(std::size_t position) {
        endScene();
        passage.position = position;
        throw ProgramEnds{};
    }

    void begin(const step::Scene &) { startAfresh(player.position()); }

    void begin(const step::Prints &prints) {
        world().appliance.act({"prints", prints.command, prints.output});
    }

    // The turn is over when the program asks for the next key, because it has then drawn its
    // reaction.
    void begin(const step::Answer &answer) {
        world().unread += answer.bytes;
        isDone = [reads = world().reads, requests = 0UL]() mutable {
            if (world().reads == reads)
                requests = world().keypad.requests();
            return world().keypad.requests() != requests;
        };
    }

    void begin(const step::ExpectSent &expected) {
        const std::string keyRequest("\xFE\0\xFE\x06", 4);
        const std::string sent = boost::erase_all_copy(world().sent, keyRequest);
        if (sent != expected.bytes)
            isDone = [sent, expected]() -> bool {
                throw std::runtime_error("wanted: " + testing::PrintToString(expected.bytes) +
                                         "\nsent:   " + testing::PrintToString(sent) + "\n");
            };
    }

    void begin(const step::ExpectPause &expected) {
        const std::string time = std::to_string(expected.time / 1ms) + " ms";
        awaitNext(world().pauses, pausesExpected, time, expected.sight);
    }

    void begin(const step::ExpectRun &expected) {
        awaitNext(world().runs, runsExpected, expected.command, expected.sight);
    }

    void awaitNext(const std::vector<World::Deed> &deeds, std::size_t &next,
                   const std::string &what, const Sight &sight) {
        isDone = [&deeds, &next, what, sight] {
            if (deeds.size() == next)
                return false;
            const World::Deed &deed = deeds[next++];
            if (deed.what != what || !sight.isShownBy(deed.display))
                throw std::runtime_error("wanted: " + what + " behind\n" + sight.text() +
                                         "it was: " + deed.what + " behind\n" +
                                         Picture(deed.display).text());
            return true;
        };
    }

    const Journey &journey;
    Passage &passage;
    std::ostringstream said; // pictures and words, which nobody reads
    JourneyPlayer player;
    std::function<bool()> isDone = [] { return true; }; // the test's step that was begun
    Appliance::Words hostnameScript;                    // at work in the background, until then:
    Micros hostnameScriptEnds = Micros::max();
    std::size_t runsSeen = 0, runsExpected = 0, pausesExpected = 0; // so many of the world's
    std::size_t keyStep = std::string::npos; // the journey's last that pressed a key
    unsigned long answersSeen = 0, requestsSeen = 0;
    Micros lastRequest = Micros::max();
    bool mayApply = false;
};

std::size_t openDescriptors() {
    const std::filesystem::directory_iterator entries("/proc/self/fd");
    return static_cast<std::size_t>(std::distance(begin(entries), end(entries)));
}

} // namespace

Outcome play(const Journey &journey, bool silently, const std::string &pictures) {
    const FileDescriptor shared(memfd_create("passage", 0));
    const std::string file = "/proc/self/fd/" + std::to_string(shared.get());
    Passage passage;
    bool holds = true;
    while (holds && !passage.isOver) {
        holds = holdsInFreshProgram([&] {
            if (silently && freopen("/dev/null", "w", stdout) == nullptr)
                abort();
            const std::size_t before = openDescriptors();
            Rack(journey, passage, pictures).run();
            EXPECT_EQ(openDescriptors(), before);
            std::ofstream output(file);
            passage.write(output);
        });
        std::ifstream input(file);
        passage.read(input);
    }
    return {holds, passage.turns};
}

Journey readJourney(const std::string &text, const std::string &name) {
    std::istringstream input(text);
    return {input, name, Stage::test};
}
