#pragma once

#include "FileDescriptor.h"

#include <sys/types.h>

#include <optional>
#include <string>
#include <vector>

namespace emulator {

/// A command that runs beside the emulator, in its own process group, and ends with it at the
/// latest: when this object is destroyed, and also when the emulator is killed.
///
/// A guard process stands between the two. It outlives a killed emulator for as long as it takes
/// to end the command and what the command left in its group: SIGTERM, and SIGKILL 2 s later.
class ChildProcess {
  public:
    /// Starts the command, found along PATH, with standard input empty. Its standard output and
    /// error go to `output`, or where the emulator's own go when that is -1. Throws if no process
    /// can be started; a command that cannot be run ends with status 127.
    explicit ChildProcess(std::vector<std::string> command, int output = -1);
    ChildProcess(const ChildProcess &) = delete;
    ChildProcess &operator=(const ChildProcess &) = delete;
    /// Ends the command and what it started, if it has not ended.
    ~ChildProcess();

    /// The command's process.
    [[nodiscard]] pid_t pid() const { return command_; }
    /// Readable when the command has ended.
    [[nodiscard]] int descriptor() const { return end_.get(); }
    /// The command's exit status, 128 + signal if it was killed, nothing while it runs.
    std::optional<int> status();

  private:
    pid_t guard_ = -1;
    pid_t command_ = -1;
    FileDescriptor end_;
    std::optional<int> status_;
};

} // namespace emulator
