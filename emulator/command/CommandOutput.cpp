#include "emulator/command/CommandOutput.h"

#include <array>
#include <cerrno>
#include <fcntl.h>
#include <system_error>
#include <unistd.h>
#include <utility>

namespace emulator {

namespace {

constexpr std::size_t longestLine = 1000; // characters
constexpr std::size_t mostLines = 20;
constexpr std::size_t mostKnownLines = 1000;

} // namespace

FileDescriptor CommandOutput::open() {
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0)
        throw std::system_error(errno, std::generic_category(), "cannot open a pipe");
    arrivals.reset();
    pipe = FileDescriptor(ends[0]);
    line.clear();
    lines.clear();
    timesSeen.clear();
    fcntl(pipe.get(), F_SETFL, O_NONBLOCK);
    arrivals = std::make_unique<Readable>(loop, pipe.get(), [this] { read(); });
    return FileDescriptor(ends[1]);
}

std::string CommandOutput::lastWords() {
    if (arrivals)
        read();
    takeLine();
    std::string words;
    for (const std::string &each : lines) {
        if (timesSeen[each] <= 1) // 0 if it came when no more lines were counted
            words += each + "\n";
    }
    return words;
}

void CommandOutput::read() {
    std::array<char, 4096> bytes{};
    ssize_t count = 0;
    while ((count = ::read(pipe.get(), bytes.data(), bytes.size())) > 0) {
        for (ssize_t i = 0; i < count; i++) {
            const char byte = bytes.at(static_cast<std::size_t>(i));
            if (byte == '\n' || line.size() == longestLine)
                takeLine();
            if (byte != '\n')
                line += byte;
        }
    }
    if (count == 0)
        arrivals.reset();
}

void CommandOutput::takeLine() {
    if (line.empty())
        return;
    if (timesSeen.size() < mostKnownLines || timesSeen.count(line) != 0)
        timesSeen[line]++;
    lines.push_back(std::exchange(line, ""));
    if (lines.size() > mostLines)
        lines.pop_front();
}

} // namespace emulator
