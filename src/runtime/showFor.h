#pragma once

#include <chrono>
#include <string>

class LcdPanel;

/// Shows a text that the operator has to have time to read: no key is read meanwhile.
void showFor(LcdPanel *panel, std::chrono::seconds time, const std::string &text);
