#pragma once

class Menu;
class MenuContext;

/// Changes from `screen` to `next`. Clears the screen's `drawn` flag first, so that it draws itself
/// whole when it becomes current again.
void leaveScreen(Menu *screen, bool &drawn, MenuContext *context, Menu *next);
