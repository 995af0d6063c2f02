#include "editors/IfaceStaticEditNMMenu.h"

IfaceStaticEditNMMenu::IfaceStaticEditNMMenu() : editor(this, portNetmask) {}
