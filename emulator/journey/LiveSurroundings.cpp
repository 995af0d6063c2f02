#include "emulator/journey/LiveSurroundings.h"

#include <filesystem>
#include <stdexcept>

namespace emulator {

void LiveSurroundings::start(const step::Run &run) {
    process = std::make_unique<ChildProcess>(
        loop, std::vector<std::string>{"/bin/sh", "-c", run.command});
}

void LiveSurroundings::start(const step::Appliance &appliance) {
    if (std::filesystem::weakly_canonical(program).filename() != "kestrova-panel-box")
        throw std::runtime_error("this step needs the box, in which the appliance is: start the "
                                 "program with kestrova-panel-box");
    std::vector<std::string> command{program, "--enter", pid, "--", "appliance"};
    command.insert(command.end(), appliance.words.begin(), appliance.words.end());
    process = std::make_unique<ChildProcess>(loop, command);
}

std::optional<int> LiveSurroundings::status() {
    const std::optional<int> status = process->status();
    if (status)
        process.reset();
    return status;
}

std::string LiveSurroundings::act(const TestAction &) {
    return "this can be played in tests only"; // never: such a step is refused when it is read
}

} // namespace emulator
