#pragma once

#include <array>
#include <chrono>
#include <cstdint>
#include <sys/types.h>

/// The serial line to the panel, `/dev/ttyS1`: raw bytes at 2400 baud.
///
/// Writing never waits for the line: what cannot be written is silently lost.
class SerialLine {
  public:
    /// The bytes that one look at the line has brought, and 0 after the last of them.
    using Received = std::array<std::uint8_t, 256>;

    /// Opens and configures the line, and ends the process with status 150 if it cannot be
    /// configured. That it cannot be opened is not noticed: writing and reading then fail.
    SerialLine();
    ~SerialLine();
    SerialLine(const SerialLine &) = delete;
    SerialLine &operator=(const SerialLine &) = delete;

    /// What `write` returns: -1 when nothing could be written.
    ssize_t send(const void *bytes, std::size_t length);

    /// Waits until bytes come, at most `timeout` or until a signal, and takes those that are there.
    [[nodiscard]] Received receive(std::chrono::milliseconds timeout);

  private:
    int fd;
};
