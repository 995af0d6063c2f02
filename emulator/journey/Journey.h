#pragma once

#include "emulator/journey/StepTable.h"
#include "emulator/journey/expandTable.h"

#include <istream>
#include <optional>
#include <string>
#include <vector>

namespace emulator {

/// An operator's journey, read from a text with one step a line (see StepTable). The steps that
/// follow from a walk, from a choice or from the table of a scene, are among its steps like any
/// others.
class Journey {
  public:
    /// Reads a whole journey that is to be played on `stage`. Throws std::invalid_argument with
    /// "NAME:LINE: what is wrong".
    Journey(std::istream &input, std::string name, Stage stage = Stage::panel);

    [[nodiscard]] const std::vector<Step> &steps() const { return allSteps; }
    /// "NAME:LINE: " and the title of the step's scene, to open a message about the step.
    [[nodiscard]] std::string place(const Step &step) const;

  private:
    /// A walk or a hold, behind which its sights stand.
    struct Listing {
        int line;
        Action beforeEach;
        bool isEmpty;
    };

    [[nodiscard]] std::string place(int line) const;
    bool takeLine(std::istream &input, TextLine &line);
    void readScene(const std::vector<TextLine> &scene);
    void readLine(const TextLine &line);
    void readSight(const TextLine &line);
    void readStep(const TextLine &line);
    void addStep(const TextLine &line, const Action &action);
    void addStep(const TextLine &line, const step::Walk &walk);
    void addStep(const TextLine &line, const step::Choose &choice);
    void endListing();

    std::string name;
    Stage stage;
    std::vector<Step> allSteps;
    std::string sceneTitle; // of the steps that are being read
    bool isKeyDown = false; // at the end of the steps so far
    std::optional<Listing> listing;
};

} // namespace emulator
