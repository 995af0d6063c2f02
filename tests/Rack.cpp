#include "Rack.h"

#include "emulator/FileDescriptor.h"
#include "emulator/StepTable.h"

#include <csignal>
#include <filesystem>
#include <iomanip>
#include <sstream>
#include <sys/mman.h>
#include <unistd.h>

using namespace emulator;
using namespace std::chrono_literals;

namespace {

constexpr std::chrono::seconds usualLimit{10};
constexpr Micros commandTime = 5ms;
// The longest pause is 3 s; around it a poll, the turn's own pause, and the commands of a page.
constexpr Micros longestTurn = 3'700ms;
constexpr std::size_t hiddenByAWipe = 24; // blanks past the visible columns

std::string hex(const std::string &bytes) {
    std::ostringstream text;
    for (const char byte : bytes)
        text << " " << std::uppercase << std::hex << std::setfill('0') << std::setw(2)
             << int{static_cast<unsigned char>(byte)};
    return text.str();
}

std::string withoutKeyRequests(std::string bytes) {
    const std::string request("\xFE\0\xFE\x06", 4);
    for (std::size_t at = 0; (at = bytes.find(request, at)) != std::string::npos;)
        bytes.erase(at, request.length());
    return bytes;
}

std::string trimmed(std::string row) {
    return row.erase(row.find_last_not_of(' ') + 1);
}

std::string rowsOf(const Sight &sight) {
    return trimmed(sight.row0) + "|" + trimmed(sight.row1.value_or(""));
}

bool isEditor() {
    const std::string row = world().display.visibleRow(0);
    return startsWith(row, "Enter ") || startsWith(row, "DNS Server Addr:");
}

bool isApplyScreen() {
    return startsWith(world().shown(), "ESC   - Cancel") ||
           world().shown().find("> Apply Changes") != std::string::npos;
}

std::string stepsWithCursor(const Display &display, bool blinking) {
    return "expect " + emulator::quoted(trimmed(display.visibleRow(0))) + " " +
           emulator::quoted(trimmed(display.visibleRow(1))) + "\nexpect-cursor " +
           std::to_string(display.cursorRow()) + " " + std::to_string(display.cursorColumn()) +
           (blinking ? " on\n" : " off\n");
}

/// What passes from one start of the program to the next, and to whoever started the journey.
struct Passage {
    struct Plain {
        std::size_t position = 0; // in the journey
        Micros now = world().now;
        long long turns = 0;
        bool isOver = false;
        bool isInScene = false;
    } plain;
    Appliance appliance = Appliance::delivered();
    std::string lastSteps;

    void write(int file) const {
        std::ostringstream text;
        text.write(reinterpret_cast<const char *>(&plain), sizeof plain);
        text << appliance << lastSteps;
        if (::write(file, text.str().data(), text.str().size()) < 0)
            abort();
    }
    void read(int file) {
        std::string bytes(static_cast<std::size_t>(lseek(file, 0, SEEK_END)), ' ');
        if (pread(file, bytes.data(), bytes.size(), 0) <= 0)
            return; // it has crashed
        std::istringstream text(bytes);
        text.read(reinterpret_cast<char *>(&plain), sizeof plain);
        text >> appliance;
        lastSteps.assign(std::istreambuf_iterator<char>(text.ignore()), {});
    }
};

/// Thrown out of the program when it is to be started afresh, or is no longer needed.
struct ProgramEnds {};

class Rack : public Surroundings, public Onlooker {
  public:
    Rack(const Journey &itsJourney, Passage &itsPassage, const std::string &pictures)
        : journey(itsJourney), passage(itsPassage),
          player(journey, {world().display, world().keypad}, *this, said, usualLimit,
                 pictures.empty() ? std::nullopt : std::optional(pictures)) {}

    /// Runs the program until the journey is over or goes on with another start of it.
    void run();

    void look() override;
    Micros wakeAt() const override;

