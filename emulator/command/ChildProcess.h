#pragma once

#include "emulator/base/FileDescriptor.h"
#include "emulator/base/Loop.h"

#include <sys/types.h>

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace emulator {

/// A command that runs beside the emulator, in a session and process group of its own, and ends
/// with it at the latest: when this object is destroyed, and also when the emulator is killed. It
/// has no controlling terminal, so that a program that asks for a password fails instead of waiting
/// unseen.
///
/// A guard process stands between the two. It outlives a killed emulator for as long as it takes
/// to end the command and whatever the command has started: SIGTERM, SIGKILL 2 s later, and another
/// second later it gives up on what cannot be killed.
class ChildProcess {
  public:
    /// Starts the command, found along PATH, with standard input empty. Its standard output and
    /// error go to `output`, or where the emulator's own go when that is -1. Throws if no process
    /// can be started; a command that cannot be run ends with status 127. The loop takes a turn
    /// when the command has ended.
    ChildProcess(Loop &loop, std::vector<std::string> words, int output = -1);
    ChildProcess(const ChildProcess &) = delete;
    ChildProcess &operator=(const ChildProcess &) = delete;
    /// Has the command and everything that it started ended, without waiting for that.
    ~ChildProcess();

    /// The command's own process.
    [[nodiscard]] pid_t pid() const { return command; }
    /// Asks the guard to end the command, without waiting for it.
    void end();
    /// The command's exit status, 128 + signal if it was killed, nothing while it or what it has
    /// started is running.
    std::optional<int> status();
    /// True when there is a status only because the guard has gone: the command is still running.
    [[nodiscard]] bool isLeftRunning() const { return isCommandLeft; }

  private:
    void endWithoutGuard();

    pid_t guard = -1;
    pid_t command = -1;
    FileDescriptor commandEnd, guardEnd; // readable when that process has ended
    std::unique_ptr<Readable> guardEndWait;
    std::optional<int> result;
    bool isCommandLeft = false;
};

} // namespace emulator
