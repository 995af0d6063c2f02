#include "status/StatusPage.h"

#include "hostname/HostnameEditMenu.h"
#include "netconfig/IfaceTypeMenu.h"
#include "status/PageTexts.h"

#include <iterator>

namespace {

// Enter opens nothing. Bridges, too, cannot be configured from the panel.
constexpr StatusPage::Settings nothing = nullptr;

Menu *hostnameEditor(const std::string &) {
    return HostnameEditMenu::instance();
}
Menu *portSettings(const std::string &name) {
    IfaceTypeMenu::instance()->selectInterface(name);
    return IfaceTypeMenu::instance();
}

using Names = StatusPage::Names;
constexpr StatusPage table[] = {
    {Names::exactly, "product",
     [](const std::string &, PlatformCode model) { return productText(model); }, nothing},
    {Names::exactly, "hostname", [](const std::string &, PlatformCode) { return hostnameText(); },
     hostnameEditor},
    {Names::exactlyOnHardware, "connection",
     [](const std::string &, PlatformCode) { return connectionText(); }, nothing},
    {Names::startingWith, "bridge",
     [](const std::string &port, PlatformCode) { return interfaceText(port); }, nothing},
    {Names::startingWith, "eth",
     [](const std::string &port, PlatformCode) { return interfaceText(port); }, portSettings},
    {Names::startingWith, "",
     [](const std::string &, PlatformCode) { return std::string("undefined"); }, nothing},
};

constexpr const StatusPage &fallback = table[std::size(table) - 1];
static_assert(fallback.names == Names::startingWith && fallback.name.empty(),
              "the last row fits every name");

constexpr bool fits(const StatusPage &page, std::string_view name) {
    return page.names == Names::startingWith ? name.substr(0, page.name.length()) == page.name
                                             : name == page.name;
}

constexpr const StatusPage *firstThatFits(std::string_view name) {
    const StatusPage *page = table;
    while (!fits(*page, name))
        ++page;
    return page;
}

constexpr bool everyRowCanBeReached() {
    for (const auto &page : table) {
        if (firstThatFits(page.name) != &page)
            return false;
    }
    return true;
}
static_assert(everyRowCanBeReached(), "no row stands behind one that takes all its names");

bool isFixed(const StatusPage &page, PlatformCode platform) {
    return page.names == Names::exactly ||
           (page.names == Names::exactlyOnHardware && isHardware(platform));
}

} // namespace

std::list<std::string> fixedPages(PlatformCode platform) {
    std::list<std::string> names;
    for (const auto &page : table) {
        if (isFixed(page, platform))
            names.emplace_back(page.name);
    }
    return names;
}

const StatusPage &statusPageOf(const std::string &name) {
    return *firstThatFits(name);
}
