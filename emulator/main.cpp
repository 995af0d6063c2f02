#include "Emulator.h"
#include "Options.h"

#include <fstream>
#include <iostream>

namespace {

constexpr int exitFailed = 1;
constexpr int exitUsage = 2;

int complain(int status, const std::string &message) {
    std::cerr << "panel-emulator: " << message;
    if (message.back() != '\n')
        std::cerr << '\n'; // a picture at its end brings its own
    return status;
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
    emulator::Options options;
    std::optional<emulator::Journey> journey;
    try {
        options = emulator::Options::parse(argc, argv);
        if (options.help) {
            std::cout << emulator::Options::helpText();
            return EXIT_SUCCESS;
        }
        if (options.journey)
            journey = readJourney(*options.journey);
        else if (!isatty(STDIN_FILENO) || !isatty(STDOUT_FILENO))
            throw std::invalid_argument("not on a terminal: give a --journey");
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
