#include "emulator/Emulator.h"
#include "emulator/Options.h"
#include "emulator/base/complain.h"

#include <csignal>
#include <fcntl.h>
#include <fstream>
#include <iostream>
#include <unistd.h>

namespace {

constexpr int exitFailed = 1;
constexpr int exitUsage = 2;

// The pseudo-terminal must not become one of the standard descriptors. Those that are closed are
// taken by something that can be neither written nor read, just like a closed one.
void occupyStandardDescriptors() {
    int taken = 0;
    while (taken <= STDERR_FILENO && taken >= 0)
        taken = open("/dev/null", O_PATH);
    if (taken > STDERR_FILENO)
        close(taken);
}

// Whoever has started this program may have ignored or blocked signals that it relies on, such as
// the one that tells of the command's end. Output that nobody reads is to be noticed when it is
// written.
void resetSignals() {
    sigset_t none;
    sigemptyset(&none);
    sigprocmask(SIG_SETMASK, &none, nullptr);
    for (int number = 1; number < NSIG; number++)
        signal(number, number == SIGPIPE ? SIG_IGN : SIG_DFL);
}

emulator::Journey readJourney(const std::string &path) {
    if (path == "-")
        return {std::cin, "standard input"};
    std::ifstream file(path);
    if (!file)
        throw std::invalid_argument("cannot read " + path);
    return {file, path};
}

// Reads all that the emulator was asked to do, and returns its journey, if any. Throws if that is
// wrong; nothing has been changed by then.
std::optional<emulator::Journey> prepare(const emulator::Options &options) {
    options.checkFiles();
    std::optional<emulator::Journey> journey;
    if (options.journey)
        journey = readJourney(*options.journey);
    if (options.isDrawn() && (!isatty(STDIN_FILENO) || !isatty(STDOUT_FILENO)))
        throw std::invalid_argument(journey ? "--show needs a terminal to draw on"
                                            : "this is not a terminal: give --journey or --web");
    if (options.pictures)
        std::filesystem::create_directories(*options.pictures);
    return journey;
}

} // namespace

int main(int argc, char **argv) {
    occupyStandardDescriptors();
    resetSignals();
    int failed = exitUsage;
    try {
        const emulator::Options options = emulator::Options::parse(argc, argv);
        std::optional<emulator::Journey> journey;
        if (options.answer.empty())
            journey = prepare(options);
        failed = exitFailed;
        if (options.answer.empty())
            return emulator::Emulator(options, std::move(journey)).run();
        if (!(std::cout << options.answer << std::flush))
            throw std::runtime_error("cannot write to standard output");
        return EXIT_SUCCESS;
    } catch (const std::exception &error) {
        emulator::complain(error.what());
        return failed;
    }
}
