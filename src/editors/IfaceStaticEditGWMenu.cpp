#include "editors/IfaceStaticEditGWMenu.h"

IfaceStaticEditGWMenu::IfaceStaticEditGWMenu() : editor(this, portGateway) {}
