#include "status/RotationTimer.h"

#include <ace/OS_NS_sys_time.h>

const ACE_Time_Value RotationTimer::autoPageInterval(5);
const ACE_Time_Value RotationTimer::manualPageInterval(60);
const ACE_Time_Value RotationTimer::firstScrollDelay(2);
const ACE_Time_Value RotationTimer::scrollStepInterval(0, 900000);

void RotationTimer::startAgain() {
    lastPageChange = ACE_Time_Value();
    restartScrolling(0, ACE_Time_Value());
}

void RotationTimer::pageTurned(int excess, const ACE_Time_Value &now) {
    pageInterval = autoPageInterval;
    lastPageChange = now;
    restartScrolling(excess, now);
}

// The clock is read separately for the page and for the row, so that a reading that fails spoils
// only one of the two times.
void RotationTimer::pageChosen(int excess) {
    pageInterval = manualPageInterval;
    lastPageChange = ACE_OS::gettimeofday();
    restartScrolling(excess, ACE_OS::gettimeofday());
}

void RotationTimer::resume() {
    pageInterval = autoPageInterval;
}

// Each step restarts the page's time as long as a part of the row has not been shown yet. The last
// step does not: the row scrolls on until the page's time is over, and a row that is too long by
// one character never delays the rotation.
void RotationTimer::scrolled(const ACE_Time_Value &now) {
    if (scrollSteps >= 2) {
        --scrollSteps;
        lastPageChange = now;
    }
    lastScroll = now;
    scrollInterval = scrollStepInterval;
}

bool RotationTimer::isPageDue(const ACE_Time_Value &now) const {
    return now - lastPageChange > pageInterval;
}

bool RotationTimer::isScrollDue(const ACE_Time_Value &now) const {
    return scrollSteps != 0 && now - lastScroll > scrollInterval;
}

void RotationTimer::restartScrolling(int excess, const ACE_Time_Value &lastMoved) {
    scrollSteps = static_cast<std::uint32_t>(excess);
    lastScroll = lastMoved;
    scrollInterval = firstScrollDelay;
}
