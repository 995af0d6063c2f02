#include "runtime/showFor.h"

#include "runtime/LcdPanel.h"
#include "runtime/pauseFor.h"

void showFor(LcdPanel *panel, std::chrono::seconds time, const std::string &text) {
    panel->showText(text);
    pauseFor(time);
}