    void start(const step::Run &) override {
        throw std::runtime_error("a test runs no commands of the machine's own");
    }
    void start(const step::Appliance &appliance) override;
    std::optional<int> status() override;
    std::string act(const TestAction &action) override;

  private:
    void setUp();
    void noteRequest();
    void noteRun();
    void check(bool holds, const std::string &complaint);
    void endScene();
    [[noreturn]] void startAfresh(std::size_t position);

    std::string begin(const step::Scene &);
    std::string begin(const step::Prints &prints);
    std::string begin(const step::Answer &answer);
    std::string begin(const step::ExpectSent &expected);
    std::string begin(const step::ExpectPause &expected);
    std::string begin(const step::ExpectRun &expected);
    void awaitNext(const std::vector<World::Deed> &deeds, std::size_t &next,
                   const World::Deed &wanted);

    const Journey &journey;
    Passage &passage;
    std::ostringstream said; // pictures and words, for nobody
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

// What stands before the program's start: the appliance's state.
void Rack::setUp() {
    const auto &steps = journey.steps();
    for (; passage.plain.position < steps.size(); passage.plain.position++) {
        const Action &action = steps[passage.plain.position].action;
        const auto *inTest = std::get_if<TestAction>(&action);
        if (const auto *verb = std::get_if<step::Appliance>(&action)) {
            if (verb->words[0] != "reboot" && verb->words[0] != "refresh")
                start(*verb);
        } else if (inTest != nullptr && std::holds_alternative<step::Scene>(*inTest)) {
            world().appliance = Appliance::delivered();
            passage.plain.isInScene = true;
        } else if (inTest != nullptr && std::holds_alternative<step::Prints>(*inTest)) {
            act(*inTest);
        } else {
            break;
        }
    }
}

void Rack::run() {
    World &w = world();
    w.appliance = passage.appliance;
    w.now = passage.plain.now;
    setUp();
    player.goTo(passage.plain.position);
    w.commandTime = commandTime;
    w.onlooker = this;
    try {
        MainLoop loop(MainMenu::instance, MainMenu::requestRefresh);
        for (;; passage.plain.turns++)
            loop.turn();
    } catch (const ProgramEnds &) {
    } catch (const std::runtime_error &error) {
        ADD_FAILURE() << error.what();
    }
    passage.appliance = w.appliance;
    passage.plain.now = w.now;
}

void Rack::look() {
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
        passage.plain.isOver = true;
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

Micros Rack::wakeAt() const {
    const auto wake = std::chrono::ceil<Micros>(player.wakeAt().time_since_epoch());
    return std::max(world().now, std::min(wake, hostnameScriptEnds));
}

// The program has drawn what it had to, and asks for the next key.
void Rack::noteRequest() {
    World &w = world();
    requestsSeen = w.keypad.requests();
    const bool isCursorWrong = w.display.cursorBlinking() != isEditor();
    if (isCursorWrong)
        passage.lastSteps = stepsWithCursor(w.display, isEditor());
    check(!isCursorWrong, "the cursor blinks just where one edits");
    check(w.display.unknownCommands() == 0, "the panel knows no such command");
    check(w.overruns == 0, "a text runs past the end of its row");
    check(w.now - std::min(lastRequest, w.now) <= longestTurn, "it did not ask for keys so long");
    lastRequest = w.now;
    mayApply = isApplyScreen();
    w.events.clear();
    w.writes.clear();
}

void Rack::check(bool holds, const std::string &complaint) {
    if (!holds)
        throw std::runtime_error(journey.place(journey.steps()[player.position()]) + complaint +
                                 "\nshown:\n" + Picture(world().display).text());
}

void Rack::noteRun() {
    World &w = world();
    check(mayApply && w.keypad.lastAnswer() == Key::enter, "this was applied unasked");
    mayApply = false;
    lastRequest = Micros::max(); // nobody knows how long the script takes
    runsSeen++;
    const std::string &command = w.runs.back().what;
    if (startsWith(command, "`")) {
        hostnameScript = scriptArguments(command);
        hostnameScriptEnds = w.now + w.appliance.scriptTime(hostnameScript);
    }
}

// A scene says all that the program has done meanwhile.
void Rack::endScene() {
    const World &w = world();
    if (!passage.plain.isInScene)
        return;
    EXPECT_EQ(w.runs.size(), runsExpected) << "also ran " << w.runs.back().what;
    EXPECT_EQ(w.pauses.size(), pausesExpected) << "also paused behind " << w.pauses.back().behind;
    EXPECT_EQ(w.display.hiddenCharacters() % hiddenByAWipe, 0U) << "only a wiped name's blanks";
}

void Rack::startAfresh(std::size_t position) {
    endScene();
    passage.plain.position = position;
    throw ProgramEnds{};
}

void Rack::start(const step::Appliance &appliance) {
    isDone = [] { return true; };
    if (appliance.words[0] == "reboot")
        startAfresh(player.position() + 1);
    if (appliance.words[0] == "refresh")
        world().hasSignalled = raise(SIGUSR1) == 0;
    else
        world().appliance.act(appliance.words);
}

std::optional<int> Rack::status() {
    return isDone() ? std::optional<int>(EXIT_SUCCESS) : std::nullopt;
}

std::string Rack::act(const TestAction &action) {
    isDone = [] { return true; };
    return std::visit([this](const auto &step) { return begin(step); }, action);
}

std::string Rack::begin(const step::Scene &) {
    startAfresh(player.position());
}

std::string Rack::begin(const step::Prints &prints) {
    world().appliance.prints[prints.command] = prints.output;
    return "";
}

// Over when the program asks for the next key, and so has drawn what it made of this one.
std::string Rack::begin(const step::Answer &answer) {
    world().unread += answer.bytes;
    isDone = [reads = world().reads, requests = 0UL]() mutable {
        if (world().reads == reads)
            requests = world().keypad.requests();
        return world().keypad.requests() != requests;
    };
    return "";
}

std::string Rack::begin(const step::ExpectSent &expected) {
    const std::string sent = withoutKeyRequests(world().sent);
    return sent == expected.bytes ? "" : "wanted:" + hex(expected.bytes) + "\nsent:  " + hex(sent);
}

std::string Rack::begin(const step::ExpectPause &expected) {
    const std::string time = std::to_string(expected.time / 1ms) + " ms";
    awaitNext(world().pauses, pausesExpected, {time, rowsOf(expected.sight)});
    return "";
}

std::string Rack::begin(const step::ExpectRun &expected) {
    awaitNext(world().runs, runsExpected, {expected.command, rowsOf(expected.sight)});
    return "";
}

void Rack::awaitNext(const std::vector<World::Deed> &deeds, std::size_t &next,
                     const World::Deed &wanted) {
    isDone = [&deeds, &next, wanted] {
        if (deeds.size() == next)
            return false;
        const auto &[what, behind] = deeds[next++];
        if (what != wanted.what || behind != wanted.behind)
            throw std::runtime_error("it was " + what + " behind " + behind);
        return true;
    };
}

std::size_t openDescriptors() {
    const std::filesystem::directory_iterator entries("/proc/self/fd");
    return static_cast<std::size_t>(std::distance(begin(entries), end(entries)));
}

} // namespace

Outcome play(const Journey &journey, bool silently, const std::string &pictures) {
    Passage passage;
    bool holds = true;
    while (holds && !passage.plain.isOver) {
        const FileDescriptor shared(memfd_create("passage", 0));
        holds = holdsInFreshProgram([&] {
            if (silently && freopen("/dev/null", "w", stdout) == nullptr)
                abort();
            const std::size_t before = openDescriptors();
            Rack(journey, passage, pictures).run();
            EXPECT_EQ(openDescriptors(), before);
            passage.write(shared.get());
        });
        passage.read(shared.get());
    }
    return {holds, passage.plain.turns, passage.lastSteps};
}

Journey readJourney(const std::string &text, const std::string &name) {
    std::istringstream input(text);
    return {input, name, Stage::test};
}
