#pragma once

#include "emulator/base/Clock.h"
#include "emulator/base/FileDescriptor.h"
#include "emulator/base/LateFile.h"

#include <cstdint>
#include <deque>
#include <optional>
#include <string>
#include <vector>

namespace emulator {

/// The serial line between the program and the panel: a pseudo-terminal of which the program
/// opens the slave.
///
/// A pseudo-terminal delivers bytes at once, while a UART takes 4.58 ms for each. Bytes are
/// therefore collected when they arrive, and given to the panel when the real line would have
/// carried them. As in a UART's buffer, only so many can wait; beyond that the line is not read,
/// and the program's writes fail in the end (the pseudo-terminal itself takes some 20,000 bytes
/// more).
class Line {
  public:
    struct Byte {
        unsigned char value;
        bool sinceAnswerRead; ///< sent after the program had read the last answer
    };

    /// Opens the pseudo-terminal, raw and at 2400 baud in both directions. With `fast`, bytes are
    /// not delayed. With `tracePath` every arrival and answer is written to that file. Throws on
    /// failure.
    explicit Line(bool fast, const std::optional<std::string> &tracePath = std::nullopt);

    /// The slave's path, for the program to open.
    [[nodiscard]] const std::string &path() const { return slavePath; }
    /// Readable when bytes have arrived; -1 while the backlog is full.
    [[nodiscard]] int descriptor() const;

    /// Takes in what has arrived.
    void collect();
    /// The next byte that the line has carried by `now`, if any.
    std::optional<Byte> next(TimePoint now);
    /// When `next` or `collect` should be called again even if nothing arrives, if ever.
    [[nodiscard]] std::optional<TimePoint> wakeAt() const;

    /// Answers a key request; both bytes in one write, as a UART's FIFO delivers them. An answer
    /// that does not fit into what the program left unread is lost, as in an overrun.
    void answer(unsigned char keyCode);

    /// Forgets what is on its way in either direction, as when another program takes over.
    void clear();

    /// To be called at the end. Throws std::runtime_error when not all could be written to the
    /// trace.
    void finishTrace();

  private:
    struct Arrival {
        unsigned char value;
        TimePoint time;
        std::uint64_t answersRead;
    };

    void trace(char direction, TimePoint time, const unsigned char *bytes, std::size_t count);

    FileDescriptor master;
    FileDescriptor slave; // held open so that settings outlive the program's own descriptors
    std::string slavePath;
    Clock::duration byteTime;
    std::optional<LateFile> traceFile;
    std::deque<Arrival> backlog;
    TimePoint carriedUntil; // when the line became free after the last byte given out
    std::uint64_t answersWritten = 0;
    std::uint64_t answersRead = 0;
    TimePoint lookedAt;
};

} // namespace emulator
