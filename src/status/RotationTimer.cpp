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

// The page's time and the row's are two readings of the clock: one that fails spoils only its own.
void RotationTimer::pageChosen(int excess) {
    pageInterval = manualPageInterval;
    lastPageChange = ACE_OS::gettimeofday();
    restartScrolling(excess, ACE_OS::gettimeofday());
}

void RotationTimer::resume() {
    pageInterval = autoPageInterval;
}

// Each step of a row that has still to be read restarts the page's time. The last one does not: the
// row goes round until the page's time is over, and a row that is too long by one never holds up
// the rotation.
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
