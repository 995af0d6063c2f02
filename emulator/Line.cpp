#include "Line.h"

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

// 2400 baud; a byte is a start bit, eight data bits and two stop bits.
constexpr std::chrono::nanoseconds bitTime{std::nano::den / 2400};
constexpr int bitsPerByte = 11;

constexpr std::size_t backlogBytes = 4096;

// How often to look whether the program has read an answer. It asks again 0.1 s after that at the
// earliest; a look that comes too late makes a tap one poll longer.
constexpr std::chrono::milliseconds answerLook{10};

[[noreturn]] void fail(const std::string &what) {
    throw std::system_error(errno, std::generic_category(), what);
}

} // namespace

Line::Line(bool fast, const std::optional<std::string> &tracePath)
    : master_(posix_openpt(O_RDWR | O_NOCTTY | O_NONBLOCK | O_CLOEXEC)),
      byteTime_(fast ? Clock::duration::zero() : bitTime * bitsPerByte) {
    if (master_.get() < 0 || grantpt(master_.get()) != 0 || unlockpt(master_.get()) != 0)
        fail("cannot open a pseudo-terminal");
    std::array<char, 128> name{};
    if (const int error = ptsname_r(master_.get(), name.data(), name.size()); error != 0) {
        errno = error;
        fail("cannot name the pseudo-terminal");
    }
    path_ = name.data();
    slave_ = FileDescriptor(open(name.data(), O_RDWR | O_NOCTTY | O_CLOEXEC));
    termios settings{};
    if (slave_.get() < 0 || tcgetattr(slave_.get(), &settings) != 0)
        fail("cannot open " + path_);
    cfmakeraw(&settings);
    // Both ways, because stty reports a failure while it leaves the other way at another speed.
    cfsetispeed(&settings, B2400);
    cfsetospeed(&settings, B2400);
    if (tcsetattr(slave_.get(), TCSANOW, &settings) != 0)
        fail("cannot set " + path_);
    if (tracePath) {
        trace_.open(*tracePath);
        if (!trace_)
            fail("cannot write " + *tracePath);
    }
}

int Line::descriptor() const {
    return backlog_.size() < backlogBytes ? master_.get() : -1;
}

void Line::collect() {
    std::array<unsigned char, 512> bytes{};
    while (backlog_.size() < backlogBytes) {
        const std::size_t room = std::min(bytes.size(), backlogBytes - backlog_.size());
        const ssize_t count = read(master_.get(), bytes.data(), room);
        if (count <= 0)
            break;
        const TimePoint now = Clock::now();
        trace('<', now, bytes.data(), static_cast<std::size_t>(count));
        for (ssize_t i = 0; i < count; i++)
            backlog_.push_back({bytes.at(static_cast<std::size_t>(i)), now, answersRead_});
    }
    lookedAt_ = Clock::now();
    // Looked at only now that everything older is in: what arrives from here on was sent after
    // the program had read the answer. Polling the slave, unlike asking for its byte count, also
    // sees an answer that the kernel is still passing on.
    if (answersRead_ != answersWritten_ && backlog_.size() < backlogBytes) {
        pollfd unread{slave_.get(), POLLIN, 0};
        const bool nothing = poll(&unread, 1, 0) == 0;
        // A line that was hung up has forgotten what was unread, and this end has to be opened
        // anew.
        const bool hungUp = (unread.revents & POLLHUP) != 0;
        if (hungUp)
            slave_ = FileDescriptor(open(path_.c_str(), O_RDWR | O_NOCTTY | O_CLOEXEC));
        if (nothing || hungUp)
            answersRead_ = answersWritten_;
    }
}

std::optional<Line::Byte> Line::next(TimePoint now) {
    if (backlog_.empty())
        return std::nullopt;
    const Arrival first = backlog_.front();
    const TimePoint due = std::max(carriedUntil_, first.time) + byteTime_;
    if (now < due)
        return std::nullopt;
    carriedUntil_ = due;
    backlog_.pop_front();
    return Byte{first.value, first.answersRead == answersWritten_};
}

std::optional<TimePoint> Line::wakeAt() const {
    std::optional<TimePoint> wake;
    if (!backlog_.empty())
        wake = std::max(carriedUntil_, backlog_.front().time) + byteTime_;
    if (answersRead_ != answersWritten_)
        wake = std::min(wake.value_or(TimePoint::max()), lookedAt_ + answerLook);
    return wake;
}

void Line::answer(unsigned char keyCode) {
    constexpr unsigned char firstByte = 0xFD;
    const std::array<unsigned char, 2> bytes{firstByte, keyCode};
    const TimePoint now = Clock::now();
    const ssize_t written = write(master_.get(), bytes.data(), bytes.size());
    if (written != static_cast<ssize_t>(bytes.size()))
        return;
    trace('>', now, bytes.data(), bytes.size());
    answersWritten_++;
    lookedAt_ = now;
}

void Line::trace(char direction, TimePoint time, const unsigned char *bytes, std::size_t count) {
    if (!trace_.is_open())
        return;
    constexpr std::array<const char *, 16> digits{"0", "1", "2", "3", "4", "5", "6", "7",
                                                  "8", "9", "a", "b", "c", "d", "e", "f"};
    const std::chrono::nanoseconds sinceStart = time.time_since_epoch();
    trace_ << sinceStart.count() << ' ' << direction;
    for (std::size_t i = 0; i < count; i++)
        trace_ << ' ' << digits.at(bytes[i] >> 4U) << digits.at(bytes[i] & 0xFU);
    trace_ << '\n' << std::flush;
}

} // namespace emulator
