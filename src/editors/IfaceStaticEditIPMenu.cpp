#include "editors/IfaceStaticEditIPMenu.h"

IfaceStaticEditIPMenu::IfaceStaticEditIPMenu() : editor(this, portAddress) {}
