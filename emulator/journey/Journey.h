#pragma once

#include "emulator/journey/StepTable.h"

#include <istream>
#include <string>
#include <vector>

namespace emulator {

/// An operator's journey, read from a text with one step a line (see StepTable).
class Journey {
  public:
    /// Reads a whole journey that is to be played on `stage`. Throws std::invalid_argument with
    /// "NAME:LINE: what is wrong".
    Journey(std::istream &input, std::string name, Stage stage = Stage::panel);

    [[nodiscard]] const std::vector<Step> &steps() const { return allSteps; }
    /// "NAME:LINE: ", to open a message about the step.
    [[nodiscard]] std::string place(const Step &step) const { return place(step.line); }

  private:
    [[nodiscard]] std::string place(int line) const;
    void add(Step step);

    std::string name;
    std::vector<Step> allSteps;
    bool isKeyDown = false; // at the end of the steps so far
};

} // namespace emulator
