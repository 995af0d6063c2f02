#pragma once

#include <ace/Time_Value.h>

#include <cstdint>

/// Decides when the status display shows its next page and when a long second row moves on.
///
/// It is asked once per turn of the main loop, and without a key a turn takes 600 ms. An interval
/// lasts until the first turn after it, so that the 0.9 s between two scroll steps become 1.2 s
/// unless keys make the turns shorter.
class RotationTimer {
  public:
    /// The next page is due at once.
    void startAgain();
    /// A page has been drawn because it was due; `excess` is by how many characters its second row
    /// is too long.
    void pageTurned(int excess, const ACE_Time_Value &now);
    /// The operator has paged by hand, and gets a minute to read before the rotation goes on.
    void pageChosen(int excess);
    /// The operator does not need the minute: the page's ordinary time counts, from the moment at
    /// which it was drawn.
    void resume();
    /// The second row has moved by one character.
    void scrolled(const ACE_Time_Value &now);

    [[nodiscard]] bool isPageDue(const ACE_Time_Value &now) const;
    [[nodiscard]] bool isScrollDue(const ACE_Time_Value &now) const;

  private:
    static const ACE_Time_Value autoPageInterval;
    static const ACE_Time_Value manualPageInterval;
    static const ACE_Time_Value firstScrollDelay;
    static const ACE_Time_Value scrollStepInterval;

    void restartScrolling(int excess, const ACE_Time_Value &lastMoved);

    ACE_Time_Value pageInterval = autoPageInterval;
    ACE_Time_Value lastPageChange; ///< zero makes the next page due
    ACE_Time_Value lastScroll;
    std::uint32_t scrollSteps = 0; ///< steps still to be made that keep the page on screen
    ACE_Time_Value scrollInterval = firstScrollDelay;
};
