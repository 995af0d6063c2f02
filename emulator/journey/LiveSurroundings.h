#pragma once

#include "emulator/command/ChildProcess.h"
#include "emulator/journey/Surroundings.h"

#include <memory>

namespace emulator {

/// A journey's surroundings in the real world: commands are run by the shell, and the appliance is
/// reached through the sandbox that the program runs in.
class LiveSurroundings : public Surroundings {
  public:
    explicit LiveSurroundings(Loop &itsLoop) : loop(itsLoop) {}

    /// Sets the program's command and its process. `COMMAND --enter PID -- appliance VERB...`
    /// enters the sandbox.
    void setCommand(const std::string &itsProgram, int itsPid) {
        program = itsProgram;
        pid = std::to_string(itsPid);
    }

    void start(const step::Run &run) override;
    void start(const step::Appliance &appliance) override;
    std::optional<int> status() override;
    std::string act(const TestAction &action) override;

  private:
    Loop &loop;
    std::string program;
    std::string pid;
    std::unique_ptr<ChildProcess> process;
};

} // namespace emulator
