#include "runtime/runCommand.h"

#include <array>
#include <cstdio>
#include <cstdlib>

namespace {

constexpr std::size_t readBufferSize = 256; // bytes

std::string captureOutput(const char *command) {
    FILE *pipe = popen(command, "r");
    if (pipe == nullptr)
        return "ERROR";

    std::string output;
    std::array<char, readBufferSize> buffer{};
    while (!feof(pipe)) {
        if (fgets(buffer.data(), buffer.size(), pipe) != nullptr)
            output += buffer.data();
    }
    pclose(pipe);
    return output;
}

// The command substitution makes a shell in the background wait for the command, so that the panel
// does not have to.
void startInBackground(const char *command) {
    const std::string line = std::string("`") + command + "` &";
    [[maybe_unused]] const int status = system(line.c_str());
}

} // namespace

std::string runCommand(const char *command, bool capture) {
    if (capture)
        return captureOutput(command);
    startInBackground(command);
    return "";
}
