#pragma once

#include <chrono>
#include <string>

class LcdPanel;

/// Shows a text for as long as the operator needs to read it. No key is read in the meantime.
void showFor(LcdPanel *panel, std::chrono::seconds time, const std::string &text);
