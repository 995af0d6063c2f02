#include "emulator/line/Line.h"

#include "emulator/base/Number.h"
#include "emulator/line/lineByteTime.h"

#include <fcntl.h>
#include <poll.h>
#include <termios.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <system_error>

namespace emulator {

namespace {

constexpr std::size_t backlogBytes = 4096;

// How often to check whether the program has read an answer. It asks again 0.1 s later at the
// earliest; a check that comes too late makes a tap one poll longer.
constexpr std::chrono::milliseconds answerLook{10};

[[noreturn]] void fail(const std::string &what) {
    throw std::system_error(errno, std::generic_category(), what);
}

} // namespace

Line::Line(bool fast, const std::optional<std::string> &tracePath)
    : master(posix_openpt(O_RDWR | O_NOCTTY | O_NONBLOCK | O_CLOEXEC)),
      byteTime(fast ? Clock::duration::zero() : lineByteTime) {
    if (master.get() < 0 || grantpt(master.get()) != 0 || unlockpt(master.get()) != 0)
        fail("cannot open a pseudo-terminal");
    std::array<char, 128> name{};
    if (const int error = ptsname_r(master.get(), name.data(), name.size()); error != 0) {
        errno = error;
        fail("cannot name the pseudo-terminal");
    }
    slavePath = name.data();
    slave = FileDescriptor(open(name.data(), O_RDWR | O_NOCTTY | O_CLOEXEC));
    termios settings{};
    if (slave.get() < 0 || tcgetattr(slave.get(), &settings) != 0)
        fail("cannot open " + slavePath);
    cfmakeraw(&settings);
    // Both directions are set, because stty fails if the other one is left at another speed.
    cfsetispeed(&settings, B2400);
    cfsetospeed(&settings, B2400);
    if (tcsetattr(slave.get(), TCSANOW, &settings) != 0)
        fail("cannot set " + slavePath);
    if (tracePath)
        traceFile.emplace(*tracePath);
}

int Line::descriptor() const {
    return backlog.size() < backlogBytes ? master.get() : -1;
}

void Line::collect() {
    std::array<unsigned char, 512> bytes{};
    while (backlog.size() < backlogBytes) {
        const std::size_t room = std::min(bytes.size(), backlogBytes - backlog.size());
        const ssize_t count = read(master.get(), bytes.data(), room);
        if (count <= 0)
            break;
        const TimePoint now = Clock::now();
        trace('<', now, bytes.data(), static_cast<std::size_t>(count));
        for (ssize_t i = 0; i < count; i++)
            backlog.push_back({bytes.at(static_cast<std::size_t>(i)), now, answersRead});
    }
    lookedAt = Clock::now();
    // Looked at only now that everything older is in: what arrives from here on was sent after
    // the program had read the answer. Polling the slave, unlike asking for its byte count, also
    // sees an answer that the kernel is still passing on.
    if (answersRead != answersWritten && backlog.size() < backlogBytes) {
        pollfd unread{slave.get(), POLLIN, 0};
        const bool nothing = poll(&unread, 1, 0) == 0;
        // A line that has hung up has forgotten what was unread, and this end has to be opened
        // anew.
        const bool hungUp = (unread.revents & POLLHUP) != 0;
        if (hungUp)
            slave = FileDescriptor(open(slavePath.c_str(), O_RDWR | O_NOCTTY | O_CLOEXEC));
        if (nothing || hungUp)
            answersRead = answersWritten;
    }
}

std::optional<Line::Byte> Line::next(TimePoint now) {
    if (backlog.empty())
        return std::nullopt;
    const Arrival first = backlog.front();
    const TimePoint due = std::max(carriedUntil, first.time) + byteTime;
    if (now < due)
        return std::nullopt;
    carriedUntil = due;
    backlog.pop_front();
    return Byte{first.value, first.answersRead == answersWritten};
}

std::optional<TimePoint> Line::wakeAt() const {
    std::optional<TimePoint> wake;
    if (!backlog.empty())
        wake = std::max(carriedUntil, backlog.front().time) + byteTime;
    if (answersRead != answersWritten)
        wake = std::min(wake.value_or(TimePoint::max()), lookedAt + answerLook);
    return wake;
}

void Line::answer(unsigned char keyCode) {
    constexpr unsigned char firstByte = 0xFD;
    const std::array<unsigned char, 2> bytes{firstByte, keyCode};
    const TimePoint now = Clock::now();
    const ssize_t written = write(master.get(), bytes.data(), bytes.size());
    if (written != static_cast<ssize_t>(bytes.size()))
        return;
    trace('>', now, bytes.data(), bytes.size());
    answersWritten++;
    lookedAt = now;
}

void Line::clear() {
    tcflush(slave.get(), TCIOFLUSH);
    do {
        backlog.clear();
        collect();
    } while (!backlog.empty());
    answersRead = answersWritten;
}

void Line::trace(char direction, TimePoint time, const unsigned char *bytes, std::size_t count) {
    if (!traceFile)
        return;
    const std::chrono::nanoseconds sinceStart = time.time_since_epoch();
    *traceFile << sinceStart.count() << ' ' << direction;
    for (std::size_t i = 0; i < count; i++)
        *traceFile << ' ' << hexadecimal(bytes[i]);
    *traceFile << '\n' << std::flush;
}

void Line::finishTrace() {
    if (traceFile)
        traceFile->finish("the trace");
}

} // namespace emulator
