#pragma once

#include <chrono>
#include <unistd.h>

/// Does nothing for this time, not even for the keys and the display. A signal cuts it short.
inline void pauseFor(std::chrono::microseconds time) {
    usleep(static_cast<useconds_t>(time.count()));
}
