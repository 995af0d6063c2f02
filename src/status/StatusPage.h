// The table of the status pages: one row for each kind of page.
#pragma once

#include "status/PlatformCode.h"

#include <list>
#include <string>
#include <string_view>

class Menu;

struct StatusPage {
    enum class Names {
        exactly,           ///< the page of this name; every appliance has it
        exactlyOnHardware, ///< the page of this name; only the hardware models have it
        startingWith,      ///< the pages of the network ports whose names start so
    };
    using Text = std::string (*)(const std::string &name, PlatformCode platform);
    using Settings = Menu *(*)(const std::string &name);

    Names names;
    std::string_view name;
    Text text;         ///< two lines, computed afresh at each call
    Settings settings; ///< gives the screen that Enter opens, ready to be shown; may be null
};

/// The names of the pages that are there whatever ports the appliance has, in their order.
[[nodiscard]] std::list<std::string> fixedPages(PlatformCode platform);

/// The row that a page's name belongs to: the first that fits, and one fits every name.
[[nodiscard]] const StatusPage &statusPageOf(const std::string &name);
