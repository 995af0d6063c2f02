#include "emulator/Emulator.h"
#include "emulator/Options.h"

#include <fcntl.h>
#include <fstream>
#include <iostream>
#include <unistd.h>

namespace {

constexpr int exitFailed = 1;
constexpr int exitUsage = 2;

// A message may quote what somebody else has written, which must not control the terminal.
int complain(int status, const std::string &message) {
    std::cerr << "panel-emulator: ";
    for (const char c : message)
        std::cerr << (static_cast<unsigned char>(c) < ' ' && c != '\n' ? '?' : c);
    if (message.back() != '\n')
        std::cerr << '\n'; // a picture at the end of a message has its own
    return status;
}

// The pseudo-terminal must not become one of the standard descriptors. Those that are closed are
// taken by something that can be neither written nor read, just like a closed one.
void occupyStandardDescriptors() {
    int taken = 0;
    while (taken <= STDERR_FILENO && taken >= 0)
        taken = open("/dev/null", O_PATH);
    if (taken > STDERR_FILENO)
        close(taken);
}

emulator::Journey readJourney(const std::string &path) {
    if (path == "-")
        return {std::cin, "standard input"};
    std::ifstream file(path);
    if (!file)
        throw std::invalid_argument("cannot read " + path);
    return {file, path};
}

} // namespace

int main(int argc, char **argv) {
    occupyStandardDescriptors();
    emulator::Options options;
    std::optional<emulator::Journey> journey;
    try {
        options = emulator::Options::parse(argc, argv);
        if (options.help) {
            std::cout << emulator::Options::helpText() << std::flush;
            return std::cout ? EXIT_SUCCESS
                             : complain(exitFailed, "cannot write to standard output");
        }
        if (options.journey)
            journey = readJourney(*options.journey);
        if (options.isDrawn() && (!isatty(STDIN_FILENO) || !isatty(STDOUT_FILENO)))
            throw std::invalid_argument(journey
                                            ? "--show needs a terminal to draw on"
                                            : "this is not a terminal: give --journey or --web");
        if (options.pictures)
            std::filesystem::create_directories(*options.pictures);
    } catch (const std::exception &error) {
        return complain(exitUsage, error.what());
    }
    try {
        return emulator::Emulator(options, std::move(journey)).run();
    } catch (const std::exception &error) {
        return complain(exitFailed, error.what());
    }
}
