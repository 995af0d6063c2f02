#pragma once

#include <chrono>
#include <unistd.h>

/// Stands still, keys and display included. A signal cuts the pause short.
inline void pauseFor(std::chrono::microseconds time) {
    usleep(static_cast<useconds_t>(time.count()));
}
